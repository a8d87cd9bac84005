#include "framework/plugin/CQuillmarkError.h"

namespace Tarsa {

CQuillmarkError::CQuillmarkError(std::int16_t code) : code_(code) {}

std::string CQuillmarkError::ErrorText() const { return TextFor(code_); }

std::string CQuillmarkError::TextFor(std::int16_t code) {
  switch (code) {
    case -128:
      return "$$$/Tarsa/QuillmarkError/userCanceledErr=The operation was canceled.";
    case -111:
      return "$$$/Tarsa/QuillmarkError/memWZErr=An attempt was made to operate on a free memory "
             "block.";
    case -109:
      return "$$$/Tarsa/QuillmarkError/nilHandleErr=An attempt was made to use a NULL handle.";
    case -108:
      return "$$$/Tarsa/QuillmarkError/memFullErr=There is not enough memory.";
    case -50:
      return "$$$/Tarsa/QuillmarkError/paramErr=There is an error in the parameter list.";
    case -46:
      return "$$$/Tarsa/QuillmarkError/vLckdErr=The disk volume is locked.";
    case -45:
      return "$$$/Tarsa/QuillmarkError/fLckdErr=The file is locked.";
    case -43:
      return "$$$/Tarsa/QuillmarkError/fnfErr=The file or directory could not be found.";
    case -39:
      return "$$$/Tarsa/QuillmarkError/eofErr=The end of the data was prematurely reached.";
    case -36:
      return "$$$/Tarsa/QuillmarkError/ioErr=A file system error has occurred.";
    case -34:
      return "$$$/Tarsa/QuillmarkError/dskFulErr=The disk is full.";
    case -23:
      return "$$$/Tarsa/QuillmarkError/openErr=The requested read or write permission is not "
             "allowed.";
    case -20:
      return "$$$/Tarsa/QuillmarkError/writErr=The data could not be written.";
    case -19:
      return "$$$/Tarsa/QuillmarkError/readErr=The data could not be read.";
    default:
      return "$$$/Tarsa/QuillmarkError/Unknown=An unknown host error has occurred.";
  }
}

}  // namespace Tarsa
