#pragma once

#include <string_view>

#include "framework/layout/CZilPropertyList.h"
#include "framework/layout/CZilVariableProperty.h"

namespace Tarsa {

// The property list the parser fills for a view: each property with the
// expression text it was written as. The generator holds it only while the
// view is built.
class CZilVariablePropertyList : public CZilPropertyList {
 public:
  // Sets a property from a symbol: a defined int makes an int, else a
  // string makes a string; neither (the undefined value) leaves it absent.
  void SetVariable(std::string_view name, std::int32_t value, std::string_view string,
                   bool hasString, std::string_view expression);
  const CZilVariableProperty* FindVariable(std::string_view name) const {
    return dynamic_cast<const CZilVariableProperty*>(Find(name));
  }
};

}  // namespace Tarsa
