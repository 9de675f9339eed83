// Rank tests: Mann-Whitney, Kruskal-Wallis, Mood's median test and
// Friedman's test.
#include <qel/rank_tests.h>

#include "common.h"

namespace qelpy {

namespace {

py::object f(double v) {
  return py::float_(v);
}

void registerMannWhitney(py::module_& m) {
  m.def(
      "mann_whitney",
      [](py::handle x, py::handle y, double confidence, const std::string& alternative,
         py::handle interval) {
        Doubles a = column(x, "x"), b = column(y, "y");
        const qel::AlternativeHypothesis alt = alternativeOf(alternative);
        const qel::IntervalType type = intervalOf(interval, alt);
        qel::v0::MannWhitney r;
        r.firstN = static_cast<int>(count(a));
        r.secondN = static_cast<int>(count(b));
        const double level = confidenceOf(confidence);
        const int code = released(
            [&] { return qel::v0::RunLynMannWhitney(&r, a.data(), b.data(), level, type, alt); });
        check(code);
        return result("MannWhitney", {{"first_n", py::int_(r.firstN)},
                                      {"second_n", py::int_(r.secondN)},
                                      {"first_median", f(r.firstMedian)},
                                      {"second_median", f(r.secondMedian)},
                                      {"estimate", f(r.estimate)},
                                      {"lower_limit", f(r.lowerLimit)},
                                      {"upper_limit", f(r.upperLimit)},
                                      {"achieved_confidence", f(r.achievedConfidence)},
                                      {"statistic", f(r.statistic)},
                                      {"p_value", f(r.pValue)},
                                      {"adjusted_p_value", f(r.adjustedPValue)},
                                      {"status", py::int_(code)}});
      },
      py::arg("x"), py::arg("y"), py::arg("confidence") = 0.95,
      py::arg("alternative") = "two-sided", py::arg("interval") = py::none(),
      "Mann-Whitney rank-sum test with the Hodges-Lehmann shift x - y and its interval "
      "(adjusted_p_value is -1 without ties).");
}

void registerKruskalWallis(py::module_& m) {
  m.def(
      "kruskal_wallis",
      [](py::handle groups) {
        std::vector<Doubles> data = columns(groups, "groups", 2);
        std::vector<qel::v0::KruskalWallisGroup> g(data.size());
        for (std::size_t i = 0; i < g.size(); ++i) {
          g[i] = {kNaN, kNaN, kNaN, data[i].data(), count(data[i])};
        }
        qel::v0::KruskalWallis r;
        r.groups = g.data();
        r.groupCount = static_cast<unsigned>(g.size());
        const int code = released([&] { return qel::v0::RunLynKruskalWallis(&r); });
        check(code);
        py::list out;
        for (const auto& one : g) {
          out.append(result("KruskalWallisGroup", {{"n", py::int_(one.n)},
                                                   {"median", f(one.median)},
                                                   {"mean_rank", f(one.meanRank)},
                                                   {"z", f(one.z)}}));
        }
        return result("KruskalWallis", {{"statistic", f(r.statistic)},
                                        {"degrees_of_freedom", f(r.degreesOfFreedom)},
                                        {"p_value", f(r.pValue)},
                                        {"adjusted_statistic", f(r.adjustedStatistic)},
                                        {"adjusted_p_value", f(r.adjustedPValue)},
                                        {"groups", out},
                                        {"status", py::int_(code)}});
      },
      py::arg("groups"),
      "Kruskal-Wallis test of two or more groups (a sequence of arrays); adjusted for ties.");
}

void registerMood(py::module_& m) {
  m.def(
      "mood",
      [](py::handle groups) {
        std::vector<Doubles> data = columns(groups, "groups", 2);
        std::vector<qel::v0::MoodGroup> g(data.size());
        for (std::size_t i = 0; i < g.size(); ++i) {
          g[i] = {kNaN, kNaN, kNaN, kNaN, kNaN, kNaN, data[i].data(), count(data[i])};
        }
        qel::v0::Mood r;
        r.groups = g.data();
        r.groupCount = static_cast<unsigned>(g.size());
        const int code = released([&] { return qel::v0::RunLynMood(&r); });
        check(code);
        py::list out;
        for (const auto& one : g) {
          out.append(result("MoodGroup", {{"n", py::int_(one.n)},
                                          {"count_at_or_below", f(one.countAtOrBelow)},
                                          {"count_above", f(one.countAbove)},
                                          {"median", f(one.median)},
                                          {"interquartile_range", f(one.interquartileRange)},
                                          {"lower_limit", f(one.lowerLimit)},
                                          {"upper_limit", f(one.upperLimit)}}));
        }
        return result("Mood", {{"overall_median", f(r.overallMedian)},
                               {"statistic", f(r.statistic)},
                               {"degrees_of_freedom", f(r.degreesOfFreedom)},
                               {"p_value", f(r.pValue)},
                               {"lower_limit", f(r.lowerLimit)},
                               {"upper_limit", f(r.upperLimit)},
                               {"achieved_confidence", f(r.achievedConfidence)},
                               {"groups", out},
                               {"flags", py::int_(r.flags)},
                               {"status", py::int_(code)}});
      },
      py::arg("groups"), "Mood's median test of two or more groups (a sequence of arrays).");
}

void registerFriedman(py::module_& m) {
  m.def(
      "friedman",
      [](py::handle table) {
        Doubles t = numbers(table, "table");
        if (t.ndim() != 2 || t.shape(0) < 1 || t.shape(1) < 2) {
          throw py::value_error(
              "table must be two-dimensional: a row per block, a column per "
              "treatment (at least two)");
        }
        const auto blocks = static_cast<std::size_t>(t.shape(0));
        const auto k = static_cast<std::size_t>(t.shape(1));
        // The library overwrites each treatment's column with fitted values.
        std::vector<std::vector<double>> cols(k, std::vector<double>(blocks));
        for (std::size_t b = 0; b < blocks; ++b) {
          for (std::size_t j = 0; j < k; ++j) cols[j][b] = t.data()[b * k + j];
        }
        std::vector<qel::v0::FriedmanTreatment> tr(k);
        for (std::size_t j = 0; j < k; ++j) tr[j] = {kNaN, kNaN, cols[j].data()};
        qel::v0::Friedman r;
        r.treatments = tr.data();
        r.treatmentCount = static_cast<unsigned>(k);
        r.blocks = static_cast<unsigned>(blocks);
        const int code = released([&] { return qel::v0::RunLynFriedman(&r); });
        check(code);
        py::list out;
        for (std::size_t j = 0; j < k; ++j) {
          out.append(result("FriedmanTreatment", {{"estimated_median", f(tr[j].estimatedMedian)},
                                                  {"rank_sum", f(tr[j].rankSum)},
                                                  {"fitted", toArray(cols[j].data(), blocks)}}));
        }
        return result("Friedman", {{"grand_median", f(r.grandMedian)},
                                   {"statistic", f(r.statistic)},
                                   {"degrees_of_freedom", f(r.degreesOfFreedom)},
                                   {"p_value", f(r.pValue)},
                                   {"adjusted_statistic", f(r.adjustedStatistic)},
                                   {"adjusted_p_value", f(r.adjustedPValue)},
                                   {"treatments", out},
                                   {"status", py::int_(code)}});
      },
      py::arg("table"),
      "Friedman's test on a blocks x treatments table, with Doksum's treatment effects.");
}

}  // namespace

void registerRankTests(py::module_& m) {
  registerMannWhitney(m);
  registerKruskalWallis(m);
  registerMood(m);
  registerFriedman(m);
}

}  // namespace qelpy
