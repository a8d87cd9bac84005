#pragma once

#include <string>

#include "framework/layout/CZilProperty.h"

namespace Tarsa {

// A property that also keeps the text it was written with in the file, so
// that a tool can show or write the expression again, not only its value.
class CZilVariableProperty : public CZilProperty {
 public:
  CZilVariableProperty(std::string name, EKind kind, std::int32_t value, std::string string,
                       std::string expression)
      : CZilProperty(std::move(name), kind, value, std::move(string)),
        expression_(std::move(expression)) {}

  const std::string& Expression() const { return expression_; }

 private:
  std::string expression_;
};

}  // namespace Tarsa
