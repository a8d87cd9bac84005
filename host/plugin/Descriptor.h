#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <unordered_map>
#include <vector>

namespace Host {

// A descriptor: the keyed record of a filter's parameters that lets the host
// replay a run. Keys are four-character codes and keep the order in which
// they were first put; putting a key again replaces its value in place.
// Values are typed: a 32-bit integer, a 64-bit float, an enumerated value
// (a type code and a value code) or data (bytes). A plain value; copies are
// independent.
//
// The byte form, as a descriptor travels in a handle (little-endian):
//
//    0  u32  magic, the characters "ADsc" read as one code (first highest)
//    4  u32  format version, 1
//    8  u32  number of items
//   12  items, each: u32 key, u32 type code, then by type
//         'long'  i32 value
//         'doub'  f64 value (IEEE 754)
//         'enum'  u32 type, u32 value
//         'tdta'  u32 length, the bytes, zeros up to a multiple of 4
//
// Nothing may follow the last item; a key occurs once.
class Descriptor {
 public:
  enum class Type : uint32_t {
    kInteger = 0x6c6f6e67,     // 'long'
    kFloat = 0x646f7562,       // 'doub'
    kEnumerated = 0x656e756d,  // 'enum'
    kData = 0x74647461,        // 'tdta'
  };

  struct Item {
    uint32_t key = 0;
    Type type = Type::kInteger;
    int32_t integer = 0;
    double number = 0.0;
    uint32_t enumType = 0;
    uint32_t enumValue = 0;
    std::vector<uint8_t> data;

    // Floats compare by their bits, so a round trip is checked exactly.
    bool operator==(const Item& other) const;
  };

  static constexpr uint32_t kMagic = 0x41447363;  // "ADsc"
  static constexpr uint32_t kVersion = 1;

  void PutInteger(uint32_t key, int32_t value);
  void PutFloat(uint32_t key, double value);
  void PutEnumerated(uint32_t key, uint32_t type, uint32_t value);
  void PutData(uint32_t key, std::span<const uint8_t> bytes);

  // Null when the key is absent.
  const Item* Find(uint32_t key) const;
  const std::vector<Item>& Items() const { return items_; }
  size_t Count() const { return items_.size(); }

  std::vector<uint8_t> ToBytes() const;
  // Throws HostError saying what is wrong with the bytes.
  static Descriptor FromBytes(std::span<const uint8_t> bytes);

  bool operator==(const Descriptor& other) const = default;

  // "integer", "float", "enumerated", "data".
  static const char* TypeName(Type type);

 private:
  Item& Slot(uint32_t key, Type type);

  std::vector<Item> items_;
  // Each key's place in items_, so that reading a descriptor of many keys,
  // which looks every key up, takes time in proportion to its size.
  std::unordered_map<uint32_t, size_t> places_;
};

}  // namespace Host
