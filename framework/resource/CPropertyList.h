#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "framework/resource/FourCharCode.h"

namespace Tarsa {

// The plug-in property list as a host reads it, parsed from the resource's
// bytes: a 16-bit version (1), a 32-bit word, a 32-bit count, then for each
// property a vendor signature, a four-character key, a 32-bit id, a 32-bit
// value length and the value, padded with zeros to a multiple of 4 (the
// length does not count the padding). Four-character values are little-
// endian. The list owns copies of the values. Damaged bytes throw CError.
class CPropertyList {
 public:
  struct Property {
    std::uint32_t vendor = 0;
    std::uint32_t key = 0;
    std::uint32_t id = 0;
    std::vector<std::uint8_t> value;  // without the padding
  };

  static constexpr std::uint16_t kVersion = 1;
  static constexpr std::uint32_t kVendor = FourCharCode("QMRK");
  static constexpr std::uint32_t kEnableKey = FourCharCode("enbl");
  static constexpr std::uint32_t kEntryKey = FourCharCode("wx86");

  explicit CPropertyList(std::span<const std::uint8_t> bytes);
  CPropertyList(const CPropertyList&) = delete;
  CPropertyList& operator=(const CPropertyList&) = delete;

  const std::vector<Property>& Properties() const { return properties_; }
  // The first property of the host vendor with the key; null when absent.
  const Property* Find(std::uint32_t key) const;
  // The enable expression: which image modes the host offers the filter in.
  std::string EnableExpression() const;
  // The name of the function the host calls.
  std::string EntryName() const;

 private:
  // A property's value up to its first zero byte; CError when absent.
  std::string Text(std::uint32_t key) const;

  std::vector<Property> properties_;
};

}  // namespace Tarsa
