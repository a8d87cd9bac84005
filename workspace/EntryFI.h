#pragma once

#include <cstdint>

#include "framework/plugin/HostFilterRecord.h"

// The module's one export: the host calls it once for every selector of a
// filter run. selector: 0 about, 1 parameters, 2 prepare, 3 start,
// 4 continue, 5 finish; anything else is answered 0 and does nothing.
// *result is 0, 1, or a host error code.
extern "C" void EntryFI(std::int16_t selector, Tarsa::HostFilterRecord* record,
                        std::intptr_t* dataSlot, std::int16_t* result);
