// Exported studentized maximum and maximum modulus: the armed frame around
// the kernels, with the missing value passed back as it is.
#include "utilities/distributions/studentized_maximum.h"

#include "qel/distributions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/elv/limits.h"

namespace qel {
namespace {

template <class Kernel>
double armedBare(Kernel kernel, double value, double df, const double* lambdas, unsigned count) {
  const elv::DeepTailScope deep;
  SetLynFpuStates();
  const double result = kernel(value, df, lambdas, count);
  ResetFpuStates();
  return result;
}

using Kernel = double (*)(double, double, const double*, unsigned);

}  // namespace

double GetStudentizedMaximumCritValue(double alpha, double df, const double* lambdas,
                                      unsigned count) {
  return armedBare(static_cast<Kernel>(mStudentizedMaximumCritValue), alpha, df, lambdas, count);
}

double GetStudentizedMaximumPValue(double x, double df, const double* lambdas, unsigned count) {
  return armedBare(static_cast<Kernel>(mStudentizedMaximumPValue), x, df, lambdas, count);
}

double GetStudentizedMaximumModulusCritValue(double alpha, double df, const double* lambdas,
                                             unsigned count) {
  return armedBare(static_cast<Kernel>(mStudentizedMaximumModulusCritValue), alpha, df, lambdas,
                   count);
}

double GetStudentizedMaximumModulusPValue(double x, double df, const double* lambdas,
                                          unsigned count) {
  return armedBare(static_cast<Kernel>(mStudentizedMaximumModulusPValue), x, df, lambdas, count);
}

}  // namespace qel
