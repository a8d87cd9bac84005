#pragma once

#include <cstdint>
#include <functional>

#include "framework/plugin/CPluginEntry.h"
#include "framework/plugin/CQuillmarkFilter.h"

namespace Tarsa::testing {

// A filter whose Do operations answer what the test says, and which counts
// how many of it were made and destroyed.
class ProbeFilter : public CQuillmarkFilter {
 public:
  struct Script {
    bool parameters = true;
    bool prepare = true;
    bool start = true;
    bool proceed = true;  // continue
    std::function<void()> onStart;
    int made = 0;
    int destroyed = 0;
    int finished = 0;
  };
  static Script& Plan() {
    static Script plan;
    return plan;
  }

  ProbeFilter() { ++Plan().made; }
  ~ProbeFilter() override { ++Plan().destroyed; }

  bool DoParameters() override { return Plan().parameters; }
  bool DoPrepareFinish() override { return Plan().prepare; }
  bool DoStart() override {
    if (Plan().onStart) Plan().onStart();
    return Plan().start;
  }
  bool DoContinue() override { return Plan().proceed; }
  void DoFinish() override { ++Plan().finished; }

  // One selector through the module's table, with this class as the object;
  // the answer word starts at a value no path gives.
  static std::int16_t Call(std::int16_t selector, HostFilterRecord* record) {
    std::int16_t result = 77;
    std::intptr_t slot = 0;
    CPluginEntry::Dispatch(selector, record, &slot, &result, [] { return new ProbeFilter; });
    return result;
  }
};

}  // namespace Tarsa::testing
