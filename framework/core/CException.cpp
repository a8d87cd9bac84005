#include "framework/core/CException.h"

#include <cerrno>
#include <cstring>
#include <utility>

namespace Tarsa {

CException::CException(std::string errorText, std::string taskText, bool alertable)
    : errorText_(std::move(errorText)), taskText_(std::move(taskText)), alertable_(alertable) {}

CAbort::CAbort(bool silent, bool alertable)
    : CException("$$$/Tarsa/Abort/Error=The operation has been canceled.",
                 "$$$/Tarsa/Abort/Task=The operation was not completed.", alertable) {
  silent_ = silent;
}

CSystemError::CSystemError(int code) : code_(code) {}

std::string CSystemError::ErrorText() const {
  switch (code_) {
    case kNoSuchFile:
      return "$$$/Tarsa/SystemError/NoSuchFile=The file could not be found.";
    case kNoSuchFolder:
      return "$$$/Tarsa/SystemError/NoSuchFolder=The folder could not be found.";
    case kEndOfFile:
      return "$$$/Tarsa/SystemError/EndOfFile=The end of the file was reached.";
    case kNotADirectory:
      return "$$$/Tarsa/SystemError/NotADirectory=The path does not name a folder.";
    default:
      break;
  }
  // Not a keyed string: the system's own wording, which carries no '$$$'.
  return std::string(std::strerror(code_)) + " (" + std::to_string(code_) + ")";
}

CSystemError CSystemError::FromLastError() { return CSystemError(errno != 0 ? errno : EIO); }

}  // namespace Tarsa
