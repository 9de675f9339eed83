// power factorial and power gff: two-level factorial (or Plackett-Burman)
// designs with replicates, center points, effect and power (three given,
// the fourth solved), and general full factorial designs with replicates,
// maximum difference of means and power (two given). Rows are
// "reps centerpoints effect power target runs" and "reps effect power
// target runs", NaN where nothing could be computed.
#include "power_factorial_mode.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <sstream>
#include <string>
#include <vector>

#include "basic_statistics/PowerFactorial.h"
#include "cli.h"
#include "domain.h"
#include "test_input.h"
#include "utilities/LYNBasicTypes.h"

namespace qelcalc {

namespace {

const double kNaN = std::numeric_limits<double>::quiet_NaN();

std::string shown(double x) {
  return formatNumber(qel::mIsNumericMissing(x) ? kNaN : x);
}

std::string shownCount(int n) {
  return n < 0 || n == 999999 ? (n == 999999 ? "999999" : "NaN") : std::to_string(n);
}

std::vector<double> numbers(const Arguments& args, const std::string& name) {
  std::vector<double> values;
  std::stringstream text(args.options.at(name));
  std::string item;
  while (std::getline(text, item, ',')) values.push_back(parseNumber(item, "--" + name));
  if (values.empty()) throw UsageError("--" + name + " needs a comma list of numbers");
  return values;
}

std::vector<int> counts(const Arguments& args, const std::string& name, int lowest) {
  std::vector<int> out;
  for (double v : numbers(args, name)) {
    if (!(v >= lowest && v <= 2147483647.0) || v != std::floor(v))
      throw UsageError("--" + name + " takes whole numbers from " + std::to_string(lowest));
    out.push_back(static_cast<int>(v));
  }
  return out;
}

int count(const Arguments& args, const std::string& name, int fallback, int lowest) {
  if (!args.options.count(name)) return fallback;
  const std::vector<int> v = counts(args, name, lowest);
  if (v.size() != 1) throw UsageError("--" + name + " takes one number");
  return v[0];
}

bool has(const Arguments& args, const std::string& flag) {
  return std::find(args.flags.begin(), args.flags.end(), flag) != args.flags.end();
}

void checkOptions(const Arguments& args, const std::vector<std::string>& known) {
  for (const auto& o : args.options)
    if (std::find(known.begin(), known.end(), o.first) == known.end())
      throw UsageError("power " + args.positional[0] + " has no option --" + o.first);
}

double sigmaOf(const Arguments& args) {
  const double sigma = domainOption(args, "sigma", 1.0, Domain::kPositive);
  return sigma;
}

void setCommon(qel::CmCmndPower& c, const Arguments& args, bool hasReps, bool hasEffect,
               bool hasPower) {
  const double level = domainOption(args, "alpha", 0.05, Domain::kLevel);
  c.mSetLevel(level);
  c.mSetSigma(sigmaOf(args));
  if (hasReps) c.mSetSampleSizes(counts(args, "reps", 1));
  if (hasEffect) c.mSetEffects(numbers(args, "effect"));
  if (hasPower) c.mSetPowers(numbers(args, "power"));
  if (!c.mGeneralErrorChecking()) throw UsageError("every power must be above --alpha");
  if (hasPower)
    for (double p : numbers(args, "power"))
      if (!(p < 1.0)) throw UsageError("every power must be below 1");
}

int runFactorial(const Arguments& args, std::ostream& out) {
  checkOptions(args, {"factors", "runs", "blocks", "center-points", "terms", "reps", "effect",
                      "power", "alpha", "sigma"});
  const bool hasReps = args.options.count("reps") != 0;
  const bool hasCp = args.options.count("center-points") != 0;
  const bool hasEffect = args.options.count("effect") != 0;
  const bool hasPower = args.options.count("power") != 0;
  if (hasReps + hasCp + hasEffect + hasPower != 3)
    throw UsageError("give three of --reps, --center-points, --effect and --power");
  if (!args.options.count("factors") || !args.options.count("runs"))
    throw UsageError("power factorial needs --factors and --runs");
  const int factors = count(args, "factors", 0, 2);
  const int runs = count(args, "runs", 0, 4);
  const int blocks = count(args, "blocks", 1, 1);
  const bool pb = has(args, "plackett-burman");
  if (!pb && factors > 30) throw UsageError("a two-level factorial takes at most 30 factors");
  if (!pb && std::ldexp(1.0, factors) < runs)
    throw UsageError("--runs exceeds the 2^k corner points of the factors");
  if (!pb && blocks > static_cast<int>(qel::GetMaxBlocks(factors, runs)))
    throw UsageError("--blocks exceeds the largest number of blocks of this design");
  qel::CmCmndPowerFactorial c;
  c.mSetFactorCt(factors);
  c.mSetRunsPerRep(runs);
  c.mSetPlackettBurman(pb);
  c.mSetBlockCt(blocks);
  c.mSetBlocksInModel(blocks > 1);
  c.mSetCenterPntInModel(has(args, "cp-in-model"));
  if (args.options.count("terms")) {
    const int terms = count(args, "terms", 0, 1);
    if (terms >= c.mGetUniqueCornerPointCt())
      throw UsageError("--terms must leave at least one of the corner df");
    c.mSetOmittedEffects(factors - terms);
  }
  setCommon(c, args, hasReps, hasEffect, hasPower);
  if (hasCp) c.mSetCenterPoints(counts(args, "center-points", 0));
  c.mComputeAndStore();
  out << "reps centerpoints effect power target runs\n";
  const auto& n = c.mGetResultSampleSizes();
  const bool targetShown = !hasReps || !hasCp;
  for (std::size_t i = 0; i < n.size(); ++i) {
    const double target =
        targetShown ? numbers(args, "power").at(i % numbers(args, "power").size()) : kNaN;
    out << shownCount(n[i]) << ' ' << shownCount(c.mGetResultCenterPoints()[i]) << ' '
        << shown(c.mGetResultEffects()[i]) << ' ' << shown(c.mGetResultPowers()[i]) << ' '
        << formatNumber(target) << ' ' << shownCount(c.mGetResultTotalRuns()[i]) << '\n';
  }
  return 0;
}

int runGFF(const Arguments& args, std::ostream& out) {
  checkOptions(args, {"levels", "order", "reps", "effect", "power", "alpha", "sigma"});
  const bool hasReps = args.options.count("reps") != 0;
  const bool hasEffect = args.options.count("effect") != 0;
  const bool hasPower = args.options.count("power") != 0;
  if (hasReps + hasEffect + hasPower != 2)
    throw UsageError("give exactly two of --reps, --effect and --power");
  if (!args.options.count("levels")) throw UsageError("power gff needs --levels");
  const std::vector<int> levels = counts(args, "levels", 2);
  qel::CmCmndPowerGFF c;
  c.mSetLevels(levels);
  // The effect is the largest difference between the means of the levels
  // of the factor with the most levels: the hardest to detect.
  c.mSetGroupCt(*std::max_element(levels.begin(), levels.end()));
  c.mSetOrder(static_cast<unsigned>(count(args, "order", static_cast<int>(levels.size()), 1)));
  setCommon(c, args, hasReps, false, hasPower);
  if (hasEffect) {
    const std::vector<double> d = numbers(args, "effect");
    for (double x : d)
      if (!(x >= 0.0) || !std::isfinite(x)) throw UsageError("--effect must be non-negative");
    c.mCalculateEffectsFromMaxDiff(d);
  }
  c.mComputeAndStore();
  out << "reps effect power target runs\n";
  const auto& n = c.mGetResultSampleSizes();
  for (std::size_t i = 0; i < n.size(); ++i) {
    const double target = !hasReps ? c.mGetTargetPowers()[i] : kNaN;
    out << shownCount(n[i]) << ' ' << shown(c.mGetResultEffects()[i]) << ' '
        << shown(c.mGetResultPowers()[i]) << ' ' << formatNumber(target) << ' '
        << shownCount(c.mGetResultTotalRuns()[i]) << '\n';
  }
  return 0;
}

}  // namespace

bool isFactorialPowerDesign(const std::string& design) {
  return design == "factorial" || design == "gff";
}

int runFactorialPowerMode(int argc, char** argv, std::ostream& out) {
  const Arguments args = parseArguments(argc, argv, 2, {"plackett-burman", "cp-in-model"});
  if (args.positional.size() != 1) throw UsageError("power takes one design (see --help)");
  if (args.positional[0] == "gff") {
    if (has(args, "plackett-burman") || has(args, "cp-in-model"))
      throw UsageError("power gff takes no --plackett-burman or --cp-in-model");
    return runGFF(args, out);
  }
  return runFactorial(args, out);
}

void printFactorialPowerUsage(std::ostream& out) {
  out << "  qelcalc power factorial --factors K --runs R [--blocks B] [--plackett-burman]\n"
         "                [--terms T] [--cp-in-model] [--sigma S] [--alpha 0.05]\n"
         "                three of --reps L --center-points L --effect L --power L\n"
         "    Two-level factorial (or Plackett-Burman) designs; center points are per\n"
         "    block, T the model's terms (all by default); the fourth is solved.\n"
         "  qelcalc power gff --levels 3,4 [--order O] [--sigma S] [--alpha 0.05]\n"
         "                two of --reps L --effect L --power L\n"
         "    General full factorial; the effect is the largest difference of means.\n";
}

}  // namespace qelcalc
