// qelcalc curvefit FILE [--degree D] [--no-intercept] [--tolerance T]
#ifndef QELCALC_CURVEFIT_MODE_H
#define QELCALC_CURVEFIT_MODE_H

#include <ostream>

namespace qelcalc {

int runCurveFitMode(int argc, char** argv, std::ostream& out);
void printCurveFitUsage(std::ostream& out);

}  // namespace qelcalc

#endif
