// qelcalc gof FILE|- [--proportions P1,P2,...]
// qelcalc ticks MIN MAX [--ticks 4,11] [--below 0,0.05] [--above 0,0.05]
//               [--limits L,U] [--tick-margins 0.5,0.5]
#ifndef QELCALC_GOF_MODE_H
#define QELCALC_GOF_MODE_H

#include <ostream>

namespace qelcalc {

int runGofMode(int argc, char** argv, std::ostream& out);
void printGofUsage(std::ostream& out);

int runTicksMode(int argc, char** argv, std::ostream& out);
void printTicksUsage(std::ostream& out);

}  // namespace qelcalc

#endif
