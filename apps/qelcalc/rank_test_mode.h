// qelcalc test sign|wilcoxon|runs|mann-whitney|kruskal-wallis|mood|friedman:
// the distribution-free tests of libqel on columns of a table, on several
// files, or on a value column split by a group column.
#ifndef QELCALC_RANK_TEST_MODE_H
#define QELCALC_RANK_TEST_MODE_H

#include <ostream>
#include <string>

#include "cli.h"

namespace qelcalc {

bool isRankTest(const std::string& name);

// args.positional holds the test name and then the data files.
int runRankTest(const Arguments& args, std::ostream& out);

void printRankTestUsage(std::ostream& out);

}  // namespace qelcalc

#endif
