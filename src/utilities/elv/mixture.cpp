// Two-stage Poisson-mixture sums (see mixture.h).
#include "utilities/elv/mixture.h"

#include <qel/elv.h>

#include <cmath>

#include "utilities/elv/limits.h"
#include "utilities/elv/precision.h"
#include "utilities/elv/thread_status.h"

namespace qel {
namespace elv {

namespace {

// a b for positive factors, held at the largest double instead of
// overflowing (a ratio of huge terms only decides the direction of a walk).
double boundedProduct(double a, double b) {
  if (b > 1.0 && a > kHuge / b) return kHuge;
  return a * b;
}

// w(j-1)/w(j) times F(j-1)/F(j).
double downRatio(const MixtureComponents& components, long j, double* factor,
                 const MixtureSettings& settings) {
  const double weightRatio = (j + settings.weightShift) / settings.L;
  return boundedProduct(weightRatio, components.step(j, factor));
}

// w(j+1)/w(j) times F(j+1)/F(j).
double upRatio(const MixtureComponents& components, long j, double* factor,
               const MixtureSettings& settings) {
  const double weightRatio = settings.L / (j + 1.0 + settings.weightShift);
  return boundedProduct(weightRatio, components.step(j, factor));
}

double logPeakTerm(const MixtureComponents& components, long j, double factor,
                   const MixtureSettings& settings) {
  double logWeight;
  lnpgamma(&logWeight, j + 1.0 + settings.weightShift, settings.L);
  return logWeight + components.logComponent(j, factor);
}

MixtureResult ended(MixtureResult result, MixtureEnd end, double sum) {
  result.end = end;
  result.sum = sum;
  return result;
}

// Scaled sums: the armed floating-point state treats subnormal operands as 0
// (DAZ), so a tail near the smallest normal double would lose every term
// below 2.2e-308, a relative 1e-8 of a sum of 1e-300. Terms and sum are
// therefore carried in units of the peak term and multiplied by it once.
bool restNegligible(double ratio, double term, double sum) {
  return ratio < 1.0 && term / (1.0 - ratio) / sum < mixtureStop();
}

}  // namespace

long descendingMixtureStart(double L) {
  long k = 0;
  double f = 0.0;
  ELVstartup("poisson_upper_quant");
  poissonUpperQuantile(&k, &f, mixtureStop(), L);
  return qel::elv::threadStatus() >= 2 ? -1 : k;
}

long ascendingMixtureStart(double L) {
  long k = 0;
  double f = 0.0;
  ELVstartup("poisson_lower_quant");
  poissonLowerQuantile(&k, &f, mixtureStop(), L);
  return qel::elv::threadStatus() >= 2 ? -1 : k;
}

MixtureResult descendingMixtureSum(const MixtureComponents& components, long k,
                                   const MixtureSettings& settings) {
  MixtureResult result;
  result.start = result.peak = result.last = k;
  if (k < 0) return ended(result, MixtureEnd::StartFailed, -1.0);
  double factor;
  if (components.series(k + 1, &factor) != 0) return ended(result, MixtureEnd::SeriesFailed, -1.0);
  components.step(k + 1, &factor);

  // Stage one: climb down to the peak; above holds the terms passed, in
  // units of the current term.
  long j = k;
  double above = 0.0;
  while (j > 0) {
    double next = factor;
    const double ratio = downRatio(components, j, &next, settings);
    if (ratio <= 1.0) break;
    above = (above + 1.0) / ratio;
    factor = next;
    --j;
  }
  result.peak = result.last = j;
  const double logPeak = logPeakTerm(components, j, factor, settings);
  if (logPeak < underflowLog()) return ended(result, MixtureEnd::Underflow, 0.0);

  // Stage two: sum below the peak, in units of the peak term (see restNegligible).
  const double peak = std::exp(logPeak);
  double term = 1.0;
  double sum = 1.0 + above;
  if (peak * sum > settings.switchAbove) return ended(result, MixtureEnd::AboveLimit, peak * sum);
  while (j > 0) {
    const double ratio = downRatio(components, j, &factor, settings);
    --j;
    term *= ratio;
    sum += term;
    result.last = j;
    if (peak * sum > settings.switchAbove) {
      return ended(result, MixtureEnd::AboveLimit, peak * sum);
    }
    if (restNegligible(ratio, term, sum)) break;
  }
  return ended(result, MixtureEnd::Normal, peak * sum);
}

MixtureResult ascendingMixtureSum(const MixtureComponents& components, long k,
                                  const MixtureSettings& settings) {
  MixtureResult result;
  result.start = result.peak = result.last = k;
  if (k < 0) return ended(result, MixtureEnd::StartFailed, -1.0);
  double factor;
  if (components.series(k, &factor) != 0) return ended(result, MixtureEnd::SeriesFailed, -1.0);

  // Stage one: climb up to the peak; below holds the terms passed.
  long j = k;
  double below = 0.0;
  for (;;) {
    if (j >= settings.cap) {
      result.peak = result.last = j;
      return ended(result, MixtureEnd::CapReached, -2.0);
    }
    double next = factor;
    const double ratio = upRatio(components, j, &next, settings);
    if (ratio <= 1.0) break;
    below = (below + 1.0) / ratio;
    factor = next;
    ++j;
  }
  result.peak = result.last = j;
  const double logPeak = logPeakTerm(components, j, factor, settings);
  if (logPeak < underflowLog()) return ended(result, MixtureEnd::Underflow, 0.0);

  // Stage two: sum above the peak, in units of the peak term.
  const double peak = std::exp(logPeak);
  double term = 1.0;
  double sum = 1.0 + below;
  if (peak * sum > settings.switchAbove) return ended(result, MixtureEnd::AboveLimit, peak * sum);
  for (;;) {
    if (j >= settings.cap) {
      result.inSecondStage = true;
      return ended(result, MixtureEnd::CapReached, -2.0);
    }
    const double ratio = upRatio(components, j, &factor, settings);
    ++j;
    term *= ratio;
    sum += term;
    result.last = j;
    if (peak * sum > settings.switchAbove) {
      return ended(result, MixtureEnd::AboveLimit, peak * sum);
    }
    if (restNegligible(ratio, term, sum)) break;
  }
  return ended(result, MixtureEnd::Normal, peak * sum);
}

long long mixtureMethod(const MixtureResult& r, bool descending) {
  switch (r.end) {
    case MixtureEnd::SeriesFailed:
    case MixtureEnd::StartFailed:
      return descending ? 11 : 21;
    case MixtureEnd::CapReached:
      return 22;
    case MixtureEnd::Underflow:
      return descending ? 12 : 23;
    case MixtureEnd::AboveLimit:
      return 100;
    case MixtureEnd::Normal:
      break;
  }
  return descending ? 13 : 24;
}

int mixtureCode(const MixtureResult& r) {
  switch (r.end) {
    case MixtureEnd::SeriesFailed:
    case MixtureEnd::StartFailed:
    case MixtureEnd::CapReached:
      return 4;
    case MixtureEnd::Underflow:
      return 1;
    default:
      return 0;
  }
}

}  // namespace elv
}  // namespace qel
