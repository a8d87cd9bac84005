#pragma once

#include <cstdint>
#include <functional>

namespace Tarsa {

// A piece of work for the process's deferred queue: higher priorities run
// first, equal ones in the order posted, and an event is not run before a
// native event that happened earlier than its due time. The base runs an
// action; CMessageEvent delivers a message. The queue owns its events.
class CProcessEvent {
 public:
  CProcessEvent(std::int32_t priority, double due, std::function<void()> action = {});
  virtual ~CProcessEvent() = default;
  CProcessEvent(const CProcessEvent&) = delete;
  CProcessEvent& operator=(const CProcessEvent&) = delete;

  std::int32_t Priority() const { return priority_; }
  // Seconds, on the event source's clock.
  double Due() const { return due_; }

  virtual void Run();
  // Offered by the queue's sweep; true when this event is done with and is
  // to be deleted unrun. The base never is.
  virtual bool Sweep(std::uintptr_t value);

 private:
  std::int32_t priority_;
  double due_;
  std::function<void()> action_;
};

}  // namespace Tarsa
