// Two-stage Poisson-mixture sums: the machinery behind every noncentral ELV
// routine. A noncentral tail is a sum over j of w(j) F(j), where
//   w(j) = L^(j+h) e^(-L) / Gamma(j+h+1)
// (h = 0 gives Poisson weights, h = 1/2 the weights of the noncentral t) and
// F(j) is a central tail whose shape moves with j. F(j) is the product of a
// closed-form factor and a scaled series S(j); the series is evaluated once,
// at the start index, and moved from index to index by its recurrence.
//
// Stage one walks from the start index towards the largest term, keeping the
// terms passed in units of the current term, so that nothing underflows
// before the peak is known. Stage two takes the logarithm of the peak term
// (an underflowing peak ends the sum with 0) and sums away from the peak until
// the rest is below the mixture stop of the sum (precision.h). A sum that passes a given limit ends at
// once, so that the caller can compute the smaller, complementary tail.
#ifndef QEL_SRC_UTILITIES_ELVMIXTURE_H
#define QEL_SRC_UTILITIES_ELVMIXTURE_H

namespace qel {
namespace elv {

// The central tails F(j) of one mixture, described by their scaled series.
class MixtureComponents {
 public:
  virtual ~MixtureComponents() = default;
  // S(j) by its series; 0, or 4 when the series failed.
  virtual int series(long j, double* factor) const = 0;
  // Moves S(j) one index in the direction of the sum that uses these
  // components (to j-1 in a descending sum, to j+1 in an ascending one) and
  // returns F(next)/F(j).
  virtual double step(long j, double* factor) const = 0;
  // ln F(j) from S(j).
  virtual double logComponent(long j, double factor) const = 0;
};

enum class MixtureEnd {
  Normal,        // summed to the stop limit
  SeriesFailed,  // the start series failed: sum -1
  CapReached,    // the ascending index reached its cap: sum -2
  Underflow,     // the peak term is below the underflow limit: sum 0
  AboveLimit,    // the running sum passed the switch limit
  StartFailed,   // the Poisson quantile for the start index failed: sum -1
};

struct MixtureSettings {
  double L = 0.0;            // Poisson mean of the weights
  double weightShift = 0.0;  // h in w(j)
  double switchAbove = 0.9;  // a running sum above this ends the sum
  long cap = 100000000;      // largest index of the ascending sums
};

struct MixtureResult {
  double sum = 0.0;
  MixtureEnd end = MixtureEnd::Normal;
  bool inSecondStage = false;  // where a cap was reached
  long start = 0, peak = 0, last = 0;
};

// Start indices: the descending sum starts at the largest k with
// P(K > k) <= the mixture stop, the ascending one at the smallest k with
// P(K <= k) > the mixture stop, K Poisson with mean L. -1 when the quantile
// failed.
long descendingMixtureStart(double L);
long ascendingMixtureStart(double L);

// The Poisson quantile searches behind poisson_upper_quant and
// poisson_lower_quant, for any p in (0, 0.5] (no range code).
void poissonUpperQuantile(long* k, double* f, double p, double m);
void poissonLowerQuantile(long* k, double* f, double p, double m);

// Sum over j from k down to 0; the series is taken at index k+1.
MixtureResult descendingMixtureSum(const MixtureComponents& components, long k,
                                   const MixtureSettings& settings);
// Sum over j from k upwards; the series is taken at index k.
MixtureResult ascendingMixtureSum(const MixtureComponents& components, long k,
                                  const MixtureSettings& settings);

// The method number a sum reports: 11 to 13 for a descending sum (series
// failed, underflow, normal end), 21 to 24 for an ascending one (series
// failed, cap reached, underflow, normal end), 100 above the switch limit.
long long mixtureMethod(const MixtureResult& r, bool descending);
// The ELV code of a sum's end: 4 for a failure, 1 for an underflow, else 0.
int mixtureCode(const MixtureResult& r);

}  // namespace elv
}  // namespace qel

#endif
