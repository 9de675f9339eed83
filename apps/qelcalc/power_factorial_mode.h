// qelcalc power factorial and power gff.
#ifndef QELCALC_POWER_FACTORIAL_MODE_H
#define QELCALC_POWER_FACTORIAL_MODE_H

#include <ostream>
#include <string>

namespace qelcalc {

bool isFactorialPowerDesign(const std::string& design);
int runFactorialPowerMode(int argc, char** argv, std::ostream& out);
void printFactorialPowerUsage(std::ostream& out);

}  // namespace qelcalc

#endif
