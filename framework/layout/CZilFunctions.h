#pragma once

#include <cstdint>
#include <string_view>

namespace Tarsa {

class CExpressionScope;

// The callable view classes an expression may name: `Name(p: v, ...)` asks
// the table with the name and a scope that holds the parameters, and the
// int it answers is the value. Owned by whoever gives it to a scope.
class CZilFunctions {
 public:
  virtual ~CZilFunctions() = default;
  virtual bool Knows(std::string_view name) const = 0;
  virtual std::int32_t Call(std::string_view name, CExpressionScope& parameters) = 0;
};

}  // namespace Tarsa
