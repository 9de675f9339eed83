// Exported studentized range functions: the armed frame around the kernels,
// with the missing value passed back as it is; the normal range in the armed
// frame with NaN for the missing value.
#include "interfaces/math/frames.h"
#include "qel/distributions.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/normal_range.h"
#include "utilities/distributions/studentized_range.h"
#include "utilities/elv/limits.h"

namespace qel {
namespace {

template <class Kernel, class... Args>
double armedBare(Kernel kernel, Args... args) {
  const elv::DeepTailScope deep;
  SetLynFpuStates();
  const double result = kernel(args...);
  ResetFpuStates();
  return result;
}

}  // namespace

bool IsStudentizedRangePossible(int k, double df, double alpha) {
  return mIsStudentizedRangePossible(k, df, alpha);
}

// The maximum answers by the rule of the maximum modulus.
bool IsStudentizedMaximumPossible(int k, double df, double alpha) {
  return mIsStudentizedMaximumModulusPossible(k, df, alpha);
}

bool IsStudentizedMaximumModulusPossible(int k, double df, double alpha) {
  return mIsStudentizedMaximumModulusPossible(k, df, alpha);
}

double GetStudentizedRangeCritValue(double alpha, int k, double df) {
  return armedBare(mStudentizedRangeCritValue, alpha, k, df);
}

double GetStudentizedRangePValue(double q, int k, double df) {
  return armedBare(mStudentizedRangePValue, q, k, df);
}

namespace v0 {

double NormalRangeCdf(double r, int k, bool upperTail) {
  return frame::armed(mNormalRangeCdf, r, k, upperTail);
}

double NormalRangeInvCdf(double p, int k) {
  return frame::armed(mNormalRangeInvCdf, p, k);
}

}  // namespace v0
}  // namespace qel
