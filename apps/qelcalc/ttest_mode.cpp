// ttest mode: the location tests of libqel on one column (one-sample t, or z
// with a known sigma), two paired columns or two independent columns, with
// the record's fields written one "name value" per line.
#include "ttest_mode.h"

#include <qel/location_tests.h>

#include <iostream>
#include <limits>
#include <string>
#include <vector>

#include "cli.h"
#include "domain.h"
#include "proportion_variance_mode.h"
#include "rank_test_mode.h"
#include "test_input.h"

namespace qelcalc {

namespace {

// A column with at least one number, and no more than the library counts.
std::vector<double> readColumn(const std::string& path) {
  std::vector<double> x = readNumbers(path);
  if (x.empty()) throw UsageError("no numbers in '" + path + "'");
  if (x.size() > std::numeric_limits<unsigned int>::max()) throw UsageError("too many numbers");
  return x;
}

enum class Kind { OneSampleT, OneSampleZ, PairedT, TwoSampleT };

// Runs one location test and writes its record, one "name value" a line.
int runLocationTest(Kind kind, const std::vector<double>& x, const std::vector<double>& y,
                    bool pooled, const Arguments& args, std::ostream& out);

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

  const std::vector<double> x = readColumn(args.positional[0]);
  std::vector<double> y;
  if (paired || twoSample) y = readColumn(args.options.at(paired ? "paired" : "two-sample"));
  const Kind kind = paired      ? Kind::PairedT
                    : twoSample ? Kind::TwoSampleT
                    : z         ? Kind::OneSampleZ
                                : Kind::OneSampleT;
  return runLocationTest(kind, x, y, pooled, args, out);
}

namespace {

int runLocationTest(Kind kind, const std::vector<double>& x, const std::vector<double>& y,
                    bool pooled, const Arguments& args, std::ostream& out) {
  const qel::AlternativeHypothesis alternative = alternativeOf(args);
  const qel::IntervalType type = intervalOf(args, alternative);
  const double confidence = domainOption(args, "confidence", 0.95, Domain::kLevel);
  const double mu = numberOption(args, "mu", 0.0);
  const auto n = static_cast<unsigned int>(x.size());
  if (kind == Kind::PairedT || kind == Kind::TwoSampleT) {
    const bool paired = kind == Kind::PairedT;
    if (paired) {
      if (y.size() != x.size()) throw UsageError("paired columns differ in length");
      qel::v0::PairedT r;
      r.n = n;
      checkCode(qel::v0::RunPairedT(&r, x.data(), y.data(), confidence, type, alternative, mu));
      out << "n " << r.n << "\n";
      writeField(out, "first_mean", r.firstMean);
      writeField(out, "second_mean", r.secondMean);
      writeField(out, "first_stddev", r.firstStandardDeviation);
      writeField(out, "second_stddev", r.secondStandardDeviation);
      writeField(out, "mean_difference", r.meanDifference);
      writeField(out, "stddev_difference", r.standardDeviationOfDifferences);
      writeField(out, "stderr_difference", r.standardErrorOfDifferences);
      writeField(out, "lower", r.lowerLimit);
      writeField(out, "upper", r.upperLimit);
      writeField(out, "t", r.statistic);
      writeField(out, "p", r.pValue);
      return 0;
    }
    qel::v0::TwoSampleT r;
    r.firstN = n;
    r.secondN = static_cast<unsigned int>(y.size());
    checkCode(
        qel::v0::RunTwoSampleT(&r, x.data(), y.data(), pooled, confidence, type, alternative, mu));
    out << "first_n " << r.firstN << "\nsecond_n " << r.secondN << "\n";
    writeField(out, "first_mean", r.firstMean);
    writeField(out, "second_mean", r.secondMean);
    writeField(out, "first_stddev", r.firstStandardDeviation);
    writeField(out, "second_stddev", r.secondStandardDeviation);
    writeField(out, "difference", r.difference);
    if (pooled) writeField(out, "pooled_stddev", r.pooledStandardDeviation);
    writeField(out, "df", r.degreesOfFreedom);
    writeField(out, "lower", r.lowerLimit);
    writeField(out, "upper", r.upperLimit);
    writeField(out, "t", r.statistic);
    writeField(out, "p", r.pValue);
    return 0;
  }
  if (kind == Kind::OneSampleZ) {
    qel::v0::OneSampleZ r;
    r.n = n;
    const double sigma = domainOption(args, "sigma", 1.0, Domain::kPositive);
    checkCode(qel::v0::RunOneSampleZ(&r, x.data(), sigma, confidence, type, alternative, mu));
    out << "n " << r.n << "\n";
    writeField(out, "mean", r.mean);
    writeField(out, "stddev", r.standardDeviation);
    writeField(out, "stderr", r.standardError);
    writeField(out, "lower", r.lowerLimit);
    writeField(out, "upper", r.upperLimit);
    writeField(out, "z", r.statistic);
    writeField(out, "p", r.pValue);
    return 0;
  }
  qel::v0::OneSampleT r;
  r.n = n;
  checkCode(qel::v0::RunOneSampleT(&r, x.data(), confidence, type, alternative, mu));
  out << "n " << r.n << "\n";
  writeField(out, "mean", r.mean);
  writeField(out, "stddev", r.standardDeviation);
  writeField(out, "stderr", r.standardError);
  writeField(out, "lower", r.lowerLimit);
  writeField(out, "upper", r.upperLimit);
  writeField(out, "t", r.statistic);
  writeField(out, "p", r.pValue);
  return 0;
}

}  // namespace

void printTestUsage(std::ostream& out) {
  out << "  qelcalc test one-sample-t|one-sample-z|paired-t|two-sample-t FILE|-\n"
         "                [--column C] [--column2 C2] [--mu M] [--sigma S] [--pooled]\n"
         "                [--alternative less|greater|two-sided] [--confidence 0.95]\n"
         "                [--interval two-sided|lower|upper]\n"
         "    The same tests on columns of a CSV or whitespace table (a header line is\n"
         "    skipped); the second sample is column C2 (default 2). The distribution-free\n"
         "    tests below take the same table input.\n";
}

int runTestMode(int argc, char** argv, std::ostream& out) {
  const Arguments args =
      parseArguments(argc, argv, 2, {"pooled", "approximate", "levene", "normal"});
  if (args.positional.empty()) throw UsageError("test takes a test name and a data file");
  const std::string& name = args.positional[0];
  if (isRankTest(name)) return runRankTest(args, out);
  if (isProportionOrVarianceTest(name)) return runProportionOrVarianceTest(args, out);
  if (args.positional.size() != 2) throw UsageError("test takes a test name and a data file");
  Kind kind;
  if (name == "one-sample-t") {
    kind = Kind::OneSampleT;
  } else if (name == "one-sample-z") {
    kind = Kind::OneSampleZ;
  } else if (name == "paired-t") {
    kind = Kind::PairedT;
  } else if (name == "two-sample-t") {
    kind = Kind::TwoSampleT;
  } else {
    throw UsageError("unknown test '" + name + "' (see qelcalc --help)");
  }
  for (const auto& option : args.options) {
    const std::string& o = option.first;
    if (o != "column" && o != "column2" && o != "mu" && o != "sigma" && o != "alternative" &&
        o != "confidence" && o != "interval")
      throw UsageError("test " + name + " has no option --" + o);
  }
  const bool twoColumns = kind == Kind::PairedT || kind == Kind::TwoSampleT;
  bool pooled = false;
  for (const auto& flag : args.flags) {
    if (flag != "pooled" || kind != Kind::TwoSampleT) {
      throw UsageError("--" + flag + " does not go with " + name);
    }
    pooled = true;
  }
  if (kind == Kind::OneSampleZ && !args.options.count("sigma")) {
    throw UsageError("one-sample-z needs --sigma");
  }
  if (kind != Kind::OneSampleZ && args.options.count("sigma")) {
    throw UsageError("--sigma goes with one-sample-z");
  }
  if (!twoColumns && args.options.count("column2")) {
    throw UsageError("--column2 goes with paired-t and two-sample-t");
  }
  const std::string& path = args.positional[1];
  const std::vector<TableRow> rows = readTableRows(path);
  std::vector<double> x, y;
  if (kind == Kind::PairedT) {
    const std::size_t dropped = pairedColumns(rows, columnOption(args, "column", 1),
                                              columnOption(args, "column2", 2), path, &x, &y);
    if (dropped > 0) {
      std::cerr << "qelcalc: paired-t dropped " << dropped << " incomplete row"
                << (dropped == 1 ? "" : "s") << "\n";
    }
    return runLocationTest(kind, x, y, pooled, args, out);
  }
  x = tableColumn(rows, columnOption(args, "column", 1), path);
  if (twoColumns) y = tableColumn(rows, columnOption(args, "column2", 2), path);
  return runLocationTest(kind, x, y, pooled, args, out);
}

}  // namespace qelcalc
