#include "framework/layout/CZilPropertyList.h"

#include <cstdlib>

namespace Tarsa {
namespace {

// The second spelling of a name that has two, or empty.
std::string_view OtherSpelling(std::string_view name) {
  static constexpr std::string_view kPairs[][2] = {
      {"outset_width", "width_outset"},   {"outset_height", "height_outset"},
      {"outset_left", "left_outset"},     {"outset_top", "top_outset"},
      {"outset_right", "right_outset"},   {"outset_bottom", "bottom_outset"},
      {"cushion_left", "left_cushion"},   {"cushion_top", "top_cushion"},
      {"cushion_right", "right_cushion"}, {"cushion_bottom", "bottom_cushion"},
      {"cushion_x", "x_cushion"},         {"cushion_y", "y_cushion"}};
  for (const auto& pair : kPairs) {
    if (pair[0] == name) return pair[1];
    if (pair[1] == name) return pair[0];
  }
  return {};
}

}  // namespace

const CZilProperty* CZilPropertyList::Find(std::string_view name) const {
  for (const auto& property : properties_) {
    if (property->Name() == name) return property.get();
  }
  const std::string_view other = OtherSpelling(name);
  if (!other.empty()) {
    for (const auto& property : properties_) {
      if (property->Name() == other) return property.get();
    }
  }
  return nullptr;
}

CZilProperty* CZilPropertyList::FindMutable(std::string_view name) {
  return const_cast<CZilProperty*>(Find(name));
}

bool CZilPropertyList::GetInt(std::string_view name, std::int32_t& out) const {
  const CZilProperty* property = Find(name);
  if (property == nullptr || property->Kind() == CZilProperty::kString) return false;
  out = property->Int();
  return true;
}

bool CZilPropertyList::GetBool(std::string_view name, bool& out) const {
  std::int32_t value = 0;
  if (!GetInt(name, value)) return false;
  out = value != 0;
  return true;
}

bool CZilPropertyList::GetString(std::string_view name, std::string& out) const {
  const CZilProperty* property = Find(name);
  // A four-character string is also an int, and still a string.
  if (property == nullptr ||
      (property->Kind() != CZilProperty::kString && property->String().empty())) {
    return false;
  }
  out = property->String();
  return true;
}

bool CZilPropertyList::GetDouble(std::string_view name, double& out) const {
  const CZilProperty* property = Find(name);
  if (property == nullptr) return false;
  if (property->Kind() != CZilProperty::kString) {
    out = property->Int();
    return true;
  }
  const std::string& text = property->String();
  char* end = nullptr;
  const double value = std::strtod(text.c_str(), &end);
  if (end == text.c_str()) return false;
  out = value;
  return true;
}

void CZilPropertyList::SetInt(std::string_view name, std::int32_t value) {
  if (CZilProperty* property = FindMutable(name)) {
    property->SetInt(value);
  } else {
    Add(std::make_unique<CZilProperty>(std::string(name), CZilProperty::kInt, value, ""));
  }
}

void CZilPropertyList::SetBool(std::string_view name, bool value) {
  if (CZilProperty* property = FindMutable(name)) {
    property->SetBool(value);
  } else {
    Add(std::make_unique<CZilProperty>(std::string(name), CZilProperty::kBool, value ? 1 : 0, ""));
  }
}

void CZilPropertyList::SetString(std::string_view name, std::string_view value) {
  if (CZilProperty* property = FindMutable(name)) {
    property->SetString(std::string(value));
  } else {
    Add(std::make_unique<CZilProperty>(std::string(name), CZilProperty::kString, 0,
                                       std::string(value)));
  }
}

}  // namespace Tarsa
