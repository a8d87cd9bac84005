#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>

#include "host/plugin/RunObserver.h"

namespace Host {

// The terminal's side of a run: Ctrl-C (through Interruption) is the abort
// request, and progress is shown as a percentage on standard error, only
// when that is a terminal, redrawn in place and cleared at the end. One per
// image; owns nothing.
class TerminalProgress : public RunObserver {
 public:
  explicit TerminalProgress(std::string label);
  ~TerminalProgress() override;

  TerminalProgress(const TerminalProgress&) = delete;
  TerminalProgress& operator=(const TerminalProgress&) = delete;

  bool AbortRequested() override;
  void Progress(int32_t done, int32_t total) override;
  // Removes the progress line, if one is shown.
  void Clear();
  // When the first progress report came, if one did.
  const std::optional<std::chrono::steady_clock::time_point>& FirstReport() const {
    return firstReport_;
  }

 private:
  std::string label_;
  bool terminal_;
  int shown_ = -1;
  std::optional<std::chrono::steady_clock::time_point> firstReport_;
};

}  // namespace Host
