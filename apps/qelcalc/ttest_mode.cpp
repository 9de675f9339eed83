// ttest mode: the location tests of libqel on one column (one-sample t, or z
// with a known sigma), two paired columns or two independent columns, with
// the record's fields written one "name value" per line.
#include "ttest_mode.h"

#include <qel/location_tests.h>

#include <fstream>
#include <iostream>
#include <limits>
#include <sstream>
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

enum class Kind { OneSampleT, OneSampleZ, PairedT, TwoSampleT };

// Runs one location test and writes its record, one "name value" a line.
int runLocationTest(Kind kind, const std::vector<double>& x, const std::vector<double>& y,
                    bool pooled, const Arguments& args, std::ostream& out);

// The fields of a line of a CSV file (commas) or of a whitespace table.
std::vector<std::string> fieldsOf(const std::string& text) {
  std::vector<std::string> fields;
  if (text.find(',') != std::string::npos) {
    std::stringstream s(text);
    std::string f;
    while (std::getline(s, f, ',')) fields.push_back(f);
  } else {
    std::stringstream s(text);
    std::string f;
    while (s >> f) fields.push_back(f);
  }
  for (auto& f : fields) {
    const auto a = f.find_first_not_of(" \t\r\"");
    const auto b = f.find_last_not_of(" \t\r\"");
    f = a == std::string::npos ? "" : f.substr(a, b - a + 1);
  }
  return fields;
}

// Column `column` (from 1) of a table; a first line that is not numeric
// there is a header, and empty cells are skipped (columns may differ in
// length).
std::vector<double> readTableColumn(const std::string& path, int column) {
  std::ifstream file;
  std::istream* in = &std::cin;
  if (path != "-") {
    file.open(path);
    if (!file) throw UsageError("cannot read file '" + path + "'");
    in = &file;
  }
  std::vector<double> values;
  std::string text;
  int lineNumber = 0;
  bool first = true;
  while (std::getline(*in, text)) {
    ++lineNumber;
    const auto fields = fieldsOf(text);
    if (fields.empty()) continue;
    const bool wasFirst = first;
    first = false;
    if (static_cast<int>(fields.size()) < column || fields[column - 1].empty()) continue;
    try {
      values.push_back(parseNumber(fields[column - 1], "line " + std::to_string(lineNumber)));
    } catch (const UsageError&) {
      if (!wasFirst) throw;
    }
  }
  if (values.empty()) {
    throw UsageError("no numbers in column " + std::to_string(column) + " of '" + path + "'");
  }
  if (values.size() > std::numeric_limits<unsigned int>::max()) {
    throw UsageError("too many numbers");
  }
  return values;
}

int columnOption(const Arguments& args, const std::string& name, int fallback) {
  const double c = numberOption(args, name, fallback);
  if (!(c >= 1 && c <= 1e6) || c != static_cast<int>(c)) {
    throw UsageError("--" + name + " must be a column number from 1");
  }
  return static_cast<int>(c);
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
  const double confidence = numberOption(args, "confidence", 0.95);
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
  if (kind == Kind::OneSampleZ) {
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

}  // namespace

void printTestUsage(std::ostream& out) {
  out << "  qelcalc test one-sample-t|one-sample-z|paired-t|two-sample-t FILE|-\n"
         "                [--column C] [--column2 C2] [--mu M] [--sigma S] [--pooled]\n"
         "                [--alternative less|greater|two-sided] [--confidence 0.95]\n"
         "                [--interval two-sided|lower|upper]\n"
         "    The same tests on columns of a CSV or whitespace table (a header line is\n"
         "    skipped); the second sample is column C2 (default 2).\n";
}

int runTestMode(int argc, char** argv, std::ostream& out) {
  const Arguments args = parseArguments(argc, argv, 2, {"pooled"});
  if (args.positional.size() != 2) throw UsageError("test takes a test name and a data file");
  const std::string& name = args.positional[0];
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
    throw UsageError("unknown test '" + name + "'");
  }
  for (const auto& option : args.options) {
    const std::string& o = option.first;
    if (o != "column" && o != "column2" && o != "mu" && o != "sigma" && o != "alternative" &&
        o != "confidence" && o != "interval")
      throw UsageError("test has no option --" + o);
  }
  const bool twoColumns = kind == Kind::PairedT || kind == Kind::TwoSampleT;
  const bool pooled = !args.flags.empty();
  if (pooled && kind != Kind::TwoSampleT) throw UsageError("--pooled goes with two-sample-t");
  if (kind == Kind::OneSampleZ && !args.options.count("sigma")) {
    throw UsageError("one-sample-z needs --sigma");
  }
  if (kind != Kind::OneSampleZ && args.options.count("sigma")) {
    throw UsageError("--sigma goes with one-sample-z");
  }
  if (!twoColumns && args.options.count("column2")) {
    throw UsageError("--column2 goes with paired-t and two-sample-t");
  }
  if (twoColumns && args.positional[1] == "-") {
    throw UsageError("two columns are read from a file, not from standard input");
  }
  const std::vector<double> x =
      readTableColumn(args.positional[1], columnOption(args, "column", 1));
  std::vector<double> y;
  if (twoColumns) y = readTableColumn(args.positional[1], columnOption(args, "column2", 2));
  return runLocationTest(kind, x, y, pooled, args, out);
}

}  // namespace qelcalc
