// qelcalc fit FILE --dist D   and   qelcalc pplot FILE --dist D [--out CSV]
#ifndef QELCALC_FIT_MODE_H
#define QELCALC_FIT_MODE_H

#include <ostream>

namespace qelcalc {

int runFitMode(int argc, char** argv, std::ostream& out);
int runPPlotMode(int argc, char** argv, std::ostream& out);
void printFitUsage(std::ostream& out);

}  // namespace qelcalc

#endif
