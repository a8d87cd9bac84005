#include "framework/layout/CZilVariablePropertyList.h"

#include <memory>
#include <string>

#include "framework/layout/CExpressionScope.h"

namespace Tarsa {

void CZilVariablePropertyList::SetVariable(std::string_view name, std::int32_t value,
                                           std::string_view string, bool hasString,
                                           std::string_view expression) {
  CZilProperty::EKind kind = CZilProperty::kInt;
  if (value == CExpressionScope::kUndefined) {
    if (!hasString) return;
    kind = CZilProperty::kString;
  }
  Add(std::make_unique<CZilVariableProperty>(std::string(name), kind, value, std::string(string),
                                             std::string(expression)));
}

}  // namespace Tarsa
