// Hostile sweep: every exported distribution function, scalar and array,
// over a fixed grid of hostile arguments, one parameter at a time away from
// a valid point. Answers must be NaN or in range and never the missing value,
// the thread must be in the default state after a normal return, an escaping
// trap must be recoverable by ResetFpuStates, no call may be slow, arrays
// must equal the scalar forms bit for bit, and cdfs must be monotone.
#include <gtest/gtest.h>
#include <qel/distributions.h>

#include <cfloat>
#include <chrono>
#include <climits>
#include <cmath>
#include <cstring>
#include <functional>
#include <map>
#include <sstream>

#include "../unit/fpu_state.h"

namespace {

using Values = std::vector<double>;

// Saturating: every grid value reaches the int parameters.
int toInt(double v, const char*) {
  return std::isnan(v) ? 0 : v <= INT_MIN ? INT_MIN : v >= INT_MAX ? INT_MAX : static_cast<int>(v);
}

// The family table that tools/codegen/gen_distribution_api.py writes for qelcalc.
struct Family {
  std::string name;
  std::vector<std::pair<std::string, double>> parameters;
  std::function<double(double, const Values&)> pdf;
  std::function<double(double, const Values&, bool)> cdf;
  std::function<double(double, const Values&)> inv;
  std::function<void(double*, const double*, unsigned long, const Values&)> pdfArray;
  std::function<void(double*, const double*, unsigned long, const Values&, bool)> cdfArray;
  std::function<void(double*, const double*, unsigned long, const Values&)> invArray;
};
const std::vector<Family> kFamilies = {
#include "../../apps/qelcalc/families_table.inc"
};

const double kNaN = std::nan(""), kInf = HUGE_VAL, kMissing = 1.23456e30;
const double kDenormal = 4.9406564584124654e-324;
const double kSlowCall = 0.5;  // seconds, generous for sanitizer builds

// clang-format off
const Values kParameterGrid = {kNaN, kInf, -kInf, 0.0, -0.0, 1e-300, -1e-300, 1e300, -1e300,
    kMissing, INT_MIN, INT_MAX, kDenormal, -kDenormal, -1.0, 0.5, 1.0, 2.0, 3.0, 1e6, 1e-16, DBL_MAX};
const Values kArgumentGrid = {kNaN, kInf, -kInf, 0.0, -0.0, 1e-300, -1e-300, 1e300, -1e300,
    kMissing, INT_MIN, INT_MAX, kDenormal, -kDenormal, DBL_MAX, -DBL_MAX, -5.0, -1.0, 0.25, 0.5,
    0.75, 1.0, 1.5, 2.0, 2.5, 3.0, 7.0, 1e-16, 1.0 - 1e-16, 1e8};
const std::map<std::string, Values> kValidPoint = {
    {"beta", {2, 3}}, {"binomial", {10, 0.3}}, {"cauchy", {0, 1}}, {"chisq", {3, 2}},
    {"exponential", {1, 0}}, {"f", {3, 7, 1}}, {"gamma", {2, 1, 0}}, {"geometric", {0.3}},
    {"halfnormal", {1, 0}}, {"hypergeometric", {20, 7, 5}}, {"integeruniform", {-3, 4}},
    {"largestextremevalue", {0, 1}}, {"lambda", {0.14, 0, 1}}, {"laplace", {0, 1}},
    {"logistic", {0, 1}}, {"loglogistic", {0, 1, 0}}, {"lognormal", {0, 1, 0}},
    {"negbinomial", {0.3, 3}}, {"normal", {0, 1}}, {"poisson", {4}},
    {"smallestextremevalue", {0, 1}}, {"t", {5, 1}}, {"triangular", {0, 1, 3}},
    {"uniform", {0, 1}}, {"weibull", {2, 1, 0}}};
// clang-format on

std::string describe(const Family& f, const char* what, double x, const Values& v) {
  std::ostringstream s;
  s.precision(17);
  s << f.name << ' ' << what << '(' << x;
  for (double p : v) s << ", " << p;
  return s.str() + ")";
}

struct Sweep {
  int failures = 0, exceptions = 0;
  void fail(const std::string& what) {
    if (failures++ < 100) ADD_FAILURE() << what;
  }
  // One call, its answer in [lowest, highest] or NaN, and the state after it.
  double run(const std::string& label, const std::function<double()>& call, double lowest,
             double highest, double budget = kSlowCall) {
    const auto start = std::chrono::steady_clock::now();
    double r;
    try {
      r = call();
    } catch (const std::exception&) {
      // The documented contract: the trap reaches the host, thread armed.
      ++exceptions;
      qel::ResetFpuStates();
      if (!qeltest::isDefaultState()) fail(label + ": ResetFpuStates did not recover");
      return kNaN;
    }
    if (std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count() > budget)
      fail(label + " is slow");
    // Control bits only: sticky flags may come from this test's own denormals.
    if (qeltest::x87ControlWord() != qeltest::kDefaultX87 ||
        (qeltest::mxcsr() & ~0x3Fu) != qeltest::kDefaultMxcsr) {
      qel::ResetFpuStates();
      fail(label + " left the floating-point state changed");
    }
    if (r == kMissing || (!std::isnan(r) && !(r >= lowest && r <= highest)))
      fail(label + " = " + std::to_string(r));
    return r;
  }
};

void sweepPoint(Sweep& sweep, const Family& f, const Values& v) {
  const unsigned long n = kArgumentGrid.size();
  std::vector<double> scalar[4], out(n);
  for (unsigned long i = 0; i < n; ++i) {
    const double x = kArgumentGrid[i];
    scalar[0].push_back(sweep.run(
        describe(f, "pdf", x, v), [&] { return f.pdf(x, v); }, 0, kInf));
    scalar[1].push_back(sweep.run(
        describe(f, "cdf", x, v), [&] { return f.cdf(x, v, false); }, 0, 1));
    scalar[2].push_back(sweep.run(
        describe(f, "upper", x, v), [&] { return f.cdf(x, v, true); }, 0, 1));
    scalar[3].push_back(sweep.run(
        describe(f, "inv", x, v), [&] { return f.inv(x, v); }, -kInf, kInf));
  }
  const double* in = kArgumentGrid.data();
  const std::function<void()> arrays[4] = {
      [&] { f.pdfArray(out.data(), in, n, v); }, [&] { f.cdfArray(out.data(), in, n, v, false); },
      [&] { f.cdfArray(out.data(), in, n, v, true); }, [&] { f.invArray(out.data(), in, n, v); }};
  for (int a = 0; a < 4; ++a) {
    const int before = sweep.exceptions;
    sweep.run(
        describe(f, "array", a, v), [&] { return arrays[a](), 0.0; }, 0, 0, kSlowCall * n);
    if (sweep.exceptions != before) continue;  // the array is partly written
    for (unsigned long i = 0; i < n; ++i) {
      const double s = scalar[a][i];
      if (std::memcmp(&out[i], &s, sizeof s) != 0 && !(std::isnan(out[i]) && std::isnan(s)))
        sweep.fail(describe(f, "array differs", kArgumentGrid[i], v));
    }
  }
}

// Lower tails rise and upper tails fall along x, within a few ulps (and
// within DBL_MIN: the armed state reads denormal operands as zero).
void sweepMonotone(Sweep& sweep, const Family& f, const Values& v) {
  double lastLower = 0.0, lastUpper = 1.0;
  for (double x :
       {-DBL_MAX, -1e300, -1e8, -5.0, -1.0, -1e-300, 0.0,  1e-300, 0.25, 0.5,   1.0,
        1.5,      2.0,    2.5,  3.0,  4.0,  7.0,     10.0, 30.0,   1e8,  1e300, DBL_MAX}) {
    const double lo = sweep.run(
        describe(f, "cdf", x, v), [&] { return f.cdf(x, v, false); }, 0, 1);
    const double up = sweep.run(
        describe(f, "upper", x, v), [&] { return f.cdf(x, v, true); }, 0, 1);
    if (std::isnan(lo) || std::isnan(up)) continue;
    if (lo < lastLower * (1.0 - 1e-13) - DBL_MIN || up > lastUpper * (1.0 + 1e-13) + DBL_MIN)
      sweep.fail(describe(f, "not monotone at", x, v));
    lastLower = lo;
    lastUpper = up;
  }
}

TEST(HostileSweep, EveryFamilyOverTheHostileGrid) {
  qel::RegisterLynSigfpeHandler();
  Sweep sweep;
  for (const Family& f : kFamilies) {
    const Values& valid = kValidPoint.at(f.name);
    ASSERT_EQ(valid.size(), f.parameters.size()) << f.name;
    sweepPoint(sweep, f, valid);
    sweepMonotone(sweep, f, valid);
    for (std::size_t j = 0; j < valid.size(); ++j) {
      for (double p : kParameterGrid) {
        Values v = valid;
        v[j] = p;
        sweepPoint(sweep, f, v);
        sweepMonotone(sweep, f, v);
      }
    }
  }
  EXPECT_EQ(sweep.failures, 0);
  RecordProperty("exceptions", std::to_string(sweep.exceptions));
}

}  // namespace
