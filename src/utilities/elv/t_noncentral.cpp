// Noncentral t distribution for the ELV routines: the Poisson mixture of
// incomplete beta ratios of AS 243 (Lenth, 1989), kept in two tails. With
// L = delta^2/2, x = t^2/(df + t^2) and b = df/2, for t >= 0
//   P(T <= t) = Phi(-delta) + A + (1/2) sum_j q(j) I_x(j + 1, b),
// where A is half the lower tail of the noncentral beta of shapes 1/2, b and
// q(j) = e^-L L^(j+1/2) / Gamma(j + 3/2) (sum: 2 (Phi(delta) - 1/2)). The
// sums over j run on the shared two-stage mixture machinery with weight
// shift 1/2, in the form (x or y = 1 - x) whose argument is the small one,
// and always for the smaller of the two complementary sums.
//
// When t and delta have opposite signs the lower tail is a difference of
// nearly equal terms; it is kept only while it stays well above the terms,
// otherwise it comes from the saddle-centred integral (its closed
// expansion from df = 1e5 on), from Owen's T and
// Owen's recursion for small integer degrees of freedom, flagged with
// status 1 where the result is a last resort.
#include <qel/elv.h>

#include <algorithm>
#include <cmath>
#include <utility>

#include "utilities/elv/limits.h"
#include "utilities/elv/mixture.h"
#include "utilities/elv/t_internal.h"
#include "utilities/elv/thread_status.h"

namespace {

using namespace qel::elv;

const char* const kName = "t_ncdf";
constexpr double kTinyReciprocal = 1.4916681462400413e-144;
constexpr long kAscendingCap = 94906263;
constexpr double kSqrt2Pi = 2.5066282746310007;

// F(j) = I_x(j+1, b) = p(j+1, b; x) S(j), p the beta density. The series
// comes from beta_Iabx at x or, in the y form, from beta_Jabx at y = 1 - x
// (I_x(a, b) = 1 - I_y(b, a) = p(a, b; x) (x/a) J). Downward,
//   S(a-1) = (x (a+b-1) S(a) + x y) / (a-1).
class LowerTails : public MixtureComponents {
 public:
  LowerTails(double x, double y, double b, bool yForm) : x_(x), y_(y), b_(b), yForm_(yForm) {}
  int series(long j, double* s) const override {
    const double a = j + 1.0;
    if (!yForm_) return beta_Iabx(s, a, b_, x_);
    double jf = 0.0;
    const int code = beta_Jabx(&jf, b_, a, y_);
    *s = x_ * jf / a;
    return code;
  }
  double step(long j, double* s) const override {
    const double a = j + 1.0;
    const double next = (x_ * (a + b_ - 1.0) * *s + x_ * y_) / (a - 1.0);
    const double ratio = (a - 1.0) / (x_ * (a + b_ - 1.0)) * (next / *s);
    *s = next;
    return ratio;
  }
  double logComponent(long j, double s) const override {
    double lp;
    if (yForm_)
      lnpbeta(&lp, b_, j + 1.0, y_);
    else
      lnpbeta(&lp, j + 1.0, b_, x_);
    return lp + std::log(s);
  }

 private:
  double x_, y_, b_;
  bool yForm_;
};

// F(j) = 1 - I_x(j+1, b) = p(j+1, b; x) T(j); T from beta_Jabx at x
// (T = y J / b) or, in the y form, from beta_Iabx at y (1 - I_x(a, b) =
// I_y(b, a)). Upward,
//   T(a+1) = (a T(a) + x y) / (x (a+b)).
class UpperTails : public MixtureComponents {
 public:
  UpperTails(double x, double y, double b, bool yForm) : x_(x), y_(y), b_(b), yForm_(yForm) {}
  int series(long j, double* s) const override {
    const double a = j + 1.0;
    if (yForm_) return beta_Iabx(s, b_, a, y_);
    double jf = 0.0;
    const int code = beta_Jabx(&jf, a, b_, x_);
    *s = y_ * jf / b_;
    return code;
  }
  double step(long j, double* s) const override {
    const double a = j + 1.0;
    const double next = (a * *s + x_ * y_) / (x_ * (a + b_));
    const double ratio = x_ * (a + b_) / a * (next / *s);
    *s = next;
    return ratio;
  }
  double logComponent(long j, double s) const override {
    double lp;
    if (yForm_)
      lnpbeta(&lp, b_, j + 1.0, y_);
    else
      lnpbeta(&lp, j + 1.0, b_, x_);
    return lp + std::log(s);
  }

 private:
  double x_, y_, b_;
  bool yForm_;
};

enum class SumKind { H, H2c, Hc, H2 };

struct SumValue {
  double value = 0.0;  // half the mixture sum
  int code = 0;
};

// One of the four sums, with its method number added to ELVmethod and its
// counters stored. half = Phi(delta) - 1/2 is half the total of the weights.
SumValue mixtureHalf(SumKind kind, double x, double y, double b, double L, double half) {
  const bool descending = kind == SumKind::H || kind == SumKind::H2c;
  const bool yForm = kind == SumKind::H2c || kind == SumKind::H2;
  // Method numbers: degenerate argument, failed, cap, underflow, normal.
  const int base = (kind == SumKind::H || kind == SumKind::H2) ? 10 : 20;
  const double argument = yForm ? y : x;
  if (argument == 0.0) {
    // x = 0 or y = 0: every I is 0 or 1.
    ELVmethod += base;
    const bool full = kind == SumKind::H2c || kind == SumKind::Hc;
    return SumValue{full ? half : 0.0, 0};
  }
  MixtureSettings settings;
  settings.L = L;
  settings.weightShift = 0.5;
  settings.switchAbove = 0.9 * 2.0 * half;
  settings.cap = kAscendingCap;
  MixtureResult r;
  if (descending) {
    r = descendingMixtureSum(LowerTails(x, y, b, yForm), descendingMixtureStart(L), settings);
  } else {
    r = ascendingMixtureSum(UpperTails(x, y, b, yForm), ascendingMixtureStart(L), settings);
  }
  ELVsteps1 = r.start;
  if (descending) {
    ELVsteps2 = r.last;
    ELVsteps3 = r.peak;
  } else {
    ELVsteps2 = r.peak;
    ELVsteps3 = r.last;
  }
  SumValue out{0.5 * r.sum, 0};
  switch (r.end) {
    case MixtureEnd::SeriesFailed:
    case MixtureEnd::StartFailed:
      ELVmethod += base + 1;
      out.code = 4;
      break;
    case MixtureEnd::CapReached:
      ELVmethod += base + (r.inSecondStage ? 4 : 2);
      out.code = 4;
      break;
    case MixtureEnd::Underflow:
      ELVmethod += base + (descending ? 2 : 3);
      out.code = 1;
      break;
    case MixtureEnd::AboveLimit:
      ELVmethod += 100;
      break;
    case MixtureEnd::Normal:
      ELVmethod += base + (descending ? 3 : 5);
      break;
  }
  return out;
}

struct Tails {
  double lower = 0.0, upper = 0.0;
  int code = 0;
  bool good = false;  // the lower tail at t < 0 stood the cancellation test
};

// The Poisson-mixture core for delta > 0.
Tails core(double t, double df, double delta, double saddle) {
  Tails out;
  double pl, pu;
  normal_df(-delta, &pl, &pu);
  const double half = pu - 0.5;
  if (t == 0.0) {
    out.lower = pl;
    out.upper = pu;
    ELVmethod = 3;
    return out;
  }
  const double L = 0.5 * delta * delta;
  const double u = t * t;
  const double x = u / (df + u), y = df / (df + u), b = 0.5 * df;
  double betaLower = 0.0, betaUpper = 0.0;
  int64_t base;
  if (df >= u) {
    beta_ncdf(x, 0.5, b, L, &betaLower, &betaUpper);
    base = 0;
  } else {
    beta_ncdf2(y, b, 0.5, L, &betaUpper, &betaLower);
    base = 1000;
  }
  out.code = std::max(out.code, qel::elv::threadStatus());
  if (qel::elv::threadStatus() >= 2) return out;
  const double A = 0.5 * betaLower, B = 0.5 * betaUpper;
  ELVmethod = base;
  const bool xForm = df >= u;
  const SumKind lowerKind = xForm ? SumKind::H : SumKind::H2c;
  const SumKind upperKind = xForm ? SumKind::Hc : SumKind::H2;
  double hl, hu;
  auto take = [&](SumKind kind) {
    const SumValue v = mixtureHalf(kind, x, y, b, L, half);
    out.code = std::max(out.code, v.code);
    return v.value;
  };
  if (delta >= std::fabs(t)) {
    hl = take(lowerKind);
    if (hl > 0.9 * half) {
      hu = take(upperKind);
      hl = half - hu;
    } else {
      hu = half - hl;
    }
  } else {
    hu = take(upperKind);
    if (hu > 0.9 * half) {
      hl = take(lowerKind);
      hu = half - hl;
    } else {
      hl = half - hu;
    }
  }
  if (out.code == 4) return out;
  if (t >= 0.0) {
    out.lower = hl + A + pl;
    out.upper = hu + B;
    return out;
  }
  out.lower = B - hu;
  out.upper = A - hl + pu;
  if (1000.0 * out.lower > B) {
    out.good = true;
  } else if (1e6 * out.lower > B) {
    out.code = std::max(out.code, 1);
    ELVmethod += 10000;
  } else {
    out.lower = saddle;
    out.upper = 1.0 - saddle;
    out.code = std::max(out.code, 1);
    ELVsteps1 = ELVsteps2 = ELVsteps3 = 0;
    ELVmethod = df > 30.0 ? 2002 : 2003;
  }
  return out;
}

// Opposite signs (t < 0 < delta): the core and its fallbacks.
Tails oppositeSigns(double t, double df, double delta) {
  ELVmethod = 0;
  // The closed saddle-point expansion (t_saddle_approx) has a relative
  // error near 5e-2/df^2: 2e-8 at df = 1000, above the 1e-8 of a status-0
  // answer, and 2e-10 at 1e4 where the integral still reaches 1e-13. From
  // df = 1e5 on it is at 2e-12 and falls to rounding, while the integral's
  // panels lose digits (1e-11 at df = 1e6): there the closed form answers.
  const double saddle = df >= 1e5 ? t_saddle_approx(t, df, delta) : t_saddle_integral(t, df, delta);
  Tails out;
  if (df < 1000.0) out = core(t, df, delta, saddle);
  if (saddle == 0.0) {
    out.lower = 0.0;
    out.upper = 1.0;
    out.code = 0;
    ELVmethod = 2000;
    return out;
  }
  if (df >= 1000.0) {
    out.lower = saddle;
    out.upper = 1.0 - saddle;
    ELVmethod = 2001;
    return out;
  }
  if (out.good) {
    ELVmethod = 2;
    return out;
  }
  const long m = static_cast<long>(df);
  const bool owen = m == 1 || (m >= 2 && m <= 6 && t > -10.0) || (m >= 7 && m <= 12 && t > -2.0);
  if (owen) {
    double lower = 0.0;
    int code;
    if (m == 1) {
      double v = 0.0;
      code = Tha_c(&v, delta * std::sqrt(df / (df + t * t)), -t / std::sqrt(df));
      lower = 2.0 * v;
      if (code == 0 && lower == -1.0) code = 4;
    } else {
      code = owenLowerTail(t, df, delta, &lower);
    }
    if (code != 0) {
      out.lower = out.upper = -1.0;
      out.code = 4;
    } else {
      out.lower = lower;
      out.upper = 1.0 - lower;
      // A last resort: exact for integer df only, and a sum of terms of
      // both signs for m above 1.
      out.code = 1;
    }
    ELVmethod = m == 1 ? 4000 : (m <= 6 ? 4001 : 4002);
    return out;
  }
  const bool expansion = (m >= 2 && m <= 6 && t <= -10.0) || (m >= 7 && m <= 12 && t < -25.0);
  if (expansion) {
    // Far tail of a small integer df, where the recursion's terms of both
    // signs would swamp the tail. t_expansion_approx (the four-term
    // expansion in m/(m + t^2)) is exact in form here but not in numbers:
    // its parts p(delta) phi(delta) and q(delta) Q(delta) cancel like
    // delta^(2m+7)/m! and its truncation costs up to 1e-2 at the region's
    // edge, and on a fractional df it mixes the tails of two df. The
    // integral around the saddle has none of these losses (1e-13 on the
    // same points), so it answers, still flagged with status 1 as a
    // last-resort path.
    out.lower = saddle;
    out.upper = 1.0 - saddle;
    out.code = 1;
    ELVmethod = m <= 6 ? 3000 : 3001;
    return out;
  }
  ELVmethod = 3;
  return out;
}

}  // namespace

extern "C" {

void t_ncdf(double t, double df, double delta, double* lower, double* upper) {
  ELVstartup(kName);
  ELVsteps1 = ELVsteps2 = ELVsteps3 = 0;
  if (anyNan(t, df, delta) || df <= 0.0 || df > kMaxDf) {
    ELVmethod = 0;
    ELVexit(kName, 2, 'F');
    return;
  }
  // |delta| above 1e5 puts L far beyond the largest shape (and would
  // overflow in the square).
  const double L = std::fabs(delta) > 1e5 ? kHuge : 0.5 * delta * delta;
  if (L > kMaxShape || L + 0.5 * df + kWidthFactor * std::sqrt(L) > kMaxShape) {
    ELVexit(kName, 3, 'F');
    return;
  }
  const double magnitude = std::fabs(t);
  if (magnitude > 1.0 && 1.0 / magnitude < kTinyReciprocal) {
    *lower = t < 0.0 ? 0.0 : 1.0;
    *upper = 1.0 - *lower;
    ELVmethod = 0;
    ELVexit(kName, 0, 'F');
    return;
  }
  if (delta == 0.0) {
    t_df(t, df, lower, upper);
    ELVmethod = 0;
    const int code = qel::elv::threadStatus();
    ELVexit(kName, code, 'F');
    return;
  }
  // P(T <= t; delta) = P(T >= -t; -delta): work with delta > 0.
  const bool reflected = delta < 0.0;
  if (reflected) {
    t = -t;
    delta = -delta;
  }
  Tails result;
  if (t * delta >= 0.0) {
    ELVmethod = 0;
    result = core(t, df, delta, 0.0);
  } else if (delta > 21.3) {
    // Phi(-21.3) is below 1e-100: the lower tail is 0 to the accuracy of
    // every use of it.
    result.lower = 0.0;
    result.upper = 1.0;
    ELVmethod = 1;
    if (reflected) std::swap(result.lower, result.upper);
    *lower = result.lower;
    *upper = result.upper;
    ELVexit(kName, 0, 'F');
    return;
  } else {
    result = oppositeSigns(t, df, delta);
  }
  if (reflected) std::swap(result.lower, result.upper);
  *lower = result.lower;
  *upper = result.upper;
  ELVexit(kName, result.code, 'N');
}

}  // extern "C"
