#include "host/app/TerminalProgress.h"

#include <algorithm>
#include <cstdio>

#include "host/platform/Interruption.h"
#include "host/platform/SystemInfo.h"

namespace Host {

TerminalProgress::TerminalProgress(std::string label)
    : label_(std::move(label)), terminal_(SystemInfo::ErrorIsTerminal()) {}

TerminalProgress::~TerminalProgress() { Clear(); }

bool TerminalProgress::AbortRequested() { return Interruption::Requested(); }

void TerminalProgress::Progress(int32_t done, int32_t total) {
  if (!firstReport_) firstReport_ = std::chrono::steady_clock::now();
  if (!terminal_ || total <= 0) return;
  const int percent = static_cast<int>(std::clamp<int64_t>(int64_t{done} * 100 / total, 0, 100));
  if (percent == shown_) return;
  shown_ = percent;
  std::fprintf(stderr, "\r\033[Karchway: %s %3d%%", label_.c_str(), percent);
  std::fflush(stderr);
}

void TerminalProgress::Clear() {
  if (shown_ < 0) return;
  shown_ = -1;
  std::fputs("\r\033[K", stderr);
  std::fflush(stderr);
}

}  // namespace Host
