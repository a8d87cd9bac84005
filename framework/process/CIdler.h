#pragma once

#include <cstdint>

#include "framework/process/CLink.h"

namespace Tarsa {

// Background work on the main thread. Running idlers sit in one global list
// in order of falling priority; each pass of idle time gives one call of
// Idle() to the first of them, which then goes behind the others of its
// priority, so equals take turns and lower priorities wait until the higher
// ones stop. There is no time budget: Idle() should do a short step and
// answer false when there is no more work. While any idler runs the process
// never blocks for events. An idler must not delete itself inside Idle().
class CIdler : public CLink<CIdler> {
 public:
  static constexpr std::uint32_t kState_Running = 1u << 0;

  explicit CIdler(std::int16_t priority = 0);
  virtual ~CIdler();

  // Joins the list behind all idlers of equal or higher priority.
  void Start();
  void Stop();
  bool IsRunning() const { return (state_ & kState_Running) != 0; }
  std::int16_t Priority() const { return priority_; }

  // One step of work; false stops the idler.
  virtual bool Idle() = 0;

  // Whether the list holds any idler.
  static bool AnyRunning();
  // One pass of idle time; false when no idler ran. A failure of Idle() is
  // reported and the idler goes on running.
  static bool IdleOnce();

 private:
  // Where an idler of this priority goes: before the first of lower priority.
  static CIdler* FirstBelow(std::int16_t priority);

  std::int16_t priority_;
  std::uint32_t state_ = 0;
};

}  // namespace Tarsa
