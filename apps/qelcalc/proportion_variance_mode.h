// qelcalc test proportion|two-proportions|variance|two-variances: intervals
// and tests of one or two binomial proportions and of one variance or the
// ratio of two standard deviations.
#ifndef QELCALC_PROPORTION_VARIANCE_MODE_H
#define QELCALC_PROPORTION_VARIANCE_MODE_H

#include <ostream>
#include <string>

#include "cli.h"

namespace qelcalc {

bool isProportionOrVarianceTest(const std::string& name);

// args.positional holds the test name and then, where the test reads data,
// one table file.
int runProportionOrVarianceTest(const Arguments& args, std::ostream& out);

void printProportionVarianceUsage(std::ostream& out);

}  // namespace qelcalc

#endif
