// qelcalc sample FAMILY N [--PARAM VALUE ...] [--seed S]
#ifndef QELCALC_SAMPLE_MODE_H
#define QELCALC_SAMPLE_MODE_H

#include <ostream>

namespace qelcalc {

int runSampleMode(int argc, char** argv, std::ostream& out);
void printSampleUsage(std::ostream& out);

}  // namespace qelcalc

#endif
