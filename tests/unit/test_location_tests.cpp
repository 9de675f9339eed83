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
const double kAny = 9.87e65;  // a field the edge case does not check

const std::map<std::string, std::vector<double>>& samples() {
  static const std::map<std::string, std::vector<double>> table = [] {
    std::map<std::string, std::vector<double>> t;
    for (const auto& row : qeltest::loadReferenceData("location_samples.csv", 1))
      t[row.text[0]] = row.numbers;
    // Samples of the edge cases.
    t["none"] = {};
    t["one"] = {3.5};
    t["twos"] = {2.0, 2.0, 2.0, 2.0};
    t["ones"] = {1.0, 1.0, 1.0, 1.0};
    t["withNaN"] = {1.0, kNaN, 3.0, 4.0};
    t["plain"] = {1.0, 2.0, 2.5, 3.0};
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
// then the summary form on a fresh record holding the data form's inputs);
// intervalOnly takes the forms without alternative and hypothesised value.
Outcome run(const Case& c, bool summary, bool intervalOnly = false) {
  const double level = c.confidence, mu = c.hypothesised;
  const IntervalType type = c.type;
  const AlternativeHypothesis alt = c.alternative;
  const std::vector<double>& x = samples().at(c.first);
  const std::vector<double>* y = c.second == "-" ? nullptr : &samples().at(c.second);
  const auto n = static_cast<unsigned int>(x.size());
  Outcome o{};
  if (c.test == "t1") {
    qel::v0::OneSampleT r;
    r.n = n;
    o.code = intervalOnly ? qel::v0::RunOneSampleT(&r, x.data(), level, type)
                          : qel::v0::RunOneSampleT(&r, x.data(), level, type, alt, mu);
    if (summary) {
      qel::v0::OneSampleT s;
      s.n = n;
      s.mean = r.mean;
      s.standardDeviation = r.standardDeviation;
      o.code = intervalOnly ? qel::v0::RunOneSampleT(&s, level, type)
                            : qel::v0::RunOneSampleT(&s, level, type, alt, mu);
      r = s;
    }
    o = {o.code,       r.mean,       r.standardDeviation, r.standardError, n - 1.0,
         r.lowerLimit, r.upperLimit, r.statistic,         r.pValue};
  } else if (c.test == "z1") {
    qel::v0::OneSampleZ r;
    r.n = n;
    o.code = intervalOnly ? qel::v0::RunOneSampleZ(&r, x.data(), c.sigma, level, type)
                          : qel::v0::RunOneSampleZ(&r, x.data(), c.sigma, level, type, alt, mu);
    if (summary) {
      qel::v0::OneSampleZ s;
      s.n = n;
      s.mean = r.mean;
      o.code = intervalOnly ? qel::v0::RunOneSampleZ(&s, c.sigma, level, type)
                            : qel::v0::RunOneSampleZ(&s, c.sigma, level, type, alt, mu);
      EXPECT_TRUE(std::isnan(s.standardDeviation)) << "summary z wrote the deviation";
      s.standardDeviation = r.standardDeviation;
      r = s;
    }
    o = {o.code,       r.mean,       r.standardDeviation, r.standardError, kNaN,
         r.lowerLimit, r.upperLimit, r.statistic,         r.pValue};
  } else if (c.test == "paired") {
    qel::v0::PairedT r;
    r.n = n;
    o.code = intervalOnly ? qel::v0::RunPairedT(&r, x.data(), y->data(), level, type)
                          : qel::v0::RunPairedT(&r, x.data(), y->data(), level, type, alt, mu);
    if (summary) {
      qel::v0::PairedT s;
      s.n = n;
      s.meanDifference = r.meanDifference;
      s.standardDeviationOfDifferences = r.standardDeviationOfDifferences;
      o.code = intervalOnly ? qel::v0::RunPairedT(&s, level, type)
                            : qel::v0::RunPairedT(&s, level, type, alt, mu);
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
    o.code = intervalOnly
                 ? qel::v0::RunTwoSampleT(&r, x.data(), y->data(), pooled, level, type)
                 : qel::v0::RunTwoSampleT(&r, x.data(), y->data(), pooled, level, type, alt, mu);
    if (summary) {
      qel::v0::TwoSampleT s;
      s.firstN = r.firstN;
      s.secondN = r.secondN;
      s.firstMean = r.firstMean;
      s.secondMean = r.secondMean;
      s.firstStandardDeviation = r.firstStandardDeviation;
      s.secondStandardDeviation = r.secondStandardDeviation;
      o.code = intervalOnly ? qel::v0::RunTwoSampleT(&s, pooled, level, type)
                            : qel::v0::RunTwoSampleT(&s, pooled, level, type, alt, mu);
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

bool same(double a, double b) {
  return a == b || (std::isnan(a) && std::isnan(b));
}

// The summary forms give what the data forms give (same inputs, same
// arithmetic: identical, not merely close); the interval-only forms, data and
// summary, give the limits of the full forms (which depend on level and type
// alone) and leave the test fields NaN.
TEST(LocationTests, SummaryAndIntervalOnlyFormsAgreeWithTheDataForms) {
  for (const Case& c : cases()) {
    const Outcome a = run(c, false), b = run(c, true);
    EXPECT_EQ(a.code, b.code);
    for (auto pair :
         {std::make_pair(a.standardError, b.standardError), std::make_pair(a.lower, b.lower),
          std::make_pair(a.upper, b.upper), std::make_pair(a.statistic, b.statistic),
          std::make_pair(a.pValue, b.pValue), std::make_pair(a.df, b.df)})
      EXPECT_TRUE(same(pair.first, pair.second)) << "line " << c.line;
    for (bool summary : {false, true}) {
      const Outcome limits = run(c, summary, true);
      EXPECT_EQ(limits.code, 0) << "line " << c.line;
      EXPECT_TRUE(same(limits.lower, a.lower) && same(limits.upper, a.upper)) << "line " << c.line;
      EXPECT_TRUE(std::isnan(limits.statistic) && std::isnan(limits.pValue)) << "line " << c.line;
    }
  }
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

// Every row, data and summary form, with and without a test, under two
// interval types that do not exist.
TEST(LocationTests, BadIntervalTypeGives30002AndNaN) {
  for (Case c : cases()) {
    for (int bad : {2, -7}) {
      c.type = static_cast<IntervalType>(bad);
      for (int form = 0; form < 4; ++form) {
        const Outcome o = run(c, form & 1, form & 2);
        EXPECT_EQ(o.code, 30002) << "line " << c.line;
        EXPECT_TRUE(std::isnan(o.lower) && std::isnan(o.upper)) << "line " << c.line;
        EXPECT_TRUE(std::isnan(o.statistic) && std::isnan(o.pValue)) << "line " << c.line;
        EXPECT_TRUE(std::isfinite(o.estimate)) << "line " << c.line;
      }
    }
  }
}

// Empty, single, constant and NaN data: the limits that IEEE arithmetic and
// the definitions give (a zero standard error makes the statistic infinite,
// or NaN at the hypothesised value; no degrees of freedom, no interval).
TEST(LocationTests, EmptySingleConstantAndNaNData) {
  const double N = kNaN, A = kAny;
  const auto two = qel::kIntervalTwoSided, lower = qel::kIntervalLowerBound,
             upper = qel::kIntervalUpperBound;
  const auto ne = qel::kAlternativeNotEqual, less = qel::kAlternativeLess,
             greater = qel::kAlternativeGreater;
  // test, first, second, confidence, type, alternative, hypothesised, sigma,
  // {code, estimate, deviation, standard error, df, lower, upper, statistic, P}
  const std::vector<Case> edges = {
      {"t1", "none", "-", 0.95, two, ne, 0.0, N, {0, N, N, N, A, N, N, N, N}, __LINE__},
      {"t1", "one", "-", 0.95, two, ne, 0.0, N, {0, 3.5, 0, 0, A, N, N, A, A}, __LINE__},
      {"pooled", "one", "one", 0.95, two, ne, 0.0, N, {0, A, A, A, 0, N, N, A, A}, __LINE__},
      {"paired", "none", "none", 0.95, two, less, 0.0, N, {0, N, A, A, A, N, A, A, N}, __LINE__},
      {"t1", "twos", "-", 0.95, two, ne, 1.0, N, {0, 2, 0, 0, A, 2, 2, kInf, 0}, __LINE__},
      {"t1", "twos", "-", 0.95, two, ne, 2.0, N, {0, A, A, A, A, A, A, N, N}, __LINE__},
      {"z1", "ones", "-", 0.95, two, greater, 0.0, 0.0, {0, 1, A, A, A, A, A, kInf, 0}, __LINE__},
      // Two constant samples under Welch: 0/0 degrees of freedom.
      {"welch", "twos", "ones", 0.95, two, ne, 0.0, N, {0, A, A, A, N, N, A, kInf, A}, __LINE__},
      {"t1", "withNaN", "-", 0.95, two, ne, 0.0, N, {0, N, A, A, A, N, N, N, N}, __LINE__},
      {"paired",
       "plain",
       "withNaN",
       0.95,
       lower,
       greater,
       0,
       N,
       {0, N, A, A, A, N, A, A, N},
       __LINE__},
      {"pooled",
       "plain",
       "withNaN",
       0.95,
       upper,
       less,
       0,
       N,
       {0, N, A, A, A, A, N, A, N},
       __LINE__},
  };
  for (const Case& c : edges) {
    const Outcome o = run(c, false), &e = c.expected;
    EXPECT_EQ(o.code, e.code) << "line " << c.line;
    const double got[] = {o.estimate, o.deviation, o.standardError, o.df,
                          o.lower,    o.upper,     o.statistic,     o.pValue};
    const double want[] = {e.estimate, e.deviation, e.standardError, e.df,
                           e.lower,    e.upper,     e.statistic,     e.pValue};
    for (int i = 0; i < 8; ++i) {
      if (want[i] == kAny) continue;
      EXPECT_TRUE(same(got[i], want[i])) << "field " << i << ": got " << got[i] << ", want "
                                         << want[i] << " (line " << c.line << ")";
    }
  }
}

TEST(LocationTests, BadConfidenceGivesNaNLimits) {
  const double* y = samples().at("plain").data();
  for (double confidence : {0.0, 1.0, 1.5, -0.2, kNaN}) {
    qel::v0::OneSampleT c;
    c.n = 4;
    EXPECT_EQ(qel::v0::RunOneSampleT(&c, y, confidence, qel::kIntervalLowerBound),
              qel::qelFailBadEnumValue);
    EXPECT_TRUE(std::isnan(c.lowerLimit)) << confidence << " gave " << c.lowerLimit;
  }
}

}  // namespace
