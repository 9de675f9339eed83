/// \file
/// Random generation: the clock seed that the library uses when a caller gives
/// none. A host that wants to record where a stream started can ask for one
/// here and pass it as an explicit seed.
#ifndef QEL_RANDOM_H
#define QEL_RANDOM_H

#include <qel/export.h>

namespace qel {

/// Seconds * 1e7 + microseconds of the system clock, as a double. No
/// floating-point frame is set around it.
QEL_API double Seeder();

}  // namespace qel

#endif
