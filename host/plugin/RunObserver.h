#pragma once

#include <cstdint>

namespace Host {

// Who watches a filter run from outside: the filter's abort and progress
// callbacks end here. The program's terminal implements it; tests put in
// their own.
class RunObserver {
 public:
  virtual ~RunObserver() = default;
  // Whether the user has asked to stop.
  virtual bool AbortRequested() = 0;
  virtual void Progress(int32_t done, int32_t total) = 0;
};

}  // namespace Host
