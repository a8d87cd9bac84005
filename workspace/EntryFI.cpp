#include "workspace/EntryFI.h"

#include "framework/plugin/CPluginEntry.h"
#include "workspace/PWorkspaceFilter.h"

// The module is built with hidden visibility; this is the one symbol it shows.
extern "C" __attribute__((visibility("default"))) void EntryFI(std::int16_t selector,
                                                               Tarsa::HostFilterRecord* record,
                                                               std::intptr_t* dataSlot,
                                                               std::int16_t* result) {
  Tarsa::CPluginEntry::Dispatch(selector, record, dataSlot, result,
                                [] { return new Project::PWorkspaceFilter(); });
}
