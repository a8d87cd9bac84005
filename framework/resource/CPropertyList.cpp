#include "framework/resource/CPropertyList.h"

#include <algorithm>
#include <utility>

#include "framework/core/CException.h"
#include "framework/files/CConstContainer.h"
#include "framework/resource/ResourceStreams.h"

namespace Tarsa {
namespace {

constexpr const char* kDamagedText =
    "$$$/Tarsa/PropertyList/Error/Damaged=The plug-in property list is damaged.";

}  // namespace

CPropertyList::CPropertyList(std::span<const std::uint8_t> bytes) {
  ReadOrDamaged(kDamagedText, [&] {
    CConstContainer in(bytes);
    if (in.ReadU16() != kVersion) {
      throw CError(
          "$$$/Tarsa/PropertyList/Error/Version=The plug-in property list has a version "
          "this host does not read.");
    }
    in.ReadU32();
    const std::uint32_t count = in.ReadU32();
    // Each property takes at least 16 bytes: a bound before reserving.
    if (count > (in.Size() - in.Position()) / 16) throw CError(kDamagedText);
    properties_.reserve(count);
    for (std::uint32_t i = 0; i < count; ++i) {
      Property property;
      property.vendor = in.ReadU32();
      property.key = in.ReadU32();
      property.id = in.ReadU32();
      const std::uint32_t length = in.ReadU32();
      const auto value = in.ReadView(length);
      property.value.assign(value.begin(), value.end());
      in.SkipRead((4 - length % 4) % 4);
      properties_.push_back(std::move(property));
    }
  });
}

const CPropertyList::Property* CPropertyList::Find(std::uint32_t key) const {
  const auto found = std::find_if(properties_.begin(), properties_.end(), [key](const auto& p) {
    return p.vendor == kVendor && p.key == key;
  });
  return found == properties_.end() ? nullptr : &*found;
}

std::string CPropertyList::Text(std::uint32_t key) const {
  const Property* property = Find(key);
  if (property == nullptr) {
    throw CError("$$$/Tarsa/PropertyList/Error/Missing=The plug-in property list has no '" +
                 FourCharText(key) + "' property.");
  }
  const auto& value = property->value;
  const auto end = std::find(value.begin(), value.end(), 0);
  return std::string(value.begin(), end);
}

std::string CPropertyList::EnableExpression() const { return Text(kEnableKey); }

std::string CPropertyList::EntryName() const { return Text(kEntryKey); }

}  // namespace Tarsa
