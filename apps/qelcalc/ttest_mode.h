// qelcalc ttest FILE [--mu M] [--sigma S] [--paired FILE2 | --two-sample FILE2 [--pooled]]
//                    [--alternative ...] [--confidence C] [--interval ...]
#ifndef QELCALC_TTEST_MODE_H
#define QELCALC_TTEST_MODE_H

#include <ostream>

namespace qelcalc {

int runTTestMode(int argc, char** argv, std::ostream& out);
void printTTestUsage(std::ostream& out);

// qelcalc test one-sample-t|one-sample-z|paired-t|two-sample-t FILE [--column C]
//              [--column2 C2] [options of ttest]: the same tests on table columns.
int runTestMode(int argc, char** argv, std::ostream& out);
void printTestUsage(std::ostream& out);

}  // namespace qelcalc

#endif
