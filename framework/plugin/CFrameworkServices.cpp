#include "framework/plugin/CFrameworkServices.h"

#include <thread>

#include "framework/memory/CMemoryService.h"
#include "framework/memory/CVirtualAllocator.h"
#include "framework/native/NativeDisplay.h"
#include "framework/process/CMessageNames.h"
#include "framework/strings/CStringTable.h"

namespace Tarsa {

namespace {
struct Services {
  bool started = false;
  std::thread::id mainThread;
};
Services& State() {
  static Services state;
  return state;
}
}  // namespace

void CFrameworkServices::Start() {
  Services& state = State();
  if (state.started) return;
  state.mainThread = std::this_thread::get_id();
  CMessageNames::Get();
  CStringTable::Get(true);
  state.started = true;
}

void CFrameworkServices::Shutdown() {
  CStringTable::Drop();
  CMemoryService::Drop();
  CVirtualAllocator::Install(nullptr);
  Native::ShutdownDisplay();
  State() = Services{};
}

bool CFrameworkServices::IsStarted() { return State().started; }

bool CFrameworkServices::IsMainThread() {
  return State().started && State().mainThread == std::this_thread::get_id();
}

}  // namespace Tarsa
