// The proportion and variance tests of `qelcalc test`. Counts come from
// options or from a 0/1 column; samples from columns of a table. Every
// field of the library's record is written, one "name value" a line.
#include "proportion_variance_mode.h"

#include <qel/proportion_tests.h>
#include <qel/variance_tests.h>

#include <cmath>
#include <limits>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "domain.h"
#include "test_input.h"

namespace qelcalc {

namespace {

void allowOnly(const Arguments& args, const std::string& name, const std::set<std::string>& options,
               const std::set<std::string>& flags) {
  for (const auto& option : args.options) {
    if (!options.count(option.first))
      throw UsageError("test " + name + " has no option --" + option.first);
  }
  for (const auto& flag : args.flags) {
    if (!flags.count(flag)) throw UsageError("--" + flag + " does not go with " + name);
  }
}

double confidenceOf(const Arguments& args) {
  return domainOption(args, "confidence", 0.95, Domain::kLevel);
}

// A whole count in [0, 2^32).
unsigned int countOf(const std::string& text, const std::string& what) {
  const double v = parseNumber(text, what);
  if (!(v >= 0.0 && v <= std::numeric_limits<unsigned int>::max()) || v != std::floor(v))
    throw UsageError(what + " must be a whole number from 0 to 4294967295");
  return static_cast<unsigned int>(v);
}

// "a,b" as two texts.
std::vector<std::string> pairOf(const Arguments& args, const std::string& name) {
  std::vector<std::string> items;
  std::stringstream s(args.options.at(name));
  std::string item;
  while (std::getline(s, item, ',')) items.push_back(item);
  if (items.size() != 2) throw UsageError("--" + name + " takes two values: a,b");
  return items;
}

std::vector<double> columnOf(const Arguments& args, const std::string& option, int fallback) {
  if (args.positional.size() != 2) {
    throw UsageError("test " + args.positional[0] + " takes one data file (or -)");
  }
  const std::string& path = args.positional[1];
  std::vector<double> x =
      tableColumn(readTableRows(path), columnOption(args, option, fallback), path);
  if (x.size() > std::numeric_limits<unsigned int>::max()) throw UsageError("too many numbers");
  return x;
}

void writeOneProportion(std::ostream& out, const qel::v0::OneProportion& r) {
  out << "events " << r.events << "\ntrials " << r.trials << "\n";
  writeField(out, "proportion", r.proportion);
  writeField(out, "lower", r.lowerLimit);
  writeField(out, "upper", r.upperLimit);
  writeField(out, "z", r.statistic);
  writeField(out, "p", r.pValue);
}

int runProportion(const Arguments& args, std::ostream& out) {
  allowOnly(args, "proportion",
            {"events", "trials", "column", "method", "p0", "alternative", "confidence", "interval"},
            {});
  const qel::AlternativeHypothesis alternative = alternativeOf(args);
  const qel::IntervalType type = intervalOf(args, alternative);
  const double confidence = confidenceOf(args);
  const double p0 = domainOption(args, "p0", 0.5, Domain::kProbability);
  if (!(p0 > 0.0 && p0 < 1.0)) throw UsageError("--p0 must lie strictly between 0 and 1");
  const std::string method = args.options.count("method") ? args.options.at("method") : "exact";

  qel::v0::OneProportion r;
  std::vector<int> events;
  if (args.options.count("events") || args.options.count("trials")) {
    if (args.positional.size() != 1 || args.options.count("column"))
      throw UsageError("give --events and --trials, or a 0/1 column, not both");
    if (!args.options.count("events") || !args.options.count("trials"))
      throw UsageError("--events and --trials go together");
    r.events = countOf(args.options.at("events"), "--events");
    r.trials = countOf(args.options.at("trials"), "--trials");
    if (r.events > r.trials) throw UsageError("--events exceeds --trials");
  } else {
    for (double v : columnOf(args, "column", 1)) {
      if (v != 0.0 && v != 1.0) throw UsageError("a proportion column holds only 0 and 1");
      events.push_back(static_cast<int>(v));
      r.events += static_cast<unsigned int>(v);
    }
    r.trials = static_cast<unsigned int>(events.size());
  }
  int code;
  if (method == "lyn-normal" || method == "lyn-exact") {
    const bool normal = method == "lyn-normal";
    code = events.empty()
               ? qel::v0::RunLynOneProportion(&r, normal, confidence, type, alternative, p0)
               : qel::v0::RunLynOneProportion(&r, events.data(), normal, confidence, type,
                                              alternative, p0);
  } else if (method == "exact") {
    code = qel::v0::RunOneProportionClopperPearson(&r, confidence, type);
    if (code == 0) code = qel::v0::RunOneProportionClopperPearson(&r, alternative, p0);
  } else if (method == "mid-p") {
    code = qel::v0::RunOneProportionMidP(&r, confidence, type);
    if (code == 0) code = qel::v0::RunOneProportionMidP(&r, alternative, p0);
  } else if (method == "wilson" || method == "wilson-cc" || method == "wald" ||
             method == "wald-cc") {
    const bool corrected = method == "wilson-cc" || method == "wald-cc";
    code = method.compare(0, 6, "wilson") == 0
               ? qel::v0::RunOneProportionWilson(&r, corrected, confidence, type)
               : qel::v0::RunOneProportionWaldCI(&r, corrected, confidence, type);
    if (code == 0) code = qel::v0::RunOneProportionWilson(&r, corrected, alternative, p0);
  } else if (method == "agresti-coull") {
    code = qel::v0::RunOneProportionAgrestiCoullCI(&r, false, confidence, type);
  } else {
    throw UsageError("unknown --method '" + method +
                     "' (exact, wilson, wilson-cc, wald, wald-cc, agresti-coull, mid-p, "
                     "lyn-normal, lyn-exact)");
  }
  checkCode(code);
  writeOneProportion(out, r);
  return 0;
}

int runTwoProportions(const Arguments& args, std::ostream& out) {
  allowOnly(args, "two-proportions",
            {"events", "trials", "delta", "alternative", "confidence", "interval"}, {"pooled"});
  if (args.positional.size() != 1) throw UsageError("two-proportions reads no file");
  if (!args.options.count("events") || !args.options.count("trials"))
    throw UsageError("two-proportions needs --events X1,X2 and --trials N1,N2");
  const auto x = pairOf(args, "events");
  const auto n = pairOf(args, "trials");
  qel::v0::TwoProportion r;
  r.firstEvents = countOf(x[0], "--events");
  r.secondEvents = countOf(x[1], "--events");
  r.firstTrials = countOf(n[0], "--trials");
  r.secondTrials = countOf(n[1], "--trials");
  if (r.firstEvents > r.firstTrials || r.secondEvents > r.secondTrials)
    throw UsageError("--events exceeds --trials");
  const qel::AlternativeHypothesis alternative = alternativeOf(args);
  const bool pooled = !args.flags.empty();
  checkCode(qel::v0::RunLynTwoProportion(&r, pooled, confidenceOf(args),
                                         intervalOf(args, alternative), alternative,
                                         numberOption(args, "delta", 0.0)));
  out << "first_events " << r.firstEvents << "\nsecond_events " << r.secondEvents
      << "\nfirst_trials " << r.firstTrials << "\nsecond_trials " << r.secondTrials << "\n";
  writeField(out, "first_proportion", r.firstProportion);
  writeField(out, "second_proportion", r.secondProportion);
  writeField(out, "difference", r.difference);
  writeField(out, "lower", r.lowerLimit);
  writeField(out, "upper", r.upperLimit);
  writeField(out, "z", r.statistic);
  writeField(out, "p", r.pValue);
  writeField(out, "exact_p", r.exactPValue);
  return 0;
}

int runVariance(const Arguments& args, std::ostream& out) {
  allowOnly(args, "variance", {"column", "variance0", "alternative", "confidence", "interval"}, {});
  const std::vector<double> x = columnOf(args, "column", 1);
  const qel::AlternativeHypothesis alternative = alternativeOf(args);
  const double variance0 = domainOption(args, "variance0", 1.0, Domain::kPositive);
  qel::v0::OneVariance r;
  r.n = static_cast<unsigned int>(x.size());
  checkCode(qel::v0::RunOneVariance(&r, x.data(), confidenceOf(args), intervalOf(args, alternative),
                                    alternative, variance0));
  out << "n " << r.n << "\n";
  writeField(out, "variance", r.variance);
  writeField(out, "chisq_lower", r.chiSquareLowerLimit);
  writeField(out, "chisq_upper", r.chiSquareUpperLimit);
  writeField(out, "bonett_lower", r.bonettLowerLimit);
  writeField(out, "bonett_upper", r.bonettUpperLimit);
  writeField(out, "chisq", r.chiSquareStatistic);
  writeField(out, "chisq_p", r.chiSquarePValue);
  writeField(out, "df", r.degreesOfFreedom);
  writeField(out, "bonett_p", r.bonettPValue);
  return 0;
}

void writeTwoVariance(std::ostream& out, const qel::v0::TwoVariance& r) {
  out << "first_n " << r.firstN << "\nsecond_n " << r.secondN << "\n";
  const std::pair<const char*, double> fields[] = {
      {"first_variance", r.firstVariance},
      {"second_variance", r.secondVariance},
      {"first_stddev_lower", r.firstStdDevLowerLimit},
      {"first_stddev_upper", r.firstStdDevUpperLimit},
      {"second_stddev_lower", r.secondStdDevLowerLimit},
      {"second_stddev_upper", r.secondStdDevUpperLimit},
      {"bonett_lower", r.bonettLowerLimit},
      {"bonett_upper", r.bonettUpperLimit},
      {"levene_lower", r.leveneLowerLimit},
      {"levene_upper", r.leveneUpperLimit},
      {"f_lower", r.fLowerLimit},
      {"f_upper", r.fUpperLimit},
      {"bonett_statistic", r.bonettStatistic},
      {"bonett_p", r.bonettPValue},
      {"levene_statistic", r.leveneStatistic},
      {"levene_p", r.levenePValue},
      {"levene_df", r.leveneDegreesOfFreedom},
      {"f", r.fStatistic},
      {"f_p", r.fPValue},
      {"f_df1", r.fNumeratorDegreesOfFreedom},
      {"f_df2", r.fDenominatorDegreesOfFreedom}};
  for (const auto& field : fields) writeField(out, field.first, field.second);
}

int runTwoVariances(const Arguments& args, std::ostream& out) {
  allowOnly(
      args, "two-variances",
      {"column", "column2", "variances", "n", "ratio", "alternative", "confidence", "interval"},
      {"levene"});
  const qel::AlternativeHypothesis alternative = alternativeOf(args);
  const qel::IntervalType type = intervalOf(args, alternative);
  const double confidence = confidenceOf(args);
  const double ratio = numberOption(args, "ratio", 1.0);
  if (!(ratio > 0.0 && std::isfinite(ratio))) throw UsageError("--ratio must be positive");
  qel::v0::TwoVariance r;
  if (args.options.count("variances") || args.options.count("n")) {
    if (!args.options.count("variances") || !args.options.count("n"))
      throw UsageError("--variances and --n go together");
    if (args.positional.size() != 1 || !args.flags.empty() || args.options.count("column"))
      throw UsageError("the summary form (--variances, --n) reads no file and has no --levene");
    const auto v = pairOf(args, "variances");
    const auto n = pairOf(args, "n");
    r.firstVariance = parseNumber(v[0], "--variances");
    r.secondVariance = parseNumber(v[1], "--variances");
    r.firstN = countOf(n[0], "--n");
    r.secondN = countOf(n[1], "--n");
    checkCode(qel::v0::RunTwoVariance(&r, confidence, type, alternative, ratio));
  } else {
    const std::vector<double> x = columnOf(args, "column", 1);
    const std::vector<double> y = columnOf(args, "column2", 2);
    r.firstN = static_cast<unsigned int>(x.size());
    r.secondN = static_cast<unsigned int>(y.size());
    checkCode(qel::v0::RunTwoVariance(&r, x.data(), y.data(), confidence, type, alternative, ratio,
                                      !args.flags.empty()));
  }
  writeTwoVariance(out, r);
  return 0;
}

}  // namespace

bool isProportionOrVarianceTest(const std::string& name) {
  return name == "proportion" || name == "two-proportions" || name == "variance" ||
         name == "two-variances";
}

int runProportionOrVarianceTest(const Arguments& args, std::ostream& out) {
  const std::string& name = args.positional[0];
  if (name == "proportion") return runProportion(args, out);
  if (name == "two-proportions") return runTwoProportions(args, out);
  if (name == "variance") return runVariance(args, out);
  return runTwoVariances(args, out);
}

void printProportionVarianceUsage(std::ostream& out) {
  out << "  qelcalc test proportion (--events X --trials N | FILE|- [--column C])\n"
         "                [--method exact|wilson|wilson-cc|wald|wald-cc|agresti-coull|mid-p|\n"
         "                          lyn-normal|lyn-exact] [--p0 0.5]\n"
         "  qelcalc test two-proportions --events X1,X2 --trials N1,N2 [--pooled] [--delta D]\n"
         "  qelcalc test variance FILE|- [--column C] [--variance0 V]\n"
         "  qelcalc test two-variances FILE|- [--column 1 --column2 2] [--levene] [--ratio R]\n"
         "  qelcalc test two-variances --variances V1,V2 --n N1,N2 [--ratio R]\n"
         "                [--alternative less|greater|two-sided] [--confidence 0.95]\n"
         "                [--interval two-sided|lower|upper]\n"
         "    One proportion (a 0/1 column or counts), the difference of two, one variance\n"
         "    (chi-square and Bonett) or the ratio of two standard deviations (F, and\n"
         "    Bonett or with --levene a Levene-type test; chi-square limits of each).\n";
}

}  // namespace qelcalc
