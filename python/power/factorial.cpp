// qel.power for designed experiments, as `qelcalc power factorial|gff`:
// two-level factorial (or Plackett-Burman) designs with replicates, center
// points per block, effect and power (three given, the fourth solved), and
// general full factorial designs with replicates, the largest difference of
// means and power (two given).
#include <algorithm>
#include <cmath>
#include <string>

#include "arguments.h"
#include "basic_statistics/PowerFactorial.h"
#include "utilities/LYNBasicTypes.h"

namespace qelpy {
namespace power {

namespace {

struct FactorialRow {
  int reps, centerPoints;
  double effect, power, target;
  int runs;
};

struct FactorialRequest {
  Given given;  // n: replicates, extra: center points
  std::vector<int> reps, centerPoints;
  std::vector<double> effect, power;
  int factors, runs, blocks, terms;
  bool plackettBurman, cpInModel;
  double sigma, alpha;
};

// The checks of qelcalc power factorial, before any computation.
FactorialRequest readFactorial(py::object reps, py::object centerPoints, py::object effect,
                               py::object power, py::object factors, py::object runs,
                               py::object blocks, bool pb, py::object terms, bool cpInModel,
                               double sigma, double alpha) {
  FactorialRequest r;
  r.given.n = !reps.is_none();
  r.given.extra = !centerPoints.is_none();
  r.given.effect = !effect.is_none();
  r.given.power = !power.is_none();
  requireGiven(r.given, 3, "reps, center_points, effect and power");
  if (factors.is_none() || runs.is_none()) throw py::type_error("factors and runs are required");
  r.factors = countOption(factors, "factors", 2, 0);
  r.runs = countOption(runs, "runs", 4, 0);
  r.blocks = countOption(blocks, "blocks", 1, 1);
  r.terms = countOption(terms, "terms", 1, 0);
  r.plackettBurman = pb;
  r.cpInModel = cpInModel;
  if (!pb && r.factors > 30)
    throw py::value_error("a two-level factorial takes at most 30 factors");
  if (!pb && std::ldexp(1.0, r.factors) < r.runs)
    throw py::value_error("runs exceeds the 2^k corner points of the factors");
  if (!pb && r.blocks > static_cast<int>(qel::GetMaxBlocks(r.factors, r.runs)))
    throw py::value_error("blocks exceeds the largest number of blocks of this design");
  r.sigma = positive(sigma, "sigma");
  r.alpha = level(alpha, "alpha");
  if (r.given.n) r.reps = countList(reps, "reps", 1);
  if (r.given.extra) r.centerPoints = countList(centerPoints, "center_points", 0);
  if (r.given.effect) r.effect = numberList(effect, "effect");
  if (r.given.power) r.power = numberList(power, "power");
  checkPowers(r.power, r.alpha, true);
  return r;
}

std::vector<FactorialRow> solveFactorial(const FactorialRequest& r) {
  qel::CmCmndPowerFactorial c;
  c.mSetFactorCt(r.factors);
  c.mSetRunsPerRep(r.runs);
  c.mSetPlackettBurman(r.plackettBurman);
  c.mSetBlockCt(r.blocks);
  c.mSetBlocksInModel(r.blocks > 1);
  c.mSetCenterPntInModel(r.cpInModel);
  if (r.terms > 0) c.mSetOmittedEffects(r.factors - r.terms);
  c.mSetLevel(r.alpha);
  c.mSetSigma(r.sigma);
  if (r.given.n) c.mSetSampleSizes(r.reps);
  if (r.given.effect) c.mSetEffects(r.effect);
  if (r.given.power) c.mSetPowers(r.power);
  if (r.given.extra) c.mSetCenterPoints(r.centerPoints);
  c.mComputeAndStore();
  std::vector<FactorialRow> rows;
  const bool targetShown = !r.given.n || !r.given.extra;
  const auto& n = c.mGetResultSampleSizes();
  for (std::size_t i = 0; i < n.size(); ++i) {
    const double target = targetShown ? r.power.at(i % r.power.size()) : kNaN;
    rows.push_back({n[i], c.mGetResultCenterPoints()[i], shown(c.mGetResultEffects()[i]),
                    shown(c.mGetResultPowers()[i]), target, c.mGetResultTotalRuns()[i]});
  }
  return rows;
}

py::object factorial(py::object reps, py::object centerPoints, py::object effect, py::object power,
                     py::object factors, py::object runs, py::object blocks, bool pb,
                     py::object terms, bool cpInModel, double sigma, double alpha) {
  const FactorialRequest r = readFactorial(reps, centerPoints, effect, power, factors, runs, blocks,
                                           pb, terms, cpInModel, sigma, alpha);
  if (r.terms > 0) {
    qel::CmCmndPowerFactorial design;
    design.mSetFactorCt(r.factors);
    design.mSetRunsPerRep(r.runs);
    design.mSetPlackettBurman(pb);
    if (r.terms >= design.mGetUniqueCornerPointCt())
      throw py::value_error("terms must leave at least one of the corner df");
  }
  const auto rows = released([&] { return solveFactorial(r); });
  py::list out;
  for (const auto& row : rows) {
    out.append(result("FactorialPowerResult", {{"reps", countOrNone(row.reps)},
                                               {"center_points", countOrNone(row.centerPoints)},
                                               {"effect", py::float_(row.effect)},
                                               {"power", py::float_(row.power)},
                                               {"target", py::float_(row.target)},
                                               {"runs", countOrNone(row.runs)}}));
  }
  const char* solved = !r.given.n        ? "reps"
                       : !r.given.extra  ? "center_points"
                       : !r.given.effect ? "effect"
                                         : "power";
  return results(out, solved, py::none());
}

struct GFFRow {
  int reps;
  double effect, power, target;
  int runs;
};

py::object generalFactorial(py::object reps, py::object effect, py::object power, py::object levels,
                            py::object order, double sigma, double alpha) {
  Given g;
  g.n = !reps.is_none();
  g.effect = !effect.is_none();
  g.power = !power.is_none();
  requireGiven(g, 2, "reps, effect and power");
  const std::vector<int> lv = countList(levels, "levels", 2);
  const int o = countOption(order, "order", 1, static_cast<int>(lv.size()));
  positive(sigma, "sigma");
  level(alpha, "alpha");
  std::vector<int> r;
  std::vector<double> d, p;
  if (g.n) r = countList(reps, "reps", 1);
  if (g.power) p = numberList(power, "power");
  if (g.effect) d = numberList(effect, "effect");
  checkPowers(p, alpha, true);
  for (double x : d)
    if (!(x >= 0.0)) throw py::value_error("every effect must be non-negative");
  const auto rows = released([&] {
    qel::CmCmndPowerGFF c;
    c.mSetLevels(lv);
    // The effect is the largest difference between the means of the levels
    // of the factor with the most levels: the hardest to detect.
    c.mSetGroupCt(*std::max_element(lv.begin(), lv.end()));
    c.mSetOrder(static_cast<unsigned>(o));
    c.mSetLevel(alpha);
    c.mSetSigma(sigma);
    if (g.n) c.mSetSampleSizes(r);
    if (g.power) c.mSetPowers(p);
    if (g.effect) c.mCalculateEffectsFromMaxDiff(d);
    c.mComputeAndStore();
    std::vector<GFFRow> out;
    const auto& n = c.mGetResultSampleSizes();
    for (std::size_t i = 0; i < n.size(); ++i) {
      out.push_back({n[i], shown(c.mGetResultEffects()[i]), shown(c.mGetResultPowers()[i]),
                     g.n ? kNaN : shown(c.mGetTargetPowers()[i]), c.mGetResultTotalRuns()[i]});
    }
    return out;
  });
  py::list out;
  for (const auto& row : rows) {
    out.append(result("GeneralFactorialPowerResult", {{"reps", countOrNone(row.reps)},
                                                      {"effect", py::float_(row.effect)},
                                                      {"power", py::float_(row.power)},
                                                      {"target", py::float_(row.target)},
                                                      {"runs", countOrNone(row.runs)}}));
  }
  return results(out, !g.effect ? "effect" : !g.power ? "power" : "reps", py::none());
}

}  // namespace

void registerFactorial(py::module_& m) {
  using py::arg;
  const auto none = py::none();
  m.def("factorial", &factorial, arg("reps") = none, arg("center_points") = none,
        arg("effect") = none, arg("power") = none, py::kw_only(), arg("factors"), arg("runs"),
        arg("blocks") = 1, arg("plackett_burman") = false, arg("terms") = none,
        arg("cp_in_model") = false, arg("sigma") = 1.0, arg("alpha") = 0.05,
        "Power of a two-level factorial (or Plackett-Burman) design with `factors` "
        "factors and `runs` corner points per replicate, in `blocks` blocks; "
        "center_points are per block, `terms` the model's terms (all by default). "
        "Give three of reps, center_points, effect and power (a number or a list "
        "each); the fourth is solved for every combination (qelcalc power "
        "factorial). Returns qel.power.Results of FactorialPowerResult(reps, "
        "center_points, effect, power, target, runs): None or NaN where nothing "
        "could be computed, 999999 where no count reaches the target.");
  m.def("general_factorial", &generalFactorial, arg("reps") = none, arg("effect") = none,
        arg("power") = none, py::kw_only(), arg("levels"), arg("order") = none, arg("sigma") = 1.0,
        arg("alpha") = 0.05,
        "Power of a general full factorial design with factors of `levels` levels "
        "and terms up to `order` (all by default); the effect is the largest "
        "difference of means. Give two of reps, effect and power; the third is "
        "solved (qelcalc power gff). Returns qel.power.Results of "
        "GeneralFactorialPowerResult(reps, effect, power, target, runs).");
}

}  // namespace power
}  // namespace qelpy
