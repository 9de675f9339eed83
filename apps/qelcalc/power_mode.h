// qelcalc power t|z|paired|prop|variance|poisson|welch with two of --n,
// --effect and --power (comma lists): the third quantity for every pair.
#ifndef QELCALC_POWER_MODE_H
#define QELCALC_POWER_MODE_H

#include <ostream>

namespace qelcalc {

int runPowerMode(int argc, char** argv, std::ostream& out);
void printPowerUsage(std::ostream& out);

}  // namespace qelcalc

#endif
