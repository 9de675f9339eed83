// qelcalc FAMILY FUNCTION [X] [--param value ...] [--upper] [--file PATH|-]
#ifndef QELCALC_DISTRIBUTION_MODE_H
#define QELCALC_DISTRIBUTION_MODE_H

#include <ostream>
#include <string>

namespace qelcalc {

bool isDistributionFamily(const std::string& name);
int runDistributionMode(int argc, char** argv, std::ostream& out);
void printDistributionUsage(std::ostream& out);

}  // namespace qelcalc

#endif
