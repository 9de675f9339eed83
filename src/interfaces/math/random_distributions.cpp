// Exported closed-form families: Cauchy, Logistic, LogLogistic and Triangular
// in the armed frame, Uniform in the bare frame.
#include <qel/distributions.h>

#include "interfaces/math/frames.h"
#include "utilities/Distributions.h"

namespace qel {

namespace {

// The bare frame's scalar form: the kernel itself.
template <class Kernel, class... Params>
double bare(Kernel kernel, double x, Params... params) {
  return kernel(x, params...);
}

}  // namespace

QEL_DEFINE_ARMED_FAMILY(Cauchy, (double location, double scale), (location, scale))
QEL_DEFINE_ARMED_FAMILY(Logistic, (double location, double scale), (location, scale))
QEL_DEFINE_ARMED_FAMILY(LogLogistic, (double location, double scale, double threshold),
                        (location, scale, threshold))
QEL_DEFINE_ARMED_FAMILY(Triangular, (double lower, double mode, double upper), (lower, mode, upper))

QEL_DEFINE_FAMILY_FUNCTION(UniformPdf, mUniformPdf, bare, frame::bareArray,
                           (double lower, double upper), (lower, upper))
QEL_DEFINE_FAMILY_FUNCTION(UniformCdf, mUniformCdf, bare, frame::bareArray,
                           (double lower, double upper, bool upperTail), (lower, upper, upperTail))
QEL_DEFINE_FAMILY_FUNCTION(UniformInvCdf, mUniformInvCdf, bare, frame::bareArray,
                           (double lower, double upper), (lower, upper))

}  // namespace qel
