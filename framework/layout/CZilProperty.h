#pragma once

#include <cstdint>
#include <string>

namespace Tarsa {

// One named property of a view as a layout file gives it: an int, a bool
// or a string (a symbol with both an int and a string keeps both; its kind
// says which it was written as).
class CZilProperty {
 public:
  enum EKind : std::int32_t { kInt = 1, kBool = 2, kString = 3 };

  CZilProperty(std::string name, EKind kind, std::int32_t value, std::string string)
      : name_(std::move(name)), kind_(kind), value_(value), string_(std::move(string)) {}
  virtual ~CZilProperty() = default;

  const std::string& Name() const { return name_; }
  EKind Kind() const { return kind_; }
  std::int32_t Int() const { return value_; }
  bool Bool() const { return value_ != 0; }
  const std::string& String() const { return string_; }

  void SetInt(std::int32_t value) {
    kind_ = kInt;
    value_ = value;
  }
  void SetBool(bool value) {
    kind_ = kBool;
    value_ = value ? 1 : 0;
  }
  void SetString(std::string string) {
    kind_ = kString;
    string_ = std::move(string);
  }

 private:
  std::string name_;
  EKind kind_;
  std::int32_t value_;
  std::string string_;
};

}  // namespace Tarsa
