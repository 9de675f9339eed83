// The pieces of the axis tick search: nice-number tables, the small numeric
// helpers, candidate lists and the penalties of the niceness score.
#ifndef QEL_SRC_NMS_BINNING_GSCALE_H
#define QEL_SRC_NMS_BINNING_GSCALE_H

#include <qel/axis_ticks.h>

#include <vector>

namespace qel {
namespace deprecated {

// Nice increments of one decade (mantissas in [10, 100)) and their ugliness.
extern const double adNiceIncValsArray[10];
extern const int aiNiceIncGrpsArray[10];
// Ugliness of a first tick by its last significant digit.
extern const int aiNiceTickMinGrpsArray[10];
// Undesirability of a tick count, indexed by count - 1.
extern const int aiNiceTickCountsArray[11];
extern const double LynScaleMaxNumberOfTicks;

// Decimal truncation: x*10^digits cut towards zero, divided back; 0 stays 0.
double round(double x, int digits);
// |a - b| <= fuzz, or |a - b| <= fuzz*(|a| + |b|)/2.
bool EqualWithFuzz(double a, double b, double fuzz);
// Halves away from zero.
double ComputeNearestInteger(double x);
// The p with 10^p <= |x| < 10^(p + 1); 0 for |x| below 1e-30.
int ComputePower(double x);

// The nice number at or above x (roundUp) or at or below it: nice =
// table[index]*10^exponent with the sign of x; 0, 0, 0 for |x| < 1e-12.
void GetClosestNiceNumber(double x, const double* table, int size, bool roundUp, double& nice,
                          int& exponent, int& index);

// The nice numbers from the one at or above smallest to the one at or below
// largest, ascending, with their groups; false when none was produced.
bool FindSetOfNiceNumbers(double smallest, double largest, const double* table, const int* groups,
                          int size, std::vector<double>& increments, std::vector<int>& incGroups);

// The multiples of 10^power from low to high with the ugliness of their last
// digit; two candidates gain their midpoint (group 5). False when none.
bool FindNiceFirstTicks(double low, double high, const int* minGroups, int power,
                        std::vector<double>& ticks, std::vector<int>& tickGroups);

// Data, range margins, limits and tick margins of one search, in the
// normalised, mirrored frame.
struct TickSearch {
  double m, M;  // data
  double belowMin, belowMax, aboveMin, aboveMax;
  double lowerLimit, upperLimit;  // +-infinity for no limit
  double lowTickMargin, highTickMargin;
  int minTicks, maxTicks;
};

struct TickChoice {
  double scaleMinimum, scaleMaximum, firstTick, lastTick, increment;
};

// The best-scoring (increment, first tick, count); false when none passed.
bool FindHighestNicenessScore(const std::vector<double>& increments,
                              const std::vector<int>& incGroups,
                              const std::vector<double>& firstTicks,
                              const std::vector<int>& tickGroups, const TickSearch& search,
                              double lowestFirst, double highestFirst, TickChoice& choice);

// The ten penalties of the niceness score.
double ComputeBelowDataMinPenalty(double b, double s, double range, double belowMaxMargin);
double ComputeAboveDataMaxPenalty(double S, double c, double range, double aboveMaxMargin);
double ComputeBelowFirstTickPenalty(double f, double s, double increment, double lowTickMargin);
double ComputeAboveLastTickPenalty(double S, double t, double increment, double highTickMargin);
double ComputeUglyTickPenalty(double f, int group);
double ComputeUglyTickIncrementPenalty(int group);
double ComputeNoZeroTickPenalty(double m, double M, double f, double increment, int n);
double ComputeTickCountPenalty(int n);
double ComputeMultiplesPenalty(double f, double increment);
double ComputeScaleMaxPenalty(double S, double d);

}  // namespace deprecated
}  // namespace qel

#endif
