// The selection machinery against brute force: every Walsh average or
// pairwise difference formed and sorted in the test, on random samples with
// many ties, negative values and duplicates, in both the compressed form
// (distinct values with frequencies) and the plain form (frequencies 1).
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numeric>
#include <random>
#include <vector>

#include "basic_statistics/NonparametricUtil.h"

namespace {

// A sample as the selection routines take it.
struct Compressed {
  std::vector<int> index;
  std::vector<int> cumulative;
};

// Distinct values merged (frequencies) or kept apart (cumulative 1..n).
Compressed compress(std::vector<double> const& x, bool mergeTies) {
  std::vector<int> order(x.size());
  std::iota(order.begin(), order.end(), 0);
  // NaN last, as a sort order puts it; the rest ascending.
  std::sort(order.begin(), order.end(),
            [&x](int a, int b) { return x[a] < x[b] || (!std::isnan(x[a]) && std::isnan(x[b])); });
  Compressed c;
  for (std::size_t k = 0; k < order.size(); ++k) {
    if (mergeTies && k > 0 && x[order[k]] == x[order[k - 1]]) {
      ++c.cumulative.back();
    } else {
      c.index.push_back(order[k]);
      c.cumulative.push_back(static_cast<int>(k) + 1);
    }
  }
  return c;
}

std::vector<double> sortedWalshAverages(std::vector<double> const& x) {
  std::vector<double> averages;
  for (std::size_t i = 0; i < x.size(); ++i) {
    for (std::size_t j = i; j < x.size(); ++j) averages.push_back((x[i] + x[j]) * 0.5);
  }
  std::sort(averages.begin(), averages.end());
  return averages;
}

std::vector<double> sortedDifferences(std::vector<double> const& x, std::vector<double> const& y) {
  std::vector<double> differences;
  for (double xi : x) {
    for (double yj : y) differences.push_back(yj - xi);
  }
  std::sort(differences.begin(), differences.end());
  return differences;
}

// Integers in [-range, range], scaled: many ties, negatives, exact sums.
std::vector<double> tiedSample(std::mt19937& rng, int n, int range, double scale) {
  std::uniform_int_distribution<int> value(-range, range);
  std::vector<double> x(n);
  for (double& v : x) v = value(rng) * scale;
  return x;
}

TEST(Selection, MedianOfThreeTakesTheMiddleOfEveryPermutation) {
  double v[3] = {-1.5, 2.0, 7.0};
  std::sort(v, v + 3);
  do {
    EXPECT_EQ(qel::mMedianOfThree(v[0], v[1], v[2]), 2.0);
  } while (std::next_permutation(v, v + 3));
  EXPECT_EQ(qel::mMedianOfThree(4.0, 4.0, 1.0), 4.0);
  EXPECT_EQ(qel::mMedianOfThree(1.0, 4.0, 4.0), 4.0);
}

// The tied search only steers the pivots: the selection tests cannot see it.
TEST(Selection, LowerBoundFindsTheValueHoldingEachOrderStatistic) {
  std::vector<int> untied = {1, 2, 3, 4};
  for (int k = 1; k <= 4; ++k) EXPECT_EQ(qel::mLowerBound(k, untied), k - 1);
  // Frequencies 2, 1, 3: observations 1-2 in value 0, 3 in 1, 4-6 in 2.
  std::vector<int> tied = {2, 3, 6};
  int expected[] = {0, 0, 1, 2, 2, 2};
  for (int k = 1; k <= 6; ++k) EXPECT_EQ(qel::mLowerBound(k, tied), expected[k - 1]) << k;
  EXPECT_EQ(qel::mLowerBound(7, tied), 3);  // past the end
  EXPECT_EQ(qel::mLowerBound(0, tied), 0);
  EXPECT_EQ(qel::mLowerBound(5, tied, 1, 1), 2);  // nothing in range reaches 5: last + 1
  EXPECT_EQ(qel::mLowerBound(4, tied, 1, -1), 2);
}

TEST(Selection, WeightedSelectionEqualsTheExpandedSortedList) {
  std::mt19937 rng(20261123);
  for (int trial = 0; trial < 300; ++trial) {
    int n = 1 + trial % 40;
    std::vector<double> values = tiedSample(rng, n, 6, 0.5);
    std::uniform_int_distribution<int> weight(0, 4);
    std::vector<int> weights(n);
    for (int& w : weights) w = weight(rng);
    std::vector<double> expanded;
    for (int i = 0; i < n; ++i) expanded.insert(expanded.end(), weights[i], values[i]);
    std::sort(expanded.begin(), expanded.end());
    long long total = static_cast<long long>(expanded.size());

    std::vector<long long> ranks;
    for (long long r = 0; r <= total + 1; ++r) ranks.push_back(r);
    std::shuffle(ranks.begin(), ranks.end(), rng);  // any order is answered
    std::vector<double> result;
    qel::mSelectOrderStats(ranks, values.data(), weights, result);
    ASSERT_EQ(result.size(), ranks.size());
    for (std::size_t r = 0; r < ranks.size(); ++r) {
      if (ranks[r] < 1 || ranks[r] > total) {
        EXPECT_TRUE(std::isnan(result[r])) << ranks[r];
      } else {
        EXPECT_EQ(result[r], expanded[ranks[r] - 1]) << "trial " << trial << " rank " << ranks[r];
      }
    }
    if (total > 0) {
      long long k = 1 + trial % total;
      EXPECT_EQ(qel::mSelectOrderStat(k, values.data(), weights), expanded[k - 1]);
    }
  }
}

// Every rank of the Walsh averages of small samples, from scratch and with a
// start pivot, and all ranks in one rising sequence resumed from the bounds.
TEST(Selection, EveryWalshAverageOfSmallTiedSamples) {
  std::mt19937 rng(7);
  for (int trial = 0; trial < 160; ++trial) {
    int n = 1 + (trial % 16) * 3;  // up to 46: beyond the direct listing of few cells
    std::vector<double> x = tiedSample(rng, n, 1 + trial % 5 * 3, 0.25);
    std::vector<double> expected = sortedWalshAverages(x);
    for (bool merge : {true, false}) {
      Compressed c = compress(x, merge);
      qel::CmSelectionBounds resumed;
      qel::mResetBoundsAvg(static_cast<int>(c.index.size()), resumed);
      double eliminated = 0.0;
      for (std::size_t k = 1; k <= expected.size(); ++k) {
        qel::CmSelectionBounds fresh;
        qel::mResetBoundsAvg(static_cast<int>(c.index.size()), fresh);
        double nan = std::nan("");
        EXPECT_EQ(qel::mFinderAvg(c.index, x.data(), c.cumulative, fresh, 0.0, nan, double(k)),
                  expected[k - 1])
            << "trial " << trial << " k " << k;
        qel::mResetBoundsAvg(static_cast<int>(c.index.size()), fresh);
        double guess = x[k % n];
        EXPECT_EQ(qel::mFinderAvg(c.index, x.data(), c.cumulative, fresh, 0.0, guess, double(k)),
                  expected[k - 1]);

        double sum = 0.0;
        EXPECT_EQ(qel::mFinderAvg(c.index, x.data(), c.cumulative, resumed, 0.0, nan,
                                  double(k) - eliminated, &sum),
                  expected[k - 1]);
        EXPECT_EQ(sum, 2.0 * expected[k - 1]);
        eliminated = qel::mGetEliminatedAvg(c.cumulative, resumed);
        EXPECT_LT(eliminated, double(k));
      }
      qel::CmSelectionBounds fresh;
      qel::mResetBoundsAvg(static_cast<int>(c.index.size()), fresh);
      double total = double(expected.size());
      EXPECT_TRUE(
          std::isnan(qel::mFinderAvg(c.index, x.data(), c.cumulative, fresh, 0.0, 0.0, 0.0)));
      EXPECT_TRUE(
          std::isnan(qel::mFinderAvg(c.index, x.data(), c.cumulative, fresh, 0.0, 0.0, total + 1)));
    }
  }
}

TEST(Selection, EveryPairwiseDifferenceOfSmallTiedSamples) {
  std::mt19937 rng(11);
  for (int trial = 0; trial < 160; ++trial) {
    int n1 = 1 + (trial % 9) * 4, n2 = 1 + ((trial / 9) % 11) * 3;
    std::vector<double> x = tiedSample(rng, n1, 1 + trial % 4 * 4, 0.5);
    std::vector<double> y = tiedSample(rng, n2, 1 + trial % 3 * 5, 0.5);
    std::vector<double> expected = sortedDifferences(x, y);
    for (bool merge : {true, false}) {
      Compressed cx = compress(x, merge), cy = compress(y, !merge);
      int rows = static_cast<int>(cx.index.size()), columns = static_cast<int>(cy.index.size());
      qel::CmSelectionBounds resumed;
      qel::mResetBoundsDiff(rows, columns, resumed);
      double eliminated = 0.0;
      for (std::size_t k = 1; k <= expected.size(); ++k) {
        qel::CmSelectionBounds fresh;
        qel::mResetBoundsDiff(rows, columns, fresh);
        double guess = (k % 3 == 0) ? std::nan("") : y[k % n2] - x[k % n1];
        EXPECT_EQ(qel::mFinderDiff(cx.index, x.data(), cx.cumulative, cy.index, y.data(),
                                   cy.cumulative, fresh, 0.0, guess, double(k)),
                  expected[k - 1])
            << "trial " << trial << " k " << k;
        EXPECT_EQ(
            qel::mFinderDiff(cx.index, x.data(), cx.cumulative, cy.index, y.data(), cy.cumulative,
                             resumed, 0.0, std::nan(""), double(k) - eliminated),
            expected[k - 1])
            << "resumed, trial " << trial << " k " << k;
        eliminated = qel::mGetEliminatedDiff(cx.cumulative, cy.cumulative, resumed);
        EXPECT_LT(eliminated, double(k));
      }
    }
  }
}

// The band counts of a pivot (sums within the tolerance of it) agree with a
// direct count.
TEST(Selection, ToleranceBandsCountNearlyEqualSums) {
  std::mt19937 rng(5);
  std::uniform_real_distribution<double> jitter(-1e-14, 1e-14);
  std::vector<double> x = tiedSample(rng, 60, 5, 1.0);
  for (double& v : x) v += jitter(rng);
  Compressed c = compress(x, false);
  const double tolerance = 1e-12;
  qel::CmSelectionBounds bounds;
  qel::mResetBoundsAvg(static_cast<int>(c.index.size()), bounds);
  double pivot = 2.0;  // sums near 2 are numerous: the band is wide
  qel::CmBandWeights w = qel::mBoundsAvg(c.index, x.data(), c.cumulative, bounds, pivot, tolerance);
  double below = 0, band = 0, above = 0;
  for (double a : sortedWalshAverages(x)) {
    double sum = 2.0 * a;
    if (sum < pivot - tolerance) {
      ++below;
    } else if (sum <= pivot + tolerance) {
      ++band;
    } else {
      ++above;
    }
  }
  EXPECT_EQ(w.below, below);
  EXPECT_EQ(w.band, band);
  EXPECT_EQ(w.above, above);
  EXPECT_GT(band, 1.0);
}

// With a tolerance the answer lies within it of the true k-th average; over
// data holding NaN the search answers NaN or one of the candidates, and always
// returns. Few rows (the direct search) and many (sampled pivots).
TEST(Selection, ToleranceAndNaNOnFewAndManyRows) {
  for (int n : {60, 500}) {
    std::mt19937 rng(n);
    std::uniform_real_distribution<double> jitter(-1e-14, 1e-14);
    std::vector<double> x = tiedSample(rng, n, 5 + n / 20, 1.0);
    for (double& v : x) v += jitter(rng);
    const std::vector<double> averages = sortedWalshAverages(x);
    const Compressed c = compress(x, false);
    for (std::size_t k = 1; k <= averages.size(); k += averages.size() / 40 + 1) {
      qel::CmSelectionBounds bounds;
      qel::mResetBoundsAvg(n, bounds);
      const double found =
          qel::mFinderAvg(c.index, x.data(), c.cumulative, bounds, 1e-12, std::nan(""), double(k));
      EXPECT_NEAR(found, averages[k - 1], 1e-12) << n << " " << k;
    }
    for (int i = 0; i < n; i += 7 + n / 50) x[i] = std::nan("");
    const Compressed withNaN = compress(x, false);
    for (std::size_t k = 1; k <= averages.size(); k += averages.size() / 6 + 1) {
      qel::CmSelectionBounds bounds;
      qel::mResetBoundsAvg(n, bounds);
      const double found = qel::mFinderAvg(withNaN.index, x.data(), withNaN.cumulative, bounds, 0.0,
                                           std::nan(""), double(k));
      bool candidate = std::isnan(found);
      for (int i = 0; i < n && !candidate; ++i) {
        for (int j = i; j < n && !candidate; ++j) candidate = (x[i] + x[j]) * 0.5 == found;
      }
      EXPECT_TRUE(candidate) << n << " " << found;
    }
  }
}

// Empty and single samples.
TEST(Selection, EmptyAndSingleSamples) {
  std::vector<int> none;
  qel::CmSelectionBounds bounds;
  qel::mResetBoundsAvg(0, bounds);
  EXPECT_TRUE(std::isnan(qel::mFinderAvg(none, nullptr, none, bounds, 0.0, 1.0, 1.0)));
  const double one[] = {-2.5};
  std::vector<int> index = {0}, cumulative = {1};
  qel::mResetBoundsAvg(1, bounds);
  EXPECT_EQ(qel::mFinderAvg(index, one, cumulative, bounds, 0.0, 7.0, 1.0), -2.5);
  qel::mResetBoundsDiff(1, 0, bounds);
  EXPECT_TRUE(std::isnan(
      qel::mFinderDiff(index, one, cumulative, none, nullptr, none, bounds, 0.0, 0.0, 1.0)));
}

// Many rows: the search brackets rank k between two pivots from a sample of
// the cells. Every rank tried, from the extremes (where the bracket reaches
// past the sample on one side) to the middle, searched afresh and resumed in
// ascending order, must give exactly the brute-force order statistic.
TEST(Selection, SampledPivotsOnManyRows) {
  std::mt19937 rng(29);
  std::normal_distribution<double> normal(0.2, 1.5);
  for (bool tied : {false, true}) {
    std::vector<double> x(700), y(520);
    for (double& v : x) v = tied ? std::round(normal(rng) * 40.0) / 8.0 : normal(rng);
    for (double& v : y) v = tied ? std::round(normal(rng) * 40.0) / 8.0 : normal(rng) - 0.3;
    const Compressed cx = compress(x, false), cy = compress(y, false);
    const std::vector<double> averages = sortedWalshAverages(x);
    const std::vector<double> differences = sortedDifferences(x, y);
    for (int walsh = 0; walsh < 2; ++walsh) {
      const std::vector<double>& all = walsh ? averages : differences;
      const double total = double(all.size());
      std::vector<double> ranks = {1, 2, 3, 40, std::floor(total / 1000), std::floor(total / 7)};
      for (double f = 0.05; f < 1.0; f += 0.0731) ranks.push_back(std::floor(total * f));
      for (double k : {std::floor((total + 1) / 2), total - 40, total - 2, total - 1, total}) {
        ranks.push_back(k);
      }
      std::sort(ranks.begin(), ranks.end());
      qel::CmSelectionBounds resumed;
      if (walsh) {
        qel::mResetBoundsAvg(700, resumed);
      } else {
        qel::mResetBoundsDiff(700, 520, resumed);
      }
      double eliminated = 0.0;
      for (double k : ranks) {
        const double expected = all[std::size_t(k) - 1];
        qel::CmSelectionBounds fresh;
        double found, again;
        if (walsh) {
          qel::mResetBoundsAvg(700, fresh);
          found = qel::mFinderAvg(cx.index, x.data(), cx.cumulative, fresh, 0.0, std::nan(""), k);
          again = qel::mFinderAvg(cx.index, x.data(), cx.cumulative, resumed, 0.0, x[0],
                                  k - eliminated);
          eliminated = qel::mGetEliminatedAvg(cx.cumulative, resumed);
        } else {
          qel::mResetBoundsDiff(700, 520, fresh);
          found = qel::mFinderDiff(cx.index, x.data(), cx.cumulative, cy.index, y.data(),
                                   cy.cumulative, fresh, 0.0, std::nan(""), k);
          again = qel::mFinderDiff(cx.index, x.data(), cx.cumulative, cy.index, y.data(),
                                   cy.cumulative, resumed, 0.0, 0.0, k - eliminated);
          eliminated = qel::mGetEliminatedDiff(cx.cumulative, cy.cumulative, resumed);
        }
        EXPECT_EQ(found, expected) << "walsh " << walsh << " tied " << tied << " k " << k;
        EXPECT_EQ(again, expected) << "resumed, walsh " << walsh << " tied " << tied << " k " << k;
      }
    }
  }
}

}  // namespace
