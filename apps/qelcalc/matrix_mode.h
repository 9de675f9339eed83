// qelcalc matrix lu|det|inv|chol|eigen FILE
#ifndef QELCALC_MATRIX_MODE_H
#define QELCALC_MATRIX_MODE_H

#include <ostream>

namespace qelcalc {

int runMatrixMode(int argc, char** argv, std::ostream& out);
void printMatrixUsage(std::ostream& out);

}  // namespace qelcalc

#endif
