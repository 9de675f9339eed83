// Ranks against R's rank() (tools/reference/gen_ranks_r.R): ties averaged or
// broken by row order, both directions, all rows or a shuffled subset, with
// the missing value ranked as a number and then left out.
#include <gtest/gtest.h>

#include <cmath>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "proxies/rows.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/MathUtilities.h"

namespace {

std::vector<double> numbers(const std::string& field) {
  std::istringstream in(field);
  std::vector<double> v;
  for (std::string word; in >> word;)
    v.push_back(word == "NA" ? qel::mGetMissingValueCode() : std::stod(word));
  return v;
}

TEST(Ranks, AgreeWithRRank) {
  std::ifstream file(std::string(QEL_TEST_DATA_DIR) + "/ranks_r.txt");
  ASSERT_TRUE(file.good());
  int cases = 0;
  for (std::string line; std::getline(file, line); ++cases) {
    std::vector<std::string> fields;
    std::istringstream in(line);
    for (std::string f; std::getline(in, f, ';');) fields.push_back(f);
    ASSERT_EQ(fields.size(), 10u);
    const std::vector<double> values = numbers(fields[0]), rowNumbers = numbers(fields[1]);
    qel::CbRows rows;
    rows.mInitialize(std::vector<int>(rowNumbers.begin(), rowNumbers.end()));
    for (int k = 0; k < 8; ++k) {
      const bool average = k % 4 < 2, ascending = k % 2 == 0, adjust = k >= 4;
      std::vector<double> ranks;
      qel::CbRows sorted;
      qel::mComputeRanks(values, rows, ranks, sorted, average, ascending);
      if (adjust) qel::mAdjustRanksForMisingValues(values, sorted, ranks);
      const std::vector<double> expected = numbers(fields[2 + k]);
      std::vector<bool> selected(values.size());
      for (std::size_t i = 0; i < rowNumbers.size(); ++i) {
        const auto r = std::size_t(rowNumbers[i]) - 1;
        selected[r] = true;
        EXPECT_EQ(ranks[r], expected[i]) << "case " << cases << " kind " << k << " row " << r + 1;
      }
      for (std::size_t r = 0; r < values.size(); ++r)
        EXPECT_TRUE(selected[r] || ranks[r] == qel::mGetMissingValueCode()) << r;
    }
  }
  EXPECT_EQ(cases, 60);
}

// NaN cannot be ordered: it is left out, and the others rank among
// themselves; nothing hangs or crashes.
TEST(Ranks, NaNAndEmptyInput) {
  std::vector<double> ranks;
  qel::mComputeRanks({3.0, NAN, 1.0, NAN, 2.0}, ranks, true, false);
  EXPECT_EQ(ranks, (std::vector<double>{1, qel::mGetMissingValueCode(), 3,
                                        qel::mGetMissingValueCode(), 2}));
  qel::mComputeRanks({}, ranks, true, true);
  EXPECT_TRUE(ranks.empty());
}

}  // namespace
