// qelcalc summary FILE|-
#ifndef QELCALC_SUMMARY_MODE_H
#define QELCALC_SUMMARY_MODE_H

#include <ostream>

namespace qelcalc {

int runSummaryMode(int argc, char** argv, std::ostream& out);
void printSummaryUsage(std::ostream& out);

}  // namespace qelcalc

#endif
