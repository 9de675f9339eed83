// qelcalc ttest FILE [--mu M] [--sigma S] [--paired FILE2 | --two-sample FILE2 [--pooled]]
//                    [--alternative ...] [--confidence C] [--interval ...]
#ifndef QELCALC_TTEST_MODE_H
#define QELCALC_TTEST_MODE_H

#include <ostream>

namespace qelcalc {

int runTTestMode(int argc, char** argv, std::ostream& out);
void printTTestUsage(std::ostream& out);

}  // namespace qelcalc

#endif
