// ttest mode: the location tests of libqel on one column (one-sample t, or z
// with a known sigma), two paired columns or two independent columns, with
// the record's fields written one "name value" per line.
#include "ttest_mode.h"

#include <qel/location_tests.h>

#include <limits>
#include <string>
#include <vector>

#include "cli.h"

namespace qelcalc {

namespace {

qel::AlternativeHypothesis alternativeOf(const Arguments& args) {
  const auto it = args.options.find("alternative");
  if (it == args.options.end() || it->second == "two-sided") return qel::kAlternativeNotEqual;
  if (it->second == "less") return qel::kAlternativeLess;
  if (it->second == "greater") return qel::kAlternativeGreater;
  throw UsageError("--alternative must be less, greater or two-sided");
}

// The interval that goes with the alternative unless --interval says
// otherwise: a bound below for "greater", a bound above for "less".
qel::IntervalType intervalOf(const Arguments& args, qel::AlternativeHypothesis alternative) {
  const auto it = args.options.find("interval");
  if (it == args.options.end()) {
    if (alternative == qel::kAlternativeGreater) return qel::kIntervalLowerBound;
    if (alternative == qel::kAlternativeLess) return qel::kIntervalUpperBound;
    return qel::kIntervalTwoSided;
  }
  if (it->second == "two-sided") return qel::kIntervalTwoSided;
  if (it->second == "lower") return qel::kIntervalLowerBound;
  if (it->second == "upper") return qel::kIntervalUpperBound;
  throw UsageError("--interval must be two-sided, lower or upper");
}

double numberOption(const Arguments& args, const std::string& name, double fallback) {
  const auto it = args.options.find(name);
  return it == args.options.end() ? fallback : parseNumber(it->second, "--" + name);
}

// A column with at least one number, and no more than the library counts.
std::vector<double> readColumn(const std::string& path) {
  std::vector<double> x = readNumbers(path);
  if (x.empty()) throw UsageError("no numbers in '" + path + "'");
  if (x.size() > std::numeric_limits<unsigned int>::max()) throw UsageError("too many numbers");
  return x;
}

void line(std::ostream& out, const char* name, double value) {
  out << name << " " << formatNumber(value) << "\n";
}

void checkCode(int code) {
  if (code != qel::qelOk)
    throw UsageError("the test failed with message code " + std::to_string(code));
}

}  // namespace

void printTTestUsage(std::ostream& out) {
  out << "  qelcalc ttest FILE|- [--mu M] [--sigma S] [--paired FILE2 | --two-sample FILE2 "
         "[--pooled]]\n"
         "                [--alternative less|greater|two-sided] [--confidence 0.95]\n"
         "                [--interval two-sided|lower|upper]\n"
         "    One-sample t (z with --sigma), paired t or two-sample t (Welch unless --pooled)\n"
         "    on one number a line; writes the record's fields, one \"name value\" per line.\n";
}

int runTTestMode(int argc, char** argv, std::ostream& out) {
  const Arguments args = parseArguments(argc, argv, 2, {"pooled"});
  if (args.positional.size() != 1) throw UsageError("ttest takes one data file (or -)");
  for (const auto& option : args.options) {
    const std::string& name = option.first;
    if (name != "mu" && name != "sigma" && name != "paired" && name != "two-sample" &&
        name != "alternative" && name != "confidence" && name != "interval")
      throw UsageError("ttest has no option --" + name);
  }
  const bool paired = args.options.count("paired") != 0;
  const bool twoSample = args.options.count("two-sample") != 0;
  const bool pooled = !args.flags.empty();
  const bool z = args.options.count("sigma") != 0;
  if (paired && twoSample) throw UsageError("--paired and --two-sample exclude each other");
  if (pooled && !twoSample) throw UsageError("--pooled needs --two-sample");
  if (z && (paired || twoSample)) throw UsageError("--sigma is for one sample only");

  const qel::AlternativeHypothesis alternative = alternativeOf(args);
  const qel::IntervalType type = intervalOf(args, alternative);
  const double confidence = numberOption(args, "confidence", 0.95);
  const double mu = numberOption(args, "mu", 0.0);
  const std::vector<double> x = readColumn(args.positional[0]);
  const auto n = static_cast<unsigned int>(x.size());

  if (paired || twoSample) {
    const std::vector<double> y = readColumn(args.options.at(paired ? "paired" : "two-sample"));
    if (paired) {
      if (y.size() != x.size()) throw UsageError("paired columns differ in length");
      qel::v0::PairedT r;
      r.n = n;
      checkCode(qel::v0::RunPairedT(&r, x.data(), y.data(), confidence, type, alternative, mu));
      out << "n " << r.n << "\n";
      line(out, "first_mean", r.firstMean);
      line(out, "second_mean", r.secondMean);
      line(out, "first_stddev", r.firstStandardDeviation);
      line(out, "second_stddev", r.secondStandardDeviation);
      line(out, "mean_difference", r.meanDifference);
      line(out, "stddev_difference", r.standardDeviationOfDifferences);
      line(out, "stderr_difference", r.standardErrorOfDifferences);
      line(out, "lower", r.lowerLimit);
      line(out, "upper", r.upperLimit);
      line(out, "t", r.statistic);
      line(out, "p", r.pValue);
      return 0;
    }
    qel::v0::TwoSampleT r;
    r.firstN = n;
    r.secondN = static_cast<unsigned int>(y.size());
    checkCode(
        qel::v0::RunTwoSampleT(&r, x.data(), y.data(), pooled, confidence, type, alternative, mu));
    out << "first_n " << r.firstN << "\nsecond_n " << r.secondN << "\n";
    line(out, "first_mean", r.firstMean);
    line(out, "second_mean", r.secondMean);
    line(out, "first_stddev", r.firstStandardDeviation);
    line(out, "second_stddev", r.secondStandardDeviation);
    line(out, "difference", r.difference);
    if (pooled) line(out, "pooled_stddev", r.pooledStandardDeviation);
    line(out, "df", r.degreesOfFreedom);
    line(out, "lower", r.lowerLimit);
    line(out, "upper", r.upperLimit);
    line(out, "t", r.statistic);
    line(out, "p", r.pValue);
    return 0;
  }
  if (z) {
    qel::v0::OneSampleZ r;
    r.n = n;
    const double sigma = numberOption(args, "sigma", 1.0);
    checkCode(qel::v0::RunOneSampleZ(&r, x.data(), sigma, confidence, type, alternative, mu));
    out << "n " << r.n << "\n";
    line(out, "mean", r.mean);
    line(out, "stddev", r.standardDeviation);
    line(out, "stderr", r.standardError);
    line(out, "lower", r.lowerLimit);
    line(out, "upper", r.upperLimit);
    line(out, "z", r.statistic);
    line(out, "p", r.pValue);
    return 0;
  }
  qel::v0::OneSampleT r;
  r.n = n;
  checkCode(qel::v0::RunOneSampleT(&r, x.data(), confidence, type, alternative, mu));
  out << "n " << r.n << "\n";
  line(out, "mean", r.mean);
  line(out, "stddev", r.standardDeviation);
  line(out, "stderr", r.standardError);
  line(out, "lower", r.lowerLimit);
  line(out, "upper", r.upperLimit);
  line(out, "t", r.statistic);
  line(out, "p", r.pValue);
  return 0;
}

}  // namespace qelcalc
