// power mode: the power and sample-size commands of libqel's internal
// interface. Two of the lists --n, --effect and --power are given; each
// combination gives one row "n effect power target" (two rows for a
// two-sided effect search of a variance or rate, or of a proportion whose
// null is not 0.5), in the command's loop order, NaN where nothing could be
// computed. The target column is the power asked for when n is solved.
#include "power_mode.h"

#include <qel/basic_types.h>

#include <cmath>
#include <limits>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

#include "basic_statistics/Power.h"
#include "basic_statistics/PowerTOST.h"
#include "cli.h"
#include "domain.h"
#include "power_factorial_mode.h"
#include "test_input.h"
#include "utilities/LYNBasicTypes.h"

namespace qelcalc {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

double shown(double x) {
  return qel::mIsNumericMissing(x) ? kNaN : x;
}

std::vector<double> numberList(const Arguments& args, const std::string& name) {
  std::vector<double> values;
  std::stringstream text(args.options.at(name));
  std::string item;
  while (std::getline(text, item, ',')) values.push_back(parseNumber(item, "--" + name));
  if (values.empty()) throw UsageError("--" + name + " needs a comma list of numbers");
  return values;
}

std::vector<int> sizeList(const Arguments& args) {
  std::vector<int> sizes;
  for (double v : numberList(args, "n")) {
    if (!(v >= 1.0 && v <= 2147483647.0) || v != std::floor(v))
      throw UsageError("--n takes whole numbers from 1");
    sizes.push_back(static_cast<int>(v));
  }
  return sizes;
}

// Which options each design reads, beyond the lists and --alpha,
// --alternative and --extents.
bool allowed(const std::string& design, const std::string& name) {
  static const std::vector<std::string> common = {"n", "effect", "power", "alpha", "alternative"};
  for (const auto& c : common)
    if (name == c) return true;
  if (design == "t" || design == "z") return name == "sigma";
  if (design == "paired") return name == "sigma";
  if (design == "prop") return name == "null";
  if (design == "variance") return name == "method" || name == "kurtosis";
  if (design == "poisson") return name == "rate" || name == "length";
  if (design == "welch") return name == "sd1" || name == "sd2";
  if (design == "tost") return name == "sigma" || name == "lower" || name == "upper";
  return false;
}

struct Request {
  std::string design;
  bool hasN, hasEffect, hasPower, twoSample, ratioOfSigmas, extents;
  bool ratio, paired, oneSample;
  double level;
  qel::EAlternative alternative;
};

void writeRow(std::ostream& out, int n, double effect, double power, double target) {
  out << (n < 0 ? formatNumber(kNaN) : std::to_string(n)) << ' ' << formatNumber(shown(effect))
      << ' ' << formatNumber(shown(power)) << ' ' << formatNumber(shown(target)) << '\n';
}

// Lists, flags and the common parameters of a command.
void setUp(qel::CmCmndPower& c, const Request& r, const Arguments& args) {
  c.mSetLevel(r.level);
  c.mSetAlternative(r.alternative);
  c.mSetTwoSample(r.twoSample);
  if (r.hasN) c.mSetSampleSizes(sizeList(args));
  if (r.hasEffect) c.mSetEffects(numberList(args, "effect"));
  if (r.hasPower) c.mSetPowers(numberList(args, "power"));
  if (!c.mGeneralErrorChecking()) throw UsageError("every power must be above --alpha");
}

void writeResults(const qel::CmCmndPower& c, bool solvedN, std::ostream& out) {
  const auto& n = c.mGetResultSampleSizes();
  for (std::size_t i = 0; i < n.size(); ++i) {
    writeRow(out, n[i], c.mGetResultEffects()[i], c.mGetResultPowers()[i],
             solvedN ? c.mGetTargetPowers()[i] : qel::mGetMissingValueCode());
  }
}

void writeExtents(double lo, double hi, std::ostream& out) {
  out << "extents " << formatNumber(shown(lo)) << ' ' << formatNumber(shown(hi)) << '\n';
}

template <class Command>
void finish(Command& c, const Request& r, std::ostream& out) {
  c.mComputeAndStore();
  writeResults(c, !r.hasN, out);
  if (r.extents) {
    double lo = 0.0, hi = 0.0;
    c.mGetSuggestedXMinXMax(c.mGetResultEffects(), &lo, &hi);
    writeExtents(lo, hi, out);
  }
}

void checkEffects(qel::CmCmndPower& c, double base, double low, double high) {
  if (!c.mIsEffectLegal(base, low, high)) throw UsageError("an effect is out of range");
}

void runT(const Request& r, const Arguments& args, std::ostream& out) {
  qel::CmCmndPowerTAndZ c;
  setUp(c, r, args);
  c.mSetZTest(r.design == "z");
  c.mSetPair(r.design == "paired");
  const double sigma = domainOption(args, "sigma", 1.0, Domain::kPositive);
  c.mSetSigma(sigma);
  finish(c, r, out);
}

void runProportion(const Request& r, const Arguments& args, std::ostream& out) {
  qel::CmCmndPowerProportion c;
  setUp(c, r, args);
  const double null = domainOption(args, "null", 0.5, Domain::kLevel);
  c.mSetNull(null);
  checkEffects(c, null, 0.0, 1.0);
  finish(c, r, out);
}

void runVariance(const Request& r, const Arguments& args, std::ostream& out) {
  qel::CmCmndVariance c;
  setUp(c, r, args);
  const auto method = args.options.count("method") ? args.options.at("method") : "levene";
  if (method == "chisq") {
    c.mSetTestMethod(qel::kVarianceChiSquareOrF);
  } else if (method == "bonett") {
    c.mSetTestMethod(qel::kVarianceBonett);
  } else if (method == "levene") {
    c.mSetTestMethod(qel::kVarianceLevene);
  } else {
    throw UsageError("--method is chisq, bonett or levene");
  }
  c.mSetKurtosis(numberOption(args, "kurtosis", 0.0));
  c.mSetRatioOfSigmas(r.ratioOfSigmas);
  checkEffects(c, 0.0, 0.0, qel::mGetMissingValueCode());
  finish(c, r, out);
}

void runPoisson(const Request& r, const Arguments& args, std::ostream& out) {
  qel::CmCmndPowerPoisson c;
  setUp(c, r, args);
  const double rate = domainOption(args, "rate", 1.0, Domain::kPositive);
  c.mSetRate(rate);
  if (args.options.count("length")) {
    const std::vector<double> lengths = numberList(args, "length");
    for (double l : lengths)
      if (!(l > 0.0) || !std::isfinite(l)) throw UsageError("--length must be positive");
    if (lengths.size() > 2) throw UsageError("--length takes one or two lengths");
    c.mSetLengths(lengths);
  }
  checkEffects(c, rate, 0.0, qel::mGetMissingValueCode());
  finish(c, r, out);
}

// Welch's test has no command: the same rule of what is solved, with n in
// each sample.
void runWelch(const Request& r, const Arguments& args, std::ostream& out) {
  if (r.extents) throw UsageError("--extents is not available for welch");
  const double s1 = domainOption(args, "sd1", 1.0, Domain::kPositive);
  const double s2 = domainOption(args, "sd2", 1.0, Domain::kPositive);
  const std::vector<int> ns = r.hasN ? sizeList(args) : std::vector<int>{};
  const std::vector<double> es = r.hasEffect ? numberList(args, "effect") : std::vector<double>{};
  const std::vector<double> ps = r.hasPower ? numberList(args, "power") : std::vector<double>{};
  for (double p : ps)
    if (!(p > r.level)) throw UsageError("every power must be above --alpha");
  const double missing = qel::mGetMissingValueCode();
  const auto a = r.alternative;
  if (!r.hasEffect) {
    for (int n : ns)
      for (double p : ps)
        writeRow(out, n, qel::mCalcEffectForWelchTTestPower(a, p, n, n, s1, s2, r.level), p,
                 missing);
  } else if (!r.hasPower) {
    for (double e : es)
      for (int n : ns)
        writeRow(out, n, e, qel::mCalcWelchTTestPower(a, n, n, e, s1, s2, r.level), missing);
  } else {
    for (double e : es)
      for (double p : ps) {
        const int n = qel::mCalcSampleSizeForWelchTTestPower(a, p, e, s1, s2, r.level);
        const double q = n > 0 ? qel::mCalcWelchTTestPower(a, n, n, e, s1, s2, r.level) : missing;
        writeRow(out, n, e, q, p);
      }
  }
}

// Equivalence by two one-sided tests: the interval (--lower, --upper) holds
// differences of means, or ratios of means with --ratio (worked in logs).
// Limits that are missing, unordered or (as ratios) not positive give NaN
// rows, as the command does.
void runTOST(const Request& r, const Arguments& args, std::ostream& out) {
  if (!args.options.count("lower") || !args.options.count("upper"))
    throw UsageError("power tost needs --lower and --upper");
  qel::CmCmndPowerTOST c;
  setUp(c, r, args);
  const double sigma = domainOption(args, "sigma", 1.0, Domain::kPositive);
  c.mSetSigma(sigma);
  c.mSetRatio(r.ratio);
  c.mSetLimits(numberOption(args, "lower", 0.0), numberOption(args, "upper", 0.0));
  c.mSetTestType(r.paired      ? qel::kTOSTPaired
                 : r.oneSample ? qel::kTOSTOneSample
                               : qel::kTOSTTwoSample);
  finish(c, r, out);
}

}  // namespace

void printPowerUsage(std::ostream& out) {
  out << "  qelcalc power t|z|paired|prop|variance|poisson|welch  two of --n L --effect L "
         "--power L\n"
         "                [--alpha 0.05] [--alternative less|greater|two-sided] [--two-sample]\n"
         "                [--sigma S] (t, z, paired)  [--null P] (prop)  [--rate R] "
         "[--length L1[,L2]] (poisson)\n"
         "                [--method chisq|bonett|levene] [--kurtosis K] [--ratio-sd] "
         "(variance)\n"
         "                [--sd1 S1] [--sd2 S2] (welch, n in each sample)  [--extents]\n"
         "  qelcalc power tost --lower L --upper U [--ratio] [--paired|--one-sample] [--sigma S]\n"
         "                two of --n L --effect L --power L  [--alpha] [--alternative]\n"
         "    Equivalence by two one-sided tests on the interval (L, U) of differences (of\n"
         "    ratios with --ratio); a solved difference comes with its mirror in the centre,\n"
         "    and a target above the peak power gives one NaN row; n 999999: not reached.\n"
         "    Lists are comma-separated. Solves the missing one of sample size, effect and\n"
         "    power for every pair; writes \"n effect power target\" rows (NaN where none).\n"
         "    Effects: a difference of means (t, z, paired, welch), of proportions from the\n"
         "    null, of rates from --rate, or a ratio of variances (of sds with --ratio-sd);\n"
         "    solved effects of prop and poisson are written as proportions and rates.\n";
  printFactorialPowerUsage(out);
}

int runPowerMode(int argc, char** argv, std::ostream& out) {
  if (argc > 2 && isFactorialPowerDesign(argv[2])) {
    std::ostringstream rows;
    runFactorialPowerMode(argc, argv, rows);
    out << rows.str();
    return 0;
  }
  const Arguments args = parseArguments(
      argc, argv, 2, {"two-sample", "ratio-sd", "extents", "ratio", "paired", "one-sample"});
  if (args.positional.size() != 1) throw UsageError("power takes one design (see --help)");
  Request r;
  r.design = args.positional[0];
  const std::vector<std::string> designs = {"t",        "z",       "paired", "prop",
                                            "variance", "poisson", "welch",  "tost"};
  bool known = false;
  for (const auto& d : designs) known = known || d == r.design;
  if (!known) throw UsageError("unknown power design '" + r.design + "'");
  for (const auto& option : args.options)
    if (!allowed(r.design, option.first))
      throw UsageError("power " + r.design + " has no option --" + option.first);
  auto hasFlag = [&](const std::string& f) {
    for (const auto& g : args.flags)
      if (g == f) return true;
    return false;
  };
  r.twoSample = hasFlag("two-sample");
  r.ratioOfSigmas = hasFlag("ratio-sd");
  r.extents = hasFlag("extents");
  r.ratio = hasFlag("ratio");
  r.paired = hasFlag("paired");
  r.oneSample = hasFlag("one-sample");
  if ((r.ratio || r.paired || r.oneSample) && r.design != "tost")
    throw UsageError("--ratio, --paired and --one-sample are for tost");
  if (r.paired && r.oneSample) throw UsageError("give one of --paired and --one-sample");
  if (r.ratioOfSigmas && r.design != "variance") throw UsageError("--ratio-sd is for variance");
  if (r.twoSample && (r.design == "paired" || r.design == "welch"))
    throw UsageError("--two-sample does not apply to " + r.design);
  r.hasN = args.options.count("n") != 0;
  r.hasEffect = args.options.count("effect") != 0;
  r.hasPower = args.options.count("power") != 0;
  if ((r.hasN ? 1 : 0) + (r.hasEffect ? 1 : 0) + (r.hasPower ? 1 : 0) != 2)
    throw UsageError("give exactly two of --n, --effect and --power");
  r.level = domainOption(args, "alpha", 0.05, Domain::kLevel);
  r.alternative = alternativeOf(args);

  // Rows are written only when the whole request has passed its checks.
  std::ostringstream rows;
  rows << "n effect power target\n";
  if (r.design == "prop") {
    runProportion(r, args, rows);
  } else if (r.design == "variance") {
    runVariance(r, args, rows);
  } else if (r.design == "poisson") {
    runPoisson(r, args, rows);
  } else if (r.design == "welch") {
    runWelch(r, args, rows);
  } else if (r.design == "tost") {
    if (r.twoSample) throw UsageError("tost is two-sample unless --paired or --one-sample");
    runTOST(r, args, rows);
  } else {
    runT(r, args, rows);
  }
  out << rows.str();
  return 0;
}

}  // namespace qelcalc
