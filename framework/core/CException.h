#pragma once

#include <string>

namespace Tarsa {

// The framework's failure. Every failure of the framework and of the filter
// above it travels as one of these classes; a selector handler turns them into
// a host result and the reporter shows what reaches the top. The texts are
// keyed strings ("$$$/key=Default"), resolved only when shown, so that throwing
// never touches the string table. A silent exception is shown to nobody; an
// alertable one is shown in an alert, any other sounds the system beep.
class CException {
 public:
  CException() = default;
  CException(std::string errorText, std::string taskText, bool alertable = true);
  virtual ~CException() = default;

  CException(const CException&) = default;
  CException& operator=(const CException&) = default;

  // The keyed texts; an empty text means the exception has none.
  virtual std::string ErrorText() const { return errorText_; }
  virtual std::string TaskText() const { return taskText_; }

  bool IsSilent() const { return silent_; }
  bool IsAlertable() const { return alertable_; }
  void SetSilent(bool silent) { silent_ = silent; }
  void SetAlertable(bool alertable) { alertable_ = alertable; }

 protected:
  std::string errorText_;
  std::string taskText_;
  bool silent_ = false;
  bool alertable_ = true;
};

// A failure the framework or filter words itself.
class CError : public CException {
 public:
  explicit CError(std::string errorText, std::string taskText = {}, bool alertable = true)
      : CException(std::move(errorText), std::move(taskText), alertable) {}
};

// The user's cancel. Silent by default, so a cancelled run shows nothing.
class CAbort : public CException {
 public:
  explicit CAbort(bool silent = true, bool alertable = false);
};

// A failure of the operating system, or one of the framework's fixed codes
// below. Codes other than the fixed ones are the system's error numbers.
class CSystemError : public CException {
 public:
  static constexpr int kNoSuchFile = 2;
  static constexpr int kNoSuchFolder = 3;
  static constexpr int kEndOfFile = 38;
  static constexpr int kNotADirectory = 267;

  explicit CSystemError(int code);

  int Code() const { return code_; }
  std::string ErrorText() const override;

  // The error of the last failed system call (errno).
  static CSystemError FromLastError();

 private:
  int code_;
};

}  // namespace Tarsa
