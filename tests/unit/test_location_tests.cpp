// The location tests against exact-arithmetic and mpmath reference values
// (tools/reference/gen_location_tests.py) for every interval type and
// alternative, the summary forms against the data forms, and the records
// left by bad enumerators, tiny samples, constant data and NaN.
#include <gtest/gtest.h>
#include <qel/basic_types.h>
#include <qel/location_tests.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <map>
#include <string>
#include <vector>

#include "interfaces/basic_statistics/interval.h"
#include "reference_data.h"

namespace {

using qel::AlternativeHypothesis;
using qel::IntervalType;
using qeltest::relativeError;

const double kNaN = std::numeric_limits<double>::quiet_NaN();
const double kInf = std::numeric_limits<double>::infinity();

const std::map<std::string, std::vector<double>>& samples() {
  static const std::map<std::string, std::vector<double>> table = [] {
    std::map<std::string, std::vector<double>> t;
    for (const auto& row : qeltest::loadReferenceData("location_samples.csv", 1))
      t[row.text[0]] = row.numbers;
    return t;
  }();
  return table;
}

// What every test writes, in one shape, so that one comparison serves all.
struct Outcome {
  int code;
  double estimate, deviation, standardError, df, lower, upper, statistic, pValue;
};

struct Case {
  std::string test, first, second;
  double confidence;
  IntervalType type;
  AlternativeHypothesis alternative;
  double hypothesised, sigma;
  Outcome expected;
  int line;
};

std::vector<Case> cases(const char* file = "location_tests.csv") {
  std::vector<Case> out;
  for (const auto& row : qeltest::loadReferenceData(file, 3)) {
    const auto& v = row.numbers;
    Case c{row.text[0],
           row.text[1],
           row.text[2],
           v[0],
           static_cast<IntervalType>(static_cast<int>(v[1])),
           static_cast<AlternativeHypothesis>(static_cast<int>(v[2])),
           v[3],
           v[4],
           {0, v[5], v[6], v[7], v[8], v[9], v[10], v[11], v[12]},
           row.line};
    out.push_back(c);
  }
  return out;
}

// Runs the data form with test (or, when summary is set, the data form and
// then the summary form on a fresh record holding the data form's inputs).
Outcome run(const Case& c, bool summary) {
  const std::vector<double>& x = samples().at(c.first);
  const std::vector<double>* y = c.second == "-" ? nullptr : &samples().at(c.second);
  const auto n = static_cast<unsigned int>(x.size());
  Outcome o{};
  if (c.test == "t1") {
    qel::v0::OneSampleT r;
    r.n = n;
    o.code =
        qel::v0::RunOneSampleT(&r, x.data(), c.confidence, c.type, c.alternative, c.hypothesised);
    if (summary) {
      qel::v0::OneSampleT s;
      s.n = n;
      s.mean = r.mean;
      s.standardDeviation = r.standardDeviation;
      o.code = qel::v0::RunOneSampleT(&s, c.confidence, c.type, c.alternative, c.hypothesised);
      r = s;
    }
    o = {o.code,       r.mean,       r.standardDeviation, r.standardError, n - 1.0,
         r.lowerLimit, r.upperLimit, r.statistic,         r.pValue};
  } else if (c.test == "z1") {
    qel::v0::OneSampleZ r;
    r.n = n;
    o.code = qel::v0::RunOneSampleZ(&r, x.data(), c.sigma, c.confidence, c.type, c.alternative,
                                    c.hypothesised);
    if (summary) {
      qel::v0::OneSampleZ s;
      s.n = n;
      s.mean = r.mean;
      o.code =
          qel::v0::RunOneSampleZ(&s, c.sigma, c.confidence, c.type, c.alternative, c.hypothesised);
      EXPECT_TRUE(std::isnan(s.standardDeviation)) << "summary z wrote the deviation";
      s.standardDeviation = r.standardDeviation;
      r = s;
    }
    o = {o.code,       r.mean,       r.standardDeviation, r.standardError, kNaN,
         r.lowerLimit, r.upperLimit, r.statistic,         r.pValue};
  } else if (c.test == "paired") {
    qel::v0::PairedT r;
    r.n = n;
    o.code = qel::v0::RunPairedT(&r, x.data(), y->data(), c.confidence, c.type, c.alternative,
                                 c.hypothesised);
    if (summary) {
      qel::v0::PairedT s;
      s.n = n;
      s.meanDifference = r.meanDifference;
      s.standardDeviationOfDifferences = r.standardDeviationOfDifferences;
      o.code = qel::v0::RunPairedT(&s, c.confidence, c.type, c.alternative, c.hypothesised);
      EXPECT_TRUE(std::isnan(s.firstMean) && std::isnan(s.secondMean) &&
                  std::isnan(s.firstStandardError))
          << "summary paired t wrote a per-column field";
      r = s;
    }
    o = {o.code,
         r.meanDifference,
         r.standardDeviationOfDifferences,
         r.standardErrorOfDifferences,
         n - 1.0,
         r.lowerLimit,
         r.upperLimit,
         r.statistic,
         r.pValue};
  } else {
    const bool pooled = c.test == "pooled";
    qel::v0::TwoSampleT r;
    r.firstN = n;
    r.secondN = static_cast<unsigned int>(y->size());
    o.code = qel::v0::RunTwoSampleT(&r, x.data(), y->data(), pooled, c.confidence, c.type,
                                    c.alternative, c.hypothesised);
    if (summary) {
      qel::v0::TwoSampleT s;
      s.firstN = r.firstN;
      s.secondN = r.secondN;
      s.firstMean = r.firstMean;
      s.secondMean = r.secondMean;
      s.firstStandardDeviation = r.firstStandardDeviation;
      s.secondStandardDeviation = r.secondStandardDeviation;
      o.code =
          qel::v0::RunTwoSampleT(&s, pooled, c.confidence, c.type, c.alternative, c.hypothesised);
      r = s;
    }
    // The standard error of the difference is no field: recover it from
    // the statistic's definition only for the comparison with the reference.
    const double se = (r.difference - c.hypothesised) / r.statistic;
    o = {o.code,       r.difference,       r.pooledStandardDeviation,
         se,           r.degreesOfFreedom, r.lowerLimit,
         r.upperLimit, r.statistic,        r.pValue};
  }
  return o;
}

// Error relative to expected, or to scale when that is larger: a limit is
// judged against the half-width it carries, so that a limit near zero does
// not turn the quantile's error into a large relative one.
void expectClose(double actual, double expected, double tolerance, const char* what, const Case& c,
                 double* worst, double scale = 0.0) {
  double e = relativeError(actual, expected);
  if (std::isfinite(expected) && scale > std::fabs(expected))
    e = std::fabs(actual - expected) / scale;
  *worst = std::max(*worst, e);
  EXPECT_LE(e, tolerance) << what << ": got " << actual << ", expected " << expected
                          << " (location_tests.csv line " << c.line << ", " << c.test << ")";
}

// The estimates, deviations and statistics are plain arithmetic on the
// compensated moments and must be good to a few roundings times the
// condition of the data (largest magnitude over the standard error: a
// difference of two means near 1000 that differ by 0.02 keeps only the
// digits that the data carry). The limits and
// P-values carry the error of the t and normal quantile and tail kernels,
// whose measured accuracy against mpmath is 1e-11 to about 1e-9.
void checkAgainst(const char* file, std::size_t atLeast) {
  const auto all = cases(file);
  ASSERT_GE(all.size(), atLeast);
  std::map<std::string, double> worstArithmetic, worstLimit, worstP;
  for (const Case& c : all) {
    const Outcome o = run(c, false);
    const Outcome& e = c.expected;
    double& a = worstArithmetic[c.test];
    double largest = 0.0;
    for (const std::string& name : {c.first, c.second})
      if (name != "-")
        for (double v : samples().at(name)) largest = std::max(largest, std::fabs(v));
    const double tolerance = std::max(1e-14, 1e-14 * largest / e.standardError);
    EXPECT_EQ(o.code, 0) << "line " << c.line;
    expectClose(o.estimate, e.estimate, tolerance, "estimate", c, &a);
    expectClose(o.deviation, e.deviation, tolerance, "deviation", c, &a);
    expectClose(o.standardError, e.standardError, tolerance, "standard error", c, &a);
    expectClose(o.statistic, e.statistic, tolerance, "statistic", c, &a);
    if (c.test != "z1") {
      EXPECT_EQ(o.df, e.df) << "degrees of freedom, line " << c.line;
    }
    expectClose(o.lower, e.lower, 3e-9, "lower limit", c, &worstLimit[c.test], e.standardError);
    expectClose(o.upper, e.upper, 3e-9, "upper limit", c, &worstLimit[c.test], e.standardError);
    expectClose(o.pValue, e.pValue, 5e-9, "P-value", c, &worstP[c.test]);
  }
  for (const auto& kv : worstArithmetic)
    std::printf("  %-6s largest relative error: arithmetic %.2g, limits %.2g, P-value %.2g\n",
                kv.first.c_str(), kv.second, worstLimit[kv.first], worstP[kv.first]);
}

// mpmath: every test, interval type and alternative.
TEST(LocationTests, AgreeWithReferenceForEveryTypeAndAlternative) {
  checkAgainst("location_tests.csv", 150u);
}

// R's t.test (one-sample, paired and pooled, interval side matching the
// alternative, as R ties them).
TEST(LocationTests, AgreeWithRsTTest) {
  checkAgainst("location_tests_r.csv", 30u);
}

TEST(LocationTests, SummaryFormsEqualDataForms) {
  for (const Case& c : cases()) {
    const Outcome a = run(c, false);
    const Outcome b = run(c, true);
    EXPECT_EQ(a.code, b.code);
    // Same inputs, same arithmetic: identical results, not merely close.
    for (auto pair :
         {std::make_pair(a.standardError, b.standardError), std::make_pair(a.lower, b.lower),
          std::make_pair(a.upper, b.upper), std::make_pair(a.statistic, b.statistic),
          std::make_pair(a.pValue, b.pValue), std::make_pair(a.df, b.df)}) {
      if (std::isnan(pair.first)) {
        EXPECT_TRUE(std::isnan(pair.second)) << "line " << c.line;
      } else {
        EXPECT_EQ(pair.first, pair.second) << "line " << c.line;
      }
    }
  }
}

TEST(LocationTests, IntervalOnlyFormsLeaveTheTestFieldsAlone) {
  const std::vector<double>& x = samples().at("a10");
  const std::vector<double>& y = samples().at("b10");
  qel::v0::OneSampleT t;
  t.n = 10;
  EXPECT_EQ(qel::v0::RunOneSampleT(&t, x.data(), 0.95, qel::kIntervalTwoSided), 0);
  EXPECT_TRUE(std::isfinite(t.lowerLimit) && std::isfinite(t.upperLimit));
  EXPECT_TRUE(std::isnan(t.statistic) && std::isnan(t.pValue));
  qel::v0::OneSampleZ z;
  z.n = 10;
  EXPECT_EQ(qel::v0::RunOneSampleZ(&z, x.data(), 1.0, 0.95, qel::kIntervalLowerBound), 0);
  EXPECT_TRUE(std::isfinite(z.lowerLimit) && z.upperLimit == kInf);
  EXPECT_TRUE(std::isnan(z.statistic) && std::isnan(z.pValue));
  qel::v0::PairedT p;
  p.n = 10;
  EXPECT_EQ(qel::v0::RunPairedT(&p, x.data(), y.data(), 0.95, qel::kIntervalUpperBound), 0);
  EXPECT_TRUE(p.lowerLimit == -kInf && std::isfinite(p.upperLimit));
  EXPECT_TRUE(std::isnan(p.statistic) && std::isnan(p.pValue));
  qel::v0::TwoSampleT w;
  w.firstN = w.secondN = 10;
  EXPECT_EQ(qel::v0::RunTwoSampleT(&w, x.data(), y.data(), false, 0.95, qel::kIntervalTwoSided), 0);
  EXPECT_TRUE(std::isfinite(w.lowerLimit) && std::isfinite(w.upperLimit));
  EXPECT_TRUE(std::isnan(w.statistic) && std::isnan(w.pValue));
}

TEST(LocationTests, SummaryIntervalFormsMatchTheTestForms) {
  const qel::IntervalType type = qel::kIntervalTwoSided;
  qel::v0::OneSampleT t, tt;
  t.n = tt.n = 12;
  t.mean = tt.mean = 4.5;
  t.standardDeviation = tt.standardDeviation = 1.25;
  EXPECT_EQ(qel::v0::RunOneSampleT(&t, 0.9, type), 0);
  EXPECT_EQ(qel::v0::RunOneSampleT(&tt, 0.9, type, qel::kAlternativeLess, 4.0), 0);
  EXPECT_EQ(t.lowerLimit, tt.lowerLimit);
  EXPECT_EQ(t.upperLimit, tt.upperLimit);
  EXPECT_TRUE(std::isnan(t.statistic) && std::isnan(t.pValue));

  qel::v0::OneSampleZ z, zz;
  z.n = zz.n = 12;
  z.mean = zz.mean = 4.5;
  EXPECT_EQ(qel::v0::RunOneSampleZ(&z, 2.0, 0.9, type), 0);
  EXPECT_EQ(qel::v0::RunOneSampleZ(&zz, 2.0, 0.9, type, qel::kAlternativeGreater, 4.0), 0);
  EXPECT_EQ(z.lowerLimit, zz.lowerLimit);
  EXPECT_EQ(z.standardError, 2.0 / std::sqrt(12.0));
  EXPECT_TRUE(std::isnan(z.standardDeviation) && std::isnan(z.pValue));

  qel::v0::PairedT p, pp;
  p.n = pp.n = 12;
  p.meanDifference = pp.meanDifference = -0.5;
  p.standardDeviationOfDifferences = pp.standardDeviationOfDifferences = 0.75;
  EXPECT_EQ(qel::v0::RunPairedT(&p, 0.9, type), 0);
  EXPECT_EQ(qel::v0::RunPairedT(&pp, 0.9, type, qel::kAlternativeNotEqual, 0.0), 0);
  EXPECT_EQ(p.upperLimit, pp.upperLimit);
  EXPECT_TRUE(std::isnan(p.statistic) && std::isnan(p.firstMean) && std::isnan(p.secondMean));

  for (bool pooled : {false, true}) {
    qel::v0::TwoSampleT w, ww;
    w.firstN = ww.firstN = 12;
    w.secondN = ww.secondN = 7;
    w.firstMean = ww.firstMean = 3.0;
    w.secondMean = ww.secondMean = 2.0;
    w.firstStandardDeviation = ww.firstStandardDeviation = 1.0;
    w.secondStandardDeviation = ww.secondStandardDeviation = 3.0;
    EXPECT_EQ(qel::v0::RunTwoSampleT(&w, pooled, 0.9, type), 0);
    EXPECT_EQ(qel::v0::RunTwoSampleT(&ww, pooled, 0.9, type, qel::kAlternativeLess, 0.0), 0);
    EXPECT_EQ(w.lowerLimit, ww.lowerLimit);
    EXPECT_EQ(w.degreesOfFreedom, ww.degreesOfFreedom);
    EXPECT_EQ(w.difference, 1.0);
    // Pooled: 17 degrees; Welch: floor(1.87429 / 0.276142) = floor(6.787) = 6.
    EXPECT_EQ(w.degreesOfFreedom, pooled ? 17.0 : 6.0);
    EXPECT_EQ(std::isnan(w.pooledStandardDeviation), !pooled);
    EXPECT_TRUE(std::isnan(w.statistic));
  }
}

TEST(LocationTests, RecordsStartWithNaNAndZeroCounts) {
  qel::v0::OneSampleT t;
  qel::v0::OneSampleZ z;
  qel::v0::PairedT p;
  qel::v0::TwoSampleT w;
  for (double v : {t.mean, t.standardDeviation, t.standardError, t.lowerLimit, t.upperLimit,
                   t.statistic, t.pValue, z.mean, z.standardDeviation, z.standardError,
                   z.lowerLimit, z.upperLimit, z.statistic, z.pValue})
    EXPECT_TRUE(std::isnan(v));
  for (double v : {p.firstMean, p.secondMean, p.firstStandardDeviation, p.secondStandardDeviation,
                   p.firstStandardError, p.secondStandardError, p.meanDifference,
                   p.standardDeviationOfDifferences, p.standardErrorOfDifferences, p.lowerLimit,
                   p.upperLimit, p.statistic, p.pValue})
    EXPECT_TRUE(std::isnan(v));
  for (double v :
       {w.firstMean, w.secondMean, w.firstStandardDeviation, w.secondStandardDeviation,
        w.firstStandardError, w.secondStandardError, w.difference, w.pooledStandardDeviation,
        w.degreesOfFreedom, w.lowerLimit, w.upperLimit, w.statistic, w.pValue})
    EXPECT_TRUE(std::isnan(v));
  EXPECT_EQ(t.n + z.n + p.n + w.firstN + w.secondN, 0u);
}

TEST(LocationTests, PairedDataFormsRecordEachColumn) {
  const std::vector<double> x = {2.0, 4.0, 9.0};
  const std::vector<double> y = {1.0, 1.0, 1.0};
  qel::v0::PairedT p;
  p.n = 3;
  ASSERT_EQ(qel::v0::RunPairedT(&p, x.data(), y.data(), 0.9, qel::kIntervalTwoSided,
                                qel::kAlternativeNotEqual, 0.0),
            0);
  EXPECT_EQ(p.firstMean, 5.0);
  EXPECT_EQ(p.secondMean, 1.0);
  EXPECT_NEAR(p.firstStandardDeviation, std::sqrt(13.0), 1e-15);
  EXPECT_NEAR(p.firstStandardError, std::sqrt(13.0 / 3.0), 1e-15);
  EXPECT_EQ(p.secondStandardDeviation, 0.0);
  EXPECT_EQ(p.secondStandardError, 0.0);
  EXPECT_EQ(p.meanDifference, 4.0);
}

TEST(LocationTests, OneSampleZRecordsTheSampleDeviationButUsesSigma) {
  const std::vector<double> x = {1.0, 2.0, 3.0, 6.0};  // mean 3, s = sqrt(14/3)
  qel::v0::OneSampleZ z;
  z.n = 4;
  ASSERT_EQ(qel::v0::RunOneSampleZ(&z, x.data(), 10.0, 0.95, qel::kIntervalTwoSided,
                                   qel::kAlternativeGreater, 0.0),
            0);
  EXPECT_NEAR(z.standardDeviation, std::sqrt(14.0 / 3.0), 1e-15);
  EXPECT_EQ(z.standardError, 5.0);
  EXPECT_EQ(z.statistic, 0.6);
}

TEST(LocationTests, OneSidedIntervalsUseTheFullConfidence) {
  // With a 90% level, the one-sided limit lies where the two-sided 80%
  // interval ends, and the other limit is infinite with the right sign.
  const std::vector<double>& x = samples().at("c25");
  qel::v0::OneSampleT two, lower, upper;
  two.n = lower.n = upper.n = 25;
  ASSERT_EQ(qel::v0::RunOneSampleT(&two, x.data(), 0.8, qel::kIntervalTwoSided), 0);
  ASSERT_EQ(qel::v0::RunOneSampleT(&lower, x.data(), 0.9, qel::kIntervalLowerBound), 0);
  ASSERT_EQ(qel::v0::RunOneSampleT(&upper, x.data(), 0.9, qel::kIntervalUpperBound), 0);
  EXPECT_NEAR(lower.lowerLimit, two.lowerLimit, 1e-13);
  EXPECT_NEAR(upper.upperLimit, two.upperLimit, 1e-13);
  EXPECT_EQ(lower.upperLimit, kInf);
  EXPECT_EQ(upper.lowerLimit, -kInf);
}

TEST(LocationTests, WelchLeavesPooledDeviationAndUsesWholeDegrees) {
  const std::vector<double>& x = samples().at("c25");
  const std::vector<double>& y = samples().at("d40");
  qel::v0::TwoSampleT w;
  w.firstN = 25;
  w.secondN = 40;
  ASSERT_EQ(qel::v0::RunTwoSampleT(&w, x.data(), y.data(), false, 0.95, qel::kIntervalTwoSided,
                                   qel::kAlternativeNotEqual, 0.0),
            0);
  EXPECT_TRUE(std::isnan(w.pooledStandardDeviation));
  EXPECT_EQ(w.degreesOfFreedom, std::floor(w.degreesOfFreedom));
  EXPECT_GT(w.degreesOfFreedom, 24.0);
  qel::v0::TwoSampleT p;
  p.firstN = 25;
  p.secondN = 40;
  ASSERT_EQ(qel::v0::RunTwoSampleT(&p, x.data(), y.data(), true, 0.95, qel::kIntervalTwoSided), 0);
  EXPECT_EQ(p.degreesOfFreedom, 63.0);
  EXPECT_TRUE(std::isfinite(p.pooledStandardDeviation));
}

TEST(LocationTests, BadIntervalTypeGives30002AndNaN) {
  const auto bad = static_cast<IntervalType>(2);
  const auto worse = static_cast<IntervalType>(-7);
  const std::vector<double>& x = samples().at("a10");
  const std::vector<double>& y = samples().at("b10");
  for (IntervalType type : {bad, worse}) {
    qel::v0::OneSampleT t;
    t.n = 10;
    EXPECT_EQ(qel::v0::RunOneSampleT(&t, x.data(), 0.95, type, qel::kAlternativeLess, 0.0), 30002);
    EXPECT_TRUE(std::isnan(t.lowerLimit) && std::isnan(t.upperLimit));
    EXPECT_TRUE(std::isnan(t.statistic) && std::isnan(t.pValue));
    EXPECT_TRUE(std::isfinite(t.mean) && std::isfinite(t.standardError));

    qel::v0::OneSampleZ z;
    z.n = 10;
    z.mean = 1.0;
    EXPECT_EQ(qel::v0::RunOneSampleZ(&z, 1.0, 0.95, type, qel::kAlternativeGreater, 0.0), 30002);
    EXPECT_TRUE(std::isnan(z.lowerLimit) && std::isnan(z.upperLimit));
    EXPECT_TRUE(std::isnan(z.statistic) && std::isnan(z.pValue));

    qel::v0::PairedT p;
    p.n = 10;
    EXPECT_EQ(
        qel::v0::RunPairedT(&p, x.data(), y.data(), 0.95, type, qel::kAlternativeNotEqual, 0.0),
        30002);
    EXPECT_TRUE(std::isnan(p.lowerLimit) && std::isnan(p.upperLimit));
    EXPECT_TRUE(std::isnan(p.statistic) && std::isnan(p.pValue));

    qel::v0::TwoSampleT w;
    w.firstN = w.secondN = 10;
    EXPECT_EQ(qel::v0::RunTwoSampleT(&w, x.data(), y.data(), true, 0.95, type), 30002);
    EXPECT_TRUE(std::isnan(w.lowerLimit) && std::isnan(w.upperLimit));
    EXPECT_TRUE(std::isnan(w.statistic) && std::isnan(w.pValue));

    double lower = 0.0, upper = 0.0;
    EXPECT_EQ(qel::v1::MakeTraditionalSymmetricCI(qel::v0::NormalInvCdfFunc(), 0.95, type, 1.0, 1.0,
                                                  &lower, &upper),
              30002);
    EXPECT_TRUE(std::isnan(lower) && std::isnan(upper));
  }
}

TEST(LocationTests, IntervalMakerIsSymmetricAroundTheEstimate) {
  double lower = 0.0, upper = 0.0;
  ASSERT_EQ(qel::v1::MakeTraditionalSymmetricCI(qel::v0::NormalInvCdfFunc(), 0.95,
                                                qel::kIntervalTwoSided, 10.0, 2.0, &lower, &upper),
            0);
  // 1.959963984540054 = the 97.5% point of the standard normal law.
  EXPECT_NEAR(lower, 10.0 - 2.0 * 1.959963984540054, 1e-9);
  EXPECT_NEAR(upper, 10.0 + 2.0 * 1.959963984540054, 1e-9);
  EXPECT_DOUBLE_EQ(upper - 10.0, 10.0 - lower);
  // A quantile that fails gives NaN limits and still code 0.
  ASSERT_EQ(
      qel::v1::MakeTraditionalSymmetricCI(qel::v0::TInvCdfFunc(kNaN), 0.95,
                                          qel::kIntervalLowerBound, 10.0, 2.0, &lower, &upper),
      0);
  EXPECT_TRUE(std::isnan(lower));
  EXPECT_EQ(upper, kInf);
}

TEST(LocationTests, EmptyAndSingleSamples) {
  const double one[] = {3.5};
  qel::v0::OneSampleT empty;
  EXPECT_EQ(qel::v0::RunOneSampleT(&empty, one, 0.95, qel::kIntervalTwoSided,
                                   qel::kAlternativeNotEqual, 0.0),
            0);
  for (double v : {empty.mean, empty.standardDeviation, empty.standardError, empty.lowerLimit,
                   empty.upperLimit, empty.statistic, empty.pValue})
    EXPECT_TRUE(std::isnan(v));

  qel::v0::OneSampleT single;
  single.n = 1;
  EXPECT_EQ(qel::v0::RunOneSampleT(&single, one, 0.95, qel::kIntervalTwoSided,
                                   qel::kAlternativeNotEqual, 0.0),
            0);
  EXPECT_EQ(single.mean, 3.5);
  EXPECT_EQ(single.standardDeviation, 0.0);
  EXPECT_EQ(single.standardError, 0.0);
  EXPECT_TRUE(std::isnan(single.lowerLimit) && std::isnan(single.upperLimit));

  qel::v0::TwoSampleT w;
  w.firstN = w.secondN = 1;
  EXPECT_EQ(qel::v0::RunTwoSampleT(&w, one, one, true, 0.95, qel::kIntervalTwoSided), 0);
  EXPECT_EQ(w.degreesOfFreedom, 0.0);
  EXPECT_TRUE(std::isnan(w.lowerLimit) && std::isnan(w.upperLimit));

  qel::v0::PairedT p;
  EXPECT_EQ(
      qel::v0::RunPairedT(&p, one, one, 0.95, qel::kIntervalTwoSided, qel::kAlternativeLess, 0.0),
      0);
  EXPECT_TRUE(std::isnan(p.meanDifference) && std::isnan(p.lowerLimit) && std::isnan(p.pValue));
}

TEST(LocationTests, ZeroStandardErrorGivesInfiniteOrNaNStatistic) {
  const double constant[] = {2.0, 2.0, 2.0, 2.0};
  qel::v0::OneSampleT t;
  t.n = 4;
  EXPECT_EQ(qel::v0::RunOneSampleT(&t, constant, 0.95, qel::kIntervalTwoSided,
                                   qel::kAlternativeNotEqual, 1.0),
            0);
  EXPECT_EQ(t.standardError, 0.0);
  EXPECT_EQ(t.lowerLimit, 2.0);
  EXPECT_EQ(t.upperLimit, 2.0);
  EXPECT_EQ(t.statistic, kInf);
  EXPECT_EQ(t.pValue, 0.0);

  qel::v0::OneSampleT atMean;
  atMean.n = 4;
  EXPECT_EQ(qel::v0::RunOneSampleT(&atMean, constant, 0.95, qel::kIntervalTwoSided,
                                   qel::kAlternativeNotEqual, 2.0),
            0);
  EXPECT_TRUE(std::isnan(atMean.statistic) && std::isnan(atMean.pValue));

  qel::v0::OneSampleZ z;
  z.n = 4;
  z.mean = 1.0;
  EXPECT_EQ(
      qel::v0::RunOneSampleZ(&z, 0.0, 0.95, qel::kIntervalTwoSided, qel::kAlternativeGreater, 0.0),
      0);
  EXPECT_EQ(z.statistic, kInf);
  EXPECT_EQ(z.pValue, 0.0);

  // Two constant samples under Welch: 0/0 degrees of freedom.
  qel::v0::TwoSampleT w;
  w.firstN = w.secondN = 4;
  const double other[] = {1.0, 1.0, 1.0, 1.0};
  EXPECT_EQ(qel::v0::RunTwoSampleT(&w, constant, other, false, 0.95, qel::kIntervalTwoSided,
                                   qel::kAlternativeNotEqual, 0.0),
            0);
  EXPECT_TRUE(std::isnan(w.degreesOfFreedom) && std::isnan(w.lowerLimit));
  EXPECT_EQ(w.statistic, kInf);
}

TEST(LocationTests, NaNInTheDataAndBadConfidenceGiveNaN) {
  const double x[] = {1.0, kNaN, 3.0, 4.0};
  const double y[] = {1.0, 2.0, 2.5, 3.0};
  qel::v0::OneSampleT t;
  t.n = 4;
  EXPECT_EQ(
      qel::v0::RunOneSampleT(&t, x, 0.95, qel::kIntervalTwoSided, qel::kAlternativeNotEqual, 0.0),
      0);
  EXPECT_TRUE(std::isnan(t.mean) && std::isnan(t.lowerLimit) && std::isnan(t.upperLimit) &&
              std::isnan(t.statistic) && std::isnan(t.pValue));

  qel::v0::PairedT p;
  p.n = 4;
  EXPECT_EQ(
      qel::v0::RunPairedT(&p, y, x, 0.95, qel::kIntervalLowerBound, qel::kAlternativeGreater, 0.0),
      0);
  EXPECT_EQ(p.firstMean, 2.125);
  EXPECT_TRUE(std::isnan(p.meanDifference) && std::isnan(p.lowerLimit) && std::isnan(p.pValue));

  qel::v0::TwoSampleT w;
  w.firstN = w.secondN = 4;
  EXPECT_EQ(qel::v0::RunTwoSampleT(&w, y, x, true, 0.95, qel::kIntervalUpperBound,
                                   qel::kAlternativeLess, 0.0),
            0);
  EXPECT_TRUE(std::isnan(w.difference) && std::isnan(w.upperLimit) && std::isnan(w.pValue));

  for (double confidence : {0.0, 1.0, 1.5, -0.2, kNaN}) {
    qel::v0::OneSampleT c;
    c.n = 4;
    EXPECT_EQ(qel::v0::RunOneSampleT(&c, y, confidence, qel::kIntervalLowerBound),
              qel::qelFailBadEnumValue);
    EXPECT_TRUE(std::isnan(c.lowerLimit)) << confidence << " gave " << c.lowerLimit;
  }
}

}  // namespace
