// Layout files as the generator reads them: parsed, measured and placed
// (no views are made, so no display is needed). A syntax error or a file
// with the wrong number of windows is a clear refusal; the placed tree must
// keep every view within the sizes a file can give.
#include <cstddef>
#include <cstdint>
#include <stdexcept>
#include <string_view>

#include "framework/layout/CViewProxy.h"
#include "framework/layout/CZilGenerator.h"
#include "tests/fuzz/FuzzSupport.h"

namespace {

void Check(const Tarsa::CViewProxy& proxy, int depth) {
  if (depth > Tarsa::CZilGenerator::kMaxViews) Fuzz::Broken("a tree deeper than its views");
  if (proxy.measuredWidth < 0 || proxy.measuredHeight < 0) Fuzz::Broken("a negative size");
  for (const auto& child : proxy.children) Check(*child, depth + 1);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  try {
    Tarsa::CZilGenerator generator;
    const auto root = generator.Layout(std::string_view(reinterpret_cast<const char*>(data), size));
    if (root == nullptr) Fuzz::Broken("a layout with no root");
    Check(*root, 0);
  } catch (const std::logic_error&) {
  }
  return 0;
}
