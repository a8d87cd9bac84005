#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "framework/layout/CZilProperty.h"

namespace Tarsa {

// The properties of one view, in the order they were given, found by name.
// A getter answers whether the name is present and leaves its output alone
// when it is not, so a builder writes its default first and then asks. A
// name with two spellings (outset_width and width_outset...) is found by
// either. Owns its properties.
class CZilPropertyList {
 public:
  virtual ~CZilPropertyList() = default;

  const CZilProperty* Find(std::string_view name) const;
  bool Has(std::string_view name) const { return Find(name) != nullptr; }
  std::size_t Size() const { return properties_.size(); }
  const CZilProperty& At(std::size_t index) const { return *properties_[index]; }

  bool GetInt(std::string_view name, std::int32_t& out) const;
  bool GetBool(std::string_view name, bool& out) const;
  bool GetString(std::string_view name, std::string& out) const;
  // An int, or a string such as "0.001" read as a decimal number.
  bool GetDouble(std::string_view name, double& out) const;

  void SetInt(std::string_view name, std::int32_t value);
  void SetBool(std::string_view name, bool value);
  void SetString(std::string_view name, std::string_view value);

 protected:
  CZilProperty* FindMutable(std::string_view name);
  void Add(std::unique_ptr<CZilProperty> property) { properties_.push_back(std::move(property)); }

 private:
  std::vector<std::unique_ptr<CZilProperty>> properties_;
};

}  // namespace Tarsa
