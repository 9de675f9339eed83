// Distribution kernels against mpmath reference values (tests/data/kernels.csv
// from tools/reference/gen_kernels.py): densities and masses, both tails each
// in its own right, and quantiles, over parameters that reach every branch.
// Every row is held to full double precision (1e-14 relative in the body,
// 1e-12 in the far tails), or to its family's own tighter bound.
#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <map>
#include <string>

#include "reference_data.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/kernels.h"

namespace {

using P = const double*;

struct Kernels {
  std::function<double(double, P)> pdf;
  std::function<double(double, P, bool)> cdf;
  std::function<double(double, P)> inv;
  double pdfTolerance;
  double cdfTolerance;
  double invTolerance;
};

constexpr double kElv = 1e-8;
constexpr double kClosed = 1e-13;

const std::map<std::string, Kernels>& kernels() {
  using namespace qel;
  static const std::map<std::string, Kernels> table = {
      {"exponential",
       {[](double x, P p) { return mExponentialPdf(x, p[0], p[1]); },
        [](double x, P p, bool u) { return mExponentialCdf(x, p[0], p[1], u); },
        [](double x, P p) { return mExponentialInvCdf(x, p[0], p[1]); }, kClosed, kElv, kClosed}},
      {"lev",
       {[](double x, P p) { return mLargestExtremeValuePdf(x, p[0], p[1]); },
        [](double x, P p, bool u) { return mLargestExtremeValueCdf(x, p[0], p[1], u); },
        [](double x, P p) { return mLargestExtremeValueInvCdf(x, p[0], p[1]); }, 1e-12, kElv,
        kClosed}},
      {"sev",
       {[](double x, P p) { return mSmallestExtremeValuePdf(x, p[0], p[1]); },
        [](double x, P p, bool u) { return mSmallestExtremeValueCdf(x, p[0], p[1], u); },
        [](double x, P p) { return mSmallestExtremeValueInvCdf(x, p[0], p[1]); }, 1e-12, kElv,
        kClosed}},
      {"weibull",
       {[](double x, P p) { return mWeibullPdf(x, p[0], p[1], p[2]); },
        [](double x, P p, bool u) { return mWeibullCdf(x, p[0], p[1], p[2], u); },
        [](double x, P p) { return mWeibullInvCdf(x, p[0], p[1], p[2]); }, kClosed, kElv, kClosed}},
      {"laplace",
       {[](double x, P p) { return mLaplacePdf(x, p[0], p[1]); },
        [](double x, P p, bool u) { return mLaplaceCdf(x, p[0], p[1], u); },
        [](double x, P p) { return mLaplaceInvCdf(x, p[0], p[1]); }, kClosed, kElv, kClosed}},
      // The distribution function is a root search on the quantile function,
      // converged to 1e-12 in p.
      {"lambda",
       {[](double x, P p) { return mLambdaPdf(x, p[0], p[1], p[2]); },
        [](double x, P p, bool u) { return mLambdaCdf(x, p[0], p[1], p[2], u); },
        [](double x, P p) { return mLambdaInvCdf(x, p[0], p[1], p[2]); }, 1e-10, 1e-10, 1e-12}},
      {"gamma",
       {[](double x, P p) { return mGammaPdf(x, p[0], p[1], p[2]); },
        [](double x, P p, bool u) { return mGammaCdf(x, p[0], p[1], p[2], u); },
        [](double x, P p) { return mGammaInvCdf(x, p[0], p[1], p[2]); }, kElv, kElv, kElv}},
      {"chisq",
       {[](double x, P p) { return mChiSqPdf(x, p[0]); },
        [](double x, P p, bool u) { return mChiSqCdf(x, p[0], p[1], u); },
        [](double x, P p) { return mChiSqInvCdf(x, p[0], p[1]); }, 1e-12, kElv, kElv}},
      {"normal",
       {[](double x, P p) { return mNormalPdf(x, p[0], p[1]); },
        [](double x, P p, bool u) { return mNormalCdf(x, p[0], p[1], u); },
        [](double x, P p) { return mNormalInvCdf(x, p[0], p[1]); }, 1e-12, kElv, kElv}},
      {"lognormal",
       {[](double x, P p) { return mLogNormalPdf(x, p[0], p[1], p[2]); },
        [](double x, P p, bool u) { return mLogNormalCdf(x, p[0], p[1], p[2], u); },
        [](double x, P p) { return mLogNormalInvCdf(x, p[0], p[1], p[2]); }, 1e-12, kElv, kElv}},
      {"halfnormal",
       {[](double x, P p) { return mHalfNormalPdf(x, p[0], p[1]); },
        [](double x, P p, bool u) { return mHalfNormalCdf(x, p[0], p[1], u); },
        [](double x, P p) { return mHalfNormalInvCdf(x, p[0], p[1]); }, 1e-12, kElv, kElv}},
      {"binomial",
       {[](double x, P p) { return mBinomialPdf(x, static_cast<int>(p[0]), p[1]); },
        [](double x, P p, bool u) { return mBinomialCdf(x, p[0], p[1], u); },
        [](double x, P p) { return mBinomialInvCdf(x, static_cast<int>(p[0]), p[1]); }, 1e-11, kElv,
        0.0}},
      {"t",
       {[](double x, P p) { return mTPdf(x, p[0], p[1]); },
        [](double x, P p, bool u) { return mTCdf(x, p[0], p[1], u); },
        [](double x, P p) { return mTInvCdf(x, p[0], p[1]); }, 1e-12, kElv, kElv}},
      {"f",
       {[](double x, P p) { return mFPdf(x, p[0], p[1]); },
        [](double x, P p, bool u) { return mFCdf(x, p[0], p[1], p[2], u); },
        [](double x, P p) { return mFInvCdf(x, p[0], p[1], p[2]); }, 1e-12, kElv, kElv}},
      {"beta",
       {[](double x, P p) { return mBetaPdf(x, p[0], p[1]); },
        [](double x, P p, bool u) { return mBetaCdf(x, p[0], p[1], u); },
        [](double x, P p) { return mBetaInvCdf(x, p[0], p[1]); }, 1e-12, kElv, kElv}},
      {"poisson",
       {[](double x, P p) { return mPoissonPdf(x, p[0]); },
        [](double x, P p, bool u) { return mPoissonCdf(x, p[0], u); },
        [](double x, P p) { return mPoissonInvCdf(x, p[0]); }, 1e-11, kElv, 0.0}},
      {"negbinomial",
       {[](double x, P p) { return mNegBinomialPdf(x, p[0], p[1]); },
        [](double x, P p, bool u) { return mNegBinomialCdf(x, p[0], p[1], u); },
        [](double x, P p) { return mNegBinomialInvCdf(x, p[0], p[1]); }, 1e-12, kElv, 0.0}},
      {"geometric",
       {[](double x, P p) { return mGeometricPdf(x, p[0]); },
        [](double x, P p, bool u) { return mGeometricCdf(x, p[0], u); },
        [](double x, P p) { return mGeometricInvCdf(x, p[0]); }, 1e-12, 1e-12, 0.0}},
      {"hypergeometric",
       {[](double x, P p) {
          return mHypergeometricPdf(x, static_cast<int>(p[0]), static_cast<int>(p[1]),
                                    static_cast<int>(p[2]));
        },
        [](double x, P p, bool u) {
          return mHypergeometricCdf(x, static_cast<int>(p[0]), static_cast<int>(p[1]),
                                    static_cast<int>(p[2]), u);
        },
        [](double x, P p) {
          return mHypergeometricInvCdf(x, static_cast<int>(p[0]), static_cast<int>(p[1]),
                                       static_cast<int>(p[2]));
        },
        1e-11, kElv, 0.0}},
      {"intuniform",
       {[](double x, P p) { return mIntegerUniformPdf(x, int(p[0]), int(p[1])); },
        [](double x, P p, bool u) { return mIntegerUniformCdf(x, int(p[0]), int(p[1]), u); },
        [](double x, P p) { return mIntegerUniformInvCdf(x, int(p[0]), int(p[1])); }, kClosed,
        kClosed, 0.0}},
  };
  return table;
}

// edges: the rows are edge cases, held to 1e-13 (exactly where 0), with
// "nan" for the missing value.
void checkAgainst(const char* file, bool edges = false) {
  const auto rows = qeltest::loadReferenceData(file, 2);
  ASSERT_FALSE(rows.empty());
  std::map<std::string, double> worst;
  std::map<std::string, int> checked;
  for (const auto& row : rows) {
    const std::string& family = row.text[0];
    const std::string& function = row.text[1];
    const auto it = kernels().find(family);
    ASSERT_NE(it, kernels().end()) << family << " at line " << row.line;
    const Kernels& k = it->second;
    const double x = row.numbers[0];
    const double* params = &row.numbers[1];
    const double expected = row.numbers[5];
    double actual, tolerance;
    if (function == "pdf") {
      actual = k.pdf(x, params);
      tolerance = k.pdfTolerance;
    } else if (function == "inv") {
      if (!k.inv) continue;
      actual = k.inv(x, params);
      tolerance = k.invTolerance;
    } else {
      actual = k.cdf(x, params, function == "upper");
      tolerance = k.cdfTolerance;
    }
    // Full double precision: 1e-14 in the body, 1e-12 where a tail or
    // density is below 1e-6 or a quantile's p is within 1e-6 of an end.
    const bool far = function == "inv" ? x < 1e-6 || x > 1.0 - 1e-6 : std::fabs(expected) < 1e-6;
    tolerance = std::min(tolerance, far ? 1e-12 : 1e-14);
    if (edges) {
      tolerance = 1e-13;
      if (std::isnan(expected) || expected == 0.0) {
        EXPECT_TRUE(std::isnan(expected) ? qel::mIsNumericMissing(actual) : actual == 0.0)
            << family << " " << function << " x=" << x << ": " << actual << " (line " << row.line
            << ")";
        continue;
      }
    }
    ASSERT_FALSE(qel::mIsNumericMissing(actual))
        << family << " " << function << " x=" << x << " line " << row.line;
    const double error = qeltest::relativeError(actual, expected);
    const std::string key = family + " " + function;
    worst[key] = std::fmax(worst[key], error);
    ++checked[key];
    EXPECT_LE(error, tolerance) << key << " x=" << x << " params " << params[0] << ", " << params[1]
                                << ", " << params[2] << " got " << actual << " expected "
                                << expected << " (line " << row.line << ")";
  }
  for (const auto& entry : worst) {
    std::printf("  %-22s %4d points, largest relative error %.3g\n", entry.first.c_str(),
                checked[entry.first], entry.second);
  }
}

TEST(KernelAccuracy, MatchHighPrecisionReferenceValues) {
  checkAgainst("kernels.csv");
}

TEST(KernelAccuracy, BetaFamilyAndTMatchHighPrecisionReferenceValues) {
  checkAgainst("kernels_beta_t.csv");
}

// The ends of the support, thresholds, integer rules, catches and the
// quantiles at 0 and 1 (tools/reference/gen_kernel_edges.py).
TEST(KernelAccuracy, EdgeCasesOfEveryFamily) {
  checkAgainst("kernel_edges.csv", true);
}

}  // namespace
