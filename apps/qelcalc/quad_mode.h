// qelcalc quad legendre|hermite|laguerre N [--alpha A]
// qelcalc sint N --confidence C
// qelcalc range cdf|inv|crit|pvalue X --k K [--upper]
// qelcalc tukey crit|pvalue X --k K --df D
#ifndef QELCALC_QUAD_MODE_H
#define QELCALC_QUAD_MODE_H

#include <ostream>

namespace qelcalc {

int runQuadMode(int argc, char** argv, std::ostream& out);
void printQuadUsage(std::ostream& out);

int runSintMode(int argc, char** argv, std::ostream& out);
void printSintUsage(std::ostream& out);

int runRangeMode(int argc, char** argv, std::ostream& out);
void printRangeUsage(std::ostream& out);

int runTukeyMode(int argc, char** argv, std::ostream& out);
void printTukeyUsage(std::ostream& out);

}  // namespace qelcalc

#endif
