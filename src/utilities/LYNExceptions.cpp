#include "utilities/LYNExceptions.h"

#include <fstream>
#include <sstream>

namespace qel {

// Out-of-line destructors anchor each class's vtable in this file.
CmException::~CmException() {}
CmLogicError::~CmLogicError() {}
CmLengthError::~CmLengthError() {}
CmDomainError::~CmDomainError() {}
CmOutOfRange::~CmOutOfRange() {}
CmInvalidArgument::~CmInvalidArgument() {}
CmRuntimeError::~CmRuntimeError() {}
CmRangeError::~CmRangeError() {}
CmFloatException::~CmFloatException() {}
CmFloatOverflow::~CmFloatOverflow() {}
CmFloatZeroDivide::~CmFloatZeroDivide() {}
CmUnderflowError::~CmUnderflowError() {}
CmNoConvergence::~CmNoConvergence() {}
CmMissionImpossible::~CmMissionImpossible() {}
CmOutOfMemory::~CmOutOfMemory() {}
CmUnexpectedException::~CmUnexpectedException() {}
CmCtrlBreak::~CmCtrlBreak() {}

void matrix_trace(const std::string& text, int value) {
  static std::ofstream trace("trace.txt", std::ios::out | std::ios::trunc);
  trace << text << " : " << value << '\n';
  trace.flush();
}

namespace allege {

AllegeException::~AllegeException() {}

void AllegeFailure(const std::string& expression, const std::string& file, int line) {
  std::ostringstream text;
  text << "assertion failed: (" << expression << ") " << file << ": " << line;
  throw AllegeException(text.str());
}

}  // namespace allege
}  // namespace qel
