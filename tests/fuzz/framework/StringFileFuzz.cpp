// The UTF-16 string files that localise the module's texts.
#include <cstddef>
#include <cstdint>

#include "framework/strings/CStringTable.h"
#include "framework/strings/StringFile.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Tarsa::CStringTable table;
  Tarsa::LoadStringFile(table, data, size);
  // No entry read can outnumber the lines, which each take two bytes or more.
  if (table.Count() > size / 2 + 1) Fuzz::Broken("more entries than lines");
  return 0;
}
