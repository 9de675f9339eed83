// Hostile sweep: every exported distribution function, scalar and array,
// over a fixed grid of hostile arguments (NaN, infinities, signed zeros,
// denormals, the missing value, the ends of the int range, huge and tiny
// numbers), one parameter at a time away from a valid point. Every answer
// must be NaN or in range, the thread must be in the default floating-point
// state after every call, no exception may reach the caller, the array form
// must agree with the scalar form bit for bit, and the distribution
// functions must be monotone in x.
#include <gtest/gtest.h>
#include <qel/basic_types.h>

#include <cfloat>
#include <chrono>
#include <climits>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>
#include <sstream>

#include "../unit/fpu_state.h"
#include "sweep_families.h"

namespace {

using hostile::Family;
using hostile::Values;

const double kNaN = std::nan("");
const double kInf = HUGE_VAL;
const double kMissing = 1.23456e30;
const double kDenormal = 4.9406564584124654e-324;
// No single call may take longer (seconds; generous for sanitizer builds).
const double kSlowCall = 0.5;

const std::vector<double> kParameterGrid = {
    kNaN,    kInf,      -kInf,      0.0,  -0.0, 1e-300, -1e-300, 1e300, -1e300, kMissing, INT_MIN,
    INT_MAX, kDenormal, -kDenormal, -1.0, 0.5,  1.0,    2.0,     3.0,   1e6,    1e-16,    DBL_MAX};

const std::vector<double> kArgumentGrid = {
    kNaN,   kInf,     -kInf,   0.0,     -0.0,        1e-300,     -1e-300, 1e300,
    -1e300, kMissing, INT_MIN, INT_MAX, kDenormal,   -kDenormal, DBL_MAX, -DBL_MAX,
    -5.0,   -1.0,     0.25,    0.5,     0.75,        1.0,        1.5,     2.0,
    2.5,    3.0,      7.0,     1e-16,   1.0 - 1e-16, 1e8};

// A valid point of each family, in the order of its parameters.
const std::map<std::string, Values> kValidPoint = {{"beta", {2, 3}},
                                                   {"binomial", {10, 0.3}},
                                                   {"cauchy", {0, 1}},
                                                   {"chisq", {3, 2}},
                                                   {"exponential", {1, 0}},
                                                   {"f", {3, 7, 1}},
                                                   {"gamma", {2, 1, 0}},
                                                   {"geometric", {0.3}},
                                                   {"halfnormal", {1, 0}},
                                                   {"hypergeometric", {20, 7, 5}},
                                                   {"integeruniform", {-3, 4}},
                                                   {"largestextremevalue", {0, 1}},
                                                   {"lambda", {0.14, 0, 1}},
                                                   {"laplace", {0, 1}},
                                                   {"logistic", {0, 1}},
                                                   {"loglogistic", {0, 1, 0}},
                                                   {"lognormal", {0, 1, 0}},
                                                   {"negbinomial", {0.3, 3}},
                                                   {"normal", {0, 1}},
                                                   {"poisson", {4}},
                                                   {"smallestextremevalue", {0, 1}},
                                                   {"t", {5, 1}},
                                                   {"triangular", {0, 1, 3}},
                                                   {"uniform", {0, 1}},
                                                   {"weibull", {2, 1, 0}}};

std::string describe(const Family& f, const char* what, double x, const Values& v) {
  std::ostringstream s;
  s.precision(17);
  s << f.name << ' ' << what << '(' << x;
  for (double p : v) s << ", " << p;
  return s.str() + ")";
}

bool sameBits(double a, double b) {
  return std::memcmp(&a, &b, sizeof a) == 0 || (std::isnan(a) && std::isnan(b));
}

// Calls one scalar function and checks the answer and the state after it.
class Sweep {
 public:
  template <class Call>
  double run(const std::string& label, Call call, double lowest, double highest,
             double budget = kSlowCall) {
    double r = kNaN;
    const auto start = std::chrono::steady_clock::now();
    try {
      r = call();
      const double seconds =
          std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
      if (seconds > budget) fail(label + " took " + std::to_string(seconds) + " s");
    } catch (const std::exception&) {
      // A trap that no kernel catches reaches the host with the thread armed
      // (the documented contract); the host's two recovery lines must work.
      ++exceptions_;
      qel::ResetFpuStates();
      if (!qeltest::isDefaultState()) fail(label + ": ResetFpuStates did not recover");
      return kNaN;
    }
    // The control bits; sticky flags may come from this test's own
    // arithmetic on denormals.
    if (qeltest::x87ControlWord() != qeltest::kDefaultX87 ||
        (qeltest::mxcsr() & ~0x3Fu) != qeltest::kDefaultMxcsr) {
      qel::ResetFpuStates();
      fail(label + " left the floating-point state changed");
    }
    if (r == kMissing) fail(label + " returned the missing value");
    if (!std::isnan(r) && !(r >= lowest && r <= highest)) {
      std::ostringstream s;
      s.precision(17);
      s << label << " = " << r;
      fail(s.str());
    }
    return r;
  }
  void fail(const std::string& what) {
    if (failures_++ < 400) ADD_FAILURE() << what;
  }
  int failures() const { return failures_; }
  int exceptions() const { return exceptions_; }

 private:
  int failures_ = 0;
  int exceptions_ = 0;
};

// One family at one parameter point: scalar forms over the argument grid,
// array forms over the same grid compared with them.
void sweepPoint(Sweep& sweep, const Family& f, const Values& v) {
  const unsigned long n = kArgumentGrid.size();
  std::vector<double> pdf(n), lower(n), upper(n), inv(n), out(n);
  for (unsigned long i = 0; i < n; ++i) {
    const double x = kArgumentGrid[i];
    pdf[i] = sweep.run(
        describe(f, "pdf", x, v), [&] { return f.pdf(x, v); }, 0.0, kInf);
    lower[i] = sweep.run(
        describe(f, "cdf", x, v), [&] { return f.cdf(x, v, false); }, 0.0, 1.0);
    upper[i] = sweep.run(
        describe(f, "upper", x, v), [&] { return f.cdf(x, v, true); }, 0.0, 1.0);
    inv[i] = sweep.run(
        describe(f, "inv", x, v), [&] { return f.inv(x, v); }, -kInf, kInf);
  }
  struct ArrayCase {
    const char* what;
    std::function<void()> call;
    const std::vector<double>* scalar;
  };
  const double* in = kArgumentGrid.data();
  const ArrayCase cases[] = {{"pdf[]", [&] { f.pdfArray(out.data(), in, n, v); }, &pdf},
                             {"cdf[]", [&] { f.cdfArray(out.data(), in, n, v, false); }, &lower},
                             {"upper[]", [&] { f.cdfArray(out.data(), in, n, v, true); }, &upper},
                             {"inv[]", [&] { f.invArray(out.data(), in, n, v); }, &inv}};
  for (const auto& c : cases) {
    const std::string label = describe(f, c.what, 0.0, v);
    const int before = sweep.exceptions();
    sweep.run(
        label,
        [&] {
          c.call();
          return 0.0;
        },
        0.0, 0.0, kSlowCall * n);
    if (sweep.exceptions() != before) continue;  // the array is partly written
    for (unsigned long i = 0; i < n; ++i) {
      if (!sameBits(out[i], (*c.scalar)[i])) {
        sweep.fail(describe(f, c.what, kArgumentGrid[i], v) + " differs from the scalar form");
      }
    }
  }
}

// Open: the noncentral F with df1 = 1e-16 (a = 5e-17 in the ELV noncentral
// beta) loses its digits (0.849 at x = 2.5, 0.708 at 3; truth about 0.6065)
// and is not monotone. Its answers are still checked for range and state.
bool knownOpen(const Family& f, const Values& v) {
  return f.name == "f" && v[0] == 1e-16;
}

// Lower tails rise and upper tails fall along an increasing x.
void sweepMonotone(Sweep& sweep, const Family& f, const Values& v) {
  if (knownOpen(f, v)) return;
  const double xs[] = {-DBL_MAX, -1e300, -1e8, -5, -1, -1e-300, 0,  1e-300, 0.25, 0.5,   1,
                       1.5,      2,      2.5,  3,  4,  7,       10, 30,     1e8,  1e300, DBL_MAX};
  double lastLower = 0.0, lastUpper = 1.0;
  for (double x : xs) {
    const double lo = sweep.run(
        describe(f, "cdf", x, v), [&] { return f.cdf(x, v, false); }, 0, 1);
    const double up = sweep.run(
        describe(f, "upper", x, v), [&] { return f.cdf(x, v, true); }, 0, 1);
    if (std::isnan(lo) || std::isnan(up)) continue;
    // Within rounding: separate paths may meet with an error of a few ulps.
    if (lo < lastLower * (1.0 - 1e-13)) sweep.fail(describe(f, "cdf falls at", x, v));
    if (up > lastUpper * (1.0 + 1e-13)) sweep.fail(describe(f, "upper tail rises at", x, v));
    lastLower = lo;
    lastUpper = up;
  }
}

TEST(HostileSweep, EveryFamilyOverTheHostileGrid) {
  qel::RegisterLynSigfpeHandler();
  Sweep sweep;
  const auto start = std::chrono::steady_clock::now();
  const char* only = std::getenv("QEL_SWEEP_FAMILY");
  for (const Family& f : hostile::families()) {
    if (only != nullptr && f.name != only) continue;
    const auto point = kValidPoint.find(f.name);
    ASSERT_NE(point, kValidPoint.end()) << "no valid point for " << f.name;
    const Values& valid = point->second;
    const auto familyStart = std::chrono::steady_clock::now();
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
    const double familySeconds =
        std::chrono::duration<double>(std::chrono::steady_clock::now() - familyStart).count();
    if (std::getenv("QEL_SWEEP_TIMES")) {
      std::printf("%s %.2f s, %d exceptions so far\n", f.name.c_str(), familySeconds,
                  sweep.exceptions());
    }
  }
  const double seconds =
      std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
  EXPECT_EQ(sweep.failures(), 0);
  RecordProperty("seconds", std::to_string(seconds));
  RecordProperty("exceptions", std::to_string(sweep.exceptions()));
}

}  // namespace
