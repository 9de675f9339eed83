/// \file
/// Rank tests: Mann-Whitney with the Hodges-Lehmann estimate of the shift and
/// its interval, Kruskal-Wallis, Mood's median test and Friedman's test with
/// treatment effects.
///
/// Every test has a caller-owned record. The Run function resets the outputs
/// of the record to NaN (a P-value adjusted for ties to -1 when there are no
/// ties) and then fills them from the inputs, so the caller sets only the
/// sample sizes and data.
///
/// Values are tied when the larger exceeds the smaller by no more than a small
/// tolerance relative to the size of the data, not only when they are equal.
///
/// Return codes: 0; 30002 for an IntervalType or alternative outside -1, 0, 1
/// (outputs NaN); 30023 for a Mann-Whitney sample of identical values
/// (outputs NaN); 30001 when memory runs out.
#ifndef QEL_RANK_TESTS_H
#define QEL_RANK_TESTS_H

#include <qel/basic_types.h>
#include <qel/export.h>

namespace qel {
namespace v0 {

/// Mann-Whitney rank-sum test of two independent samples, with the
/// Hodges-Lehmann estimate of the shift first - second (the median of the
/// n1 * n2 pairwise differences) and its distribution-free interval from
/// order statistics of those differences (normal approximation of the rank).
struct MannWhitney {
  /// Outputs reset as a run resets them, sample sizes 0.
  QEL_API MannWhitney();
  double firstMedian;         ///< median of the first sample
  double secondMedian;        ///< median of the second sample
  double estimate;            ///< Hodges-Lehmann shift, first minus second
  double lowerLimit;          ///< lower limit of the interval of the shift
  double upperLimit;          ///< upper limit of the interval of the shift
  double achievedConfidence;  ///< confidence the order-statistic interval reaches
  double statistic;           ///< W: the rank sum of the first sample
  double pValue;              ///< normal approximation with continuity correction
  double adjustedPValue;      ///< variance adjusted for ties; -1 without ties
  int firstN;                 ///< size of the first sample; set by the caller
  int secondN;                ///< size of the second sample; set by the caller
};

/// x holds firstN values, y secondN. confidence is a fraction in (0, 1); type
/// -1 gives (-inf, upper], 0 a two-sided interval, 1 [lower, +inf). The
/// alternative -1 tests "first below second", 1 "first above second".
QEL_API int RunLynMannWhitney(MannWhitney* record, double const* x, double const* y,
                              double confidence, IntervalType type,
                              AlternativeHypothesis alternative);

/// One group of a Kruskal-Wallis test: data and n are inputs, the rest
/// outputs. meanRank is the group's average rank among all observations and z
/// its standardised distance from the overall average (N + 1) / 2.
struct KruskalWallisGroup {
  double median;       ///< median of the group
  double meanRank;     ///< average rank of the group among all observations
  double z;            ///< standardised distance of meanRank from (N + 1) / 2
  double const* data;  ///< the group's values (input)
  unsigned int n;      ///< number of values (input)
};

/// Kruskal-Wallis test of k independent groups: H on k - 1 degrees of freedom
/// (chi-square approximation), and H divided by the tie correction
/// 1 - sum(m^3 - m) / (N^3 - N) when there are ties.
struct KruskalWallis {
  /// Outputs NaN, counts 0, group pointer null.
  QEL_API KruskalWallis();
  double statistic;            ///< H
  double degreesOfFreedom;     ///< k - 1
  double pValue;               ///< chi-square P-value of H
  double adjustedStatistic;    ///< NaN without ties
  double adjustedPValue;       ///< -1 without ties
  KruskalWallisGroup* groups;  ///< caller-owned, groupCount entries
  unsigned int groupCount;     ///< number of groups; set by the caller
};

/// Runs the Kruskal-Wallis test on the record's groups. Returns 0 or 30001.
QEL_API int RunLynKruskalWallis(KruskalWallis* record);

/// One group of Mood's median test: data and n are inputs, the rest outputs
/// (NaN until computed). The limits are the group median's sign interval at
/// 95% with the nonlinear interpolation of Hettmansperger and Sheather.
struct MoodGroup {
  double countAtOrBelow;      ///< of the overall median (class of the ties)
  double countAbove;          ///< values above the overall median
  double median;              ///< median of the group
  double interquartileRange;  ///< Q3 - Q1 at positions (n + 1) / 4, 3 (n + 1) / 4
  double lowerLimit;          ///< lower limit of the median's 95% sign interval
  double upperLimit;          ///< upper limit of the median's 95% sign interval
  double const* data;         ///< the group's values (input)
  unsigned int n;             ///< number of values (input)
};

/// Flags of Mood's median test; any of them makes the run return 10000
/// (results still valid).
/// \name Mood flags
/// @{
constexpr unsigned int kMoodFewAbove = 2;      ///< fewer values above than groups
constexpr unsigned int kMoodFewBelow = 4;      ///< ties went up, fewer below than groups
constexpr unsigned int kMoodNoDegrees = 8;     ///< fewer than two groups of n > 1
constexpr unsigned int kMoodTiesMovedUp = 16;  ///< values at the median counted above
//@}

/// Mood's median test of k groups: the 2 x k table of counts at or below and
/// above the overall median, chi-square on (groups of n > 1) - 1 degrees of
/// freedom. With two groups, an interval for the difference of the medians
/// from one-sample sign intervals whose confidences combine to 95%.
struct Mood {
  /// Outputs NaN, counts 0, group pointer null.
  QEL_API Mood();
  double overallMedian;       ///< median of all observations
  double statistic;           ///< chi-square
  double degreesOfFreedom;    ///< (groups of n > 1) - 1
  double pValue;              ///< chi-square P-value
  double lowerLimit;          ///< median difference first - second, two groups only
  double upperLimit;          ///< upper limit of the median difference, two groups only
  double achievedConfidence;  ///< confidence of the interval of the median difference
  MoodGroup* groups;          ///< caller-owned, groupCount entries
  unsigned int groupCount;    ///< number of groups; set by the caller
  unsigned int flags;         ///< kMood... bits raised by the run
};

/// Runs Mood's median test on the record's groups. Returns 0, 10000 when a
/// flag is set (results valid), or 30001.
QEL_API int RunLynMood(Mood* record);

/// One treatment of a Friedman test. column holds the treatment's value in
/// each block (input) and is overwritten with the fitted values B[t] + e,
/// block effect plus treatment effect.
struct FriedmanTreatment {
  double estimatedMedian;  ///< grand median plus the treatment effect
  double rankSum;          ///< sum of the treatment's ranks within blocks
  double* column;  ///< the treatment's value in each block; overwritten with the fitted values
};

/// Friedman's test of k treatments in b blocks: ranks within each block, S on
/// k - 1 degrees of freedom, S corrected for ties within blocks. The
/// treatment effects are Doksum's: e_i is the mean over j of the median
/// difference of treatments i and j across blocks.
struct Friedman {
  /// Outputs NaN, counts 0, group pointer null.
  QEL_API Friedman();
  double grandMedian;             ///< median of the block medians of the residuals
  double statistic;               ///< S
  double degreesOfFreedom;        ///< k - 1
  double pValue;                  ///< chi-square P-value of S
  double adjustedStatistic;       ///< NaN without ties
  double adjustedPValue;          ///< -1 without ties
  FriedmanTreatment* treatments;  ///< caller-owned, treatmentCount entries
  unsigned int blocks;            ///< number of blocks; set by the caller
  unsigned int treatmentCount;    ///< number of treatments; set by the caller
};

/// Runs Friedman's test on the record's treatments. Returns 0 or 30001.
QEL_API int RunLynFriedman(Friedman* record);

}  // namespace v0
}  // namespace qel

#endif
