// The error code of the calling thread's ELV run. The exported ELVerrno is
// one process-wide variable, so a decision taken on it can read another
// thread's failure; the routines and their wrappers decide on this
// per-thread copy instead, which ELVstartup and ELVexit keep beside the
// exported one (and the exported variables keep their meaning for hosts).
#ifndef QEL_SRC_UTILITIES_ELV_THREAD_STATUS_H
#define QEL_SRC_UTILITIES_ELV_THREAD_STATUS_H

namespace qel {
namespace elv {

int threadStatus();
// Stores a code directly (in both places), as a routine that carries an
// inner run's code out does.
void storeStatus(int code);

}  // namespace elv
}  // namespace qel

#endif
