// Checks of parameter domains, made before any library call so that a value
// outside its domain is a one-line error naming the parameter and its range
// rather than a NaN or a message code further on. The library's own answers
// for such values are unchanged; only qelcalc refuses to ask.
#ifndef QELCALC_DOMAIN_H
#define QELCALC_DOMAIN_H

#include <string>

#include "cli.h"

namespace qelcalc {

enum class Domain {
  kAny,          // any number
  kPositive,     // (0, inf): sigma, scale, degrees of freedom, shapes
  kProbability,  // [0, 1]: probabilities
  kLevel,        // (0, 1): significance and confidence levels
  kCount,        // 0, 1, 2, ...: whole counts
  kWhole,        // ..., -1, 0, 1, ...: whole numbers of either sign
};

// The value itself, or a UsageError "NAME: VALUE is outside RANGE" where
// RANGE reads e.g. "a positive number (0, inf)".
double checkDomain(double value, const std::string& name, Domain domain);

// The domain of a distribution parameter by its option name (sigma, sd,
// scale, df, df1, df2, shape, a, b, r positive; p a probability; n, N, M
// counts); kAny for a name without a fixed domain.
Domain parameterDomain(const std::string& name);

// The number given as --name (fallback when absent), checked against domain.
double domainOption(const Arguments& args, const std::string& name, double fallback, Domain domain);

// checkDomain with the domain of parameterDomain(name), reported as --name.
double checkParameter(double value, const std::string& name);

}  // namespace qelcalc

#endif
