#pragma once

#include <cstdint>
#include <functional>

#include "framework/plugin/HostFilterRecord.h"

namespace Tarsa {

class CQuillmarkFilter;

// The selector table of a filter module's entry: which selectors make the
// filter object (with the framework's start-up), which keep it, which tear
// it down (with the framework's shutdown), and how what is thrown becomes the
// answer. The object is the one module-wide CQuillmarkFilter; it lives
// between selectors and is owned by this table, which deletes it at tear-down.
class CPluginEntry {
 public:
  CPluginEntry() = delete;

  // Makes the module's filter object (with new); called with the framework
  // started.
  using Factory = std::function<CQuillmarkFilter*()>;

  // Serves one selector: result is set to 0 first, then to the handler's
  // answer; anything thrown is reported, tears the object down and answers 1.
  static void Dispatch(std::int16_t selector, HostFilterRecord* record, std::intptr_t* dataSlot,
                       std::int16_t* result, const Factory& make);

  // Deletes the object, if any, and shuts the framework down.
  static void TearDown();
};

}  // namespace Tarsa
