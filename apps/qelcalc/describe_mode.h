// qelcalc describe [--file PATH|-]
#ifndef QELCALC_DESCRIBE_MODE_H
#define QELCALC_DESCRIBE_MODE_H

#include <ostream>

namespace qelcalc {

int runDescribeMode(int argc, char** argv, std::ostream& out);
void printDescribeUsage(std::ostream& out);

}  // namespace qelcalc

#endif
