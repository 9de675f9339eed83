// The library's exception vocabulary: a tree over the standard exceptions so
// that code may catch by it. Running code throws the standard classes
// themselves (see the SIGFPE handler and the checked functions); of these own
// classes only the matrix exceptions and AllegeException are thrown.
#ifndef QEL_SRC_UTILITIES_LYNEXCEPTIONS_H
#define QEL_SRC_UTILITIES_LYNEXCEPTIONS_H

#include <stdexcept>
#include <string>

namespace qel {

class CmException : public std::exception {
 public:
  CmException() {}
  ~CmException() override;
};

// Classes over a standard exception that carries a message.
#define QEL_DECLARE_MESSAGE_EXCEPTION(Name, Base)          \
  class Name : public Base {                               \
   public:                                                 \
    explicit Name(const std::string& what) : Base(what) {} \
    ~Name() override;                                      \
  };

QEL_DECLARE_MESSAGE_EXCEPTION(CmLogicError, std::logic_error)
QEL_DECLARE_MESSAGE_EXCEPTION(CmLengthError, std::length_error)
QEL_DECLARE_MESSAGE_EXCEPTION(CmDomainError, std::domain_error)
QEL_DECLARE_MESSAGE_EXCEPTION(CmOutOfRange, std::out_of_range)
QEL_DECLARE_MESSAGE_EXCEPTION(CmInvalidArgument, std::invalid_argument)
QEL_DECLARE_MESSAGE_EXCEPTION(CmRuntimeError, std::runtime_error)
QEL_DECLARE_MESSAGE_EXCEPTION(CmRangeError, std::range_error)
QEL_DECLARE_MESSAGE_EXCEPTION(CmFloatException, std::runtime_error)
QEL_DECLARE_MESSAGE_EXCEPTION(CmFloatOverflow, std::overflow_error)
QEL_DECLARE_MESSAGE_EXCEPTION(CmFloatZeroDivide, std::runtime_error)
QEL_DECLARE_MESSAGE_EXCEPTION(CmUnderflowError, std::underflow_error)

#undef QEL_DECLARE_MESSAGE_EXCEPTION

class CmNoConvergence : public CmFloatException {
 public:
  CmNoConvergence() : CmFloatException("float exception") {}
  ~CmNoConvergence() override;
};

class CmMissionImpossible : public std::exception {
 public:
  CmMissionImpossible() {}
  ~CmMissionImpossible() override;
};

class CmOutOfMemory : public std::exception {
 public:
  CmOutOfMemory() {}
  ~CmOutOfMemory() override;
};

class CmUnexpectedException : public std::exception {
 public:
  CmUnexpectedException() {}
  ~CmUnexpectedException() override;
};

// A user's interruption request. Nothing in the library polls it; hosts that
// hold one may use it. Despite the name of its accessors it is per instance.
class CmCtrlBreak {
 public:
  CmCtrlBreak() : mCtrlBreakEncountered(false) {}
  virtual ~CmCtrlBreak();
  // Hook for work to be done at a break; nothing to do here.
  void mCleanup() const {}
  bool mGetGlobalCtrlBreakEncountered() const { return mCtrlBreakEncountered; }
  void mSetGlobalCtrlBreakEncountered(bool value) { mCtrlBreakEncountered = value; }

 private:
  bool mCtrlBreakEncountered;
};

// Appends "text : value" to trace.txt in the current directory (diagnostics).
void matrix_trace(const std::string& text, int value);

namespace allege {

class AllegeException : public std::runtime_error {
 public:
  explicit AllegeException(const std::string& what) : std::runtime_error(what) {}
  ~AllegeException() override;
};

// Throws AllegeException with "assertion failed: (<expression>) <file>: <line>".
[[noreturn]] void AllegeFailure(const std::string& expression, const std::string& file, int line);

}  // namespace allege
}  // namespace qel

// Checks that stay active in released code.
#define QEL_ALLEGE(condition)         \
  ((condition) ? static_cast<void>(0) \
               : ::qel::allege::AllegeFailure(#condition, __FILE__, __LINE__))

#endif
