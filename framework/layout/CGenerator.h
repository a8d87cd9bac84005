#pragma once

#include <memory>
#include <string_view>

namespace Tarsa {

class CWindow;

// What builds a window from a description of it; the layout language's
// generator is the one there is.
class CGenerator {
 public:
  virtual ~CGenerator() = default;
  // The window the text describes, owned by the caller; `owner` is the
  // window it opens over, or null.
  virtual std::unique_ptr<CWindow> Generate(std::string_view text, const CWindow* owner) = 0;
};

}  // namespace Tarsa
