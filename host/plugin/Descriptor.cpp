#include "host/plugin/Descriptor.h"

#include <bit>
#include <cstring>

#include "framework/resource/FourCharCode.h"
#include "host/io/HostError.h"

namespace Host {

namespace {

void PutU32(std::vector<uint8_t>& out, uint32_t value) {
  for (int i = 0; i < 4; ++i) out.push_back(static_cast<uint8_t>(value >> (8 * i)));
}

void PutU64(std::vector<uint8_t>& out, uint64_t value) {
  for (int i = 0; i < 8; ++i) out.push_back(static_cast<uint8_t>(value >> (8 * i)));
}

// Reads the byte form front to back; every read checks what is left.
class Reader {
 public:
  explicit Reader(std::span<const uint8_t> bytes) : bytes_(bytes) {}

  size_t Left() const { return bytes_.size() - position_; }

  uint32_t U32(const char* what) {
    Need(4, what);
    uint32_t value = 0;
    for (int i = 0; i < 4; ++i) value |= static_cast<uint32_t>(bytes_[position_ + i]) << (8 * i);
    position_ += 4;
    return value;
  }

  uint64_t U64(const char* what) {
    const uint64_t low = U32(what);
    return low | static_cast<uint64_t>(U32(what)) << 32;
  }

  std::span<const uint8_t> Bytes(size_t count, const char* what) {
    Need(count, what);
    auto out = bytes_.subspan(position_, count);
    position_ += count;
    return out;
  }

 private:
  void Need(size_t count, const char* what) const {
    if (Left() < count) throw HostError(std::string("the descriptor ends inside ") + what);
  }

  std::span<const uint8_t> bytes_;
  size_t position_ = 0;
};

}  // namespace

bool Descriptor::Item::operator==(const Item& other) const {
  return key == other.key && type == other.type && integer == other.integer &&
         std::bit_cast<uint64_t>(number) == std::bit_cast<uint64_t>(other.number) &&
         enumType == other.enumType && enumValue == other.enumValue && data == other.data;
}

Descriptor::Item& Descriptor::Slot(uint32_t key, Type type) {
  auto place = places_.find(key);
  if (place == places_.end()) {
    items_.push_back(Item{});
    try {
      place = places_.emplace(key, items_.size() - 1).first;
    } catch (...) {
      items_.pop_back();
      throw;
    }
  }
  Item& item = items_[place->second];
  item = Item{};
  item.key = key;
  item.type = type;
  return item;
}

void Descriptor::PutInteger(uint32_t key, int32_t value) {
  Slot(key, Type::kInteger).integer = value;
}

void Descriptor::PutFloat(uint32_t key, double value) { Slot(key, Type::kFloat).number = value; }

void Descriptor::PutEnumerated(uint32_t key, uint32_t type, uint32_t value) {
  Item& item = Slot(key, Type::kEnumerated);
  item.enumType = type;
  item.enumValue = value;
}

void Descriptor::PutData(uint32_t key, std::span<const uint8_t> bytes) {
  Slot(key, Type::kData).data.assign(bytes.begin(), bytes.end());
}

const Descriptor::Item* Descriptor::Find(uint32_t key) const {
  const auto found = places_.find(key);
  return found != places_.end() ? &items_[found->second] : nullptr;
}

std::vector<uint8_t> Descriptor::ToBytes() const {
  std::vector<uint8_t> out;
  PutU32(out, kMagic);
  PutU32(out, kVersion);
  PutU32(out, static_cast<uint32_t>(items_.size()));
  for (const Item& item : items_) {
    PutU32(out, item.key);
    PutU32(out, static_cast<uint32_t>(item.type));
    switch (item.type) {
      case Type::kInteger:
        PutU32(out, static_cast<uint32_t>(item.integer));
        break;
      case Type::kFloat:
        PutU64(out, std::bit_cast<uint64_t>(item.number));
        break;
      case Type::kEnumerated:
        PutU32(out, item.enumType);
        PutU32(out, item.enumValue);
        break;
      case Type::kData:
        PutU32(out, static_cast<uint32_t>(item.data.size()));
        out.insert(out.end(), item.data.begin(), item.data.end());
        out.resize(out.size() + (4 - item.data.size() % 4) % 4, 0);
        break;
    }
  }
  return out;
}

Descriptor Descriptor::FromBytes(std::span<const uint8_t> bytes) {
  Reader in(bytes);
  if (in.U32("its header") != kMagic) throw HostError("the bytes are not a descriptor");
  const uint32_t version = in.U32("its header");
  if (version != kVersion) {
    throw HostError("the descriptor has format version " + std::to_string(version) + ", not " +
                    std::to_string(kVersion));
  }
  const uint32_t count = in.U32("its header");
  // The smallest item takes 12 bytes: a count beyond that is damage, and
  // must not be believed before anything is allocated for it.
  if (count > in.Left() / 12) throw HostError("the descriptor's item count exceeds its size");
  Descriptor descriptor;
  for (uint32_t i = 0; i < count; ++i) {
    const uint32_t key = in.U32("an item");
    const uint32_t type = in.U32("an item");
    if (descriptor.Find(key) != nullptr) {
      throw HostError("the descriptor holds the key '" + Tarsa::FourCharText(key) + "' twice");
    }
    switch (static_cast<Type>(type)) {
      case Type::kInteger:
        descriptor.PutInteger(key, static_cast<int32_t>(in.U32("an integer")));
        break;
      case Type::kFloat:
        descriptor.PutFloat(key, std::bit_cast<double>(in.U64("a float")));
        break;
      case Type::kEnumerated: {
        const uint32_t enumType = in.U32("an enumerated value");
        descriptor.PutEnumerated(key, enumType, in.U32("an enumerated value"));
        break;
      }
      case Type::kData: {
        const uint32_t length = in.U32("a data item");
        const size_t padded = length + static_cast<size_t>((4 - length % 4) % 4);
        if (padded > in.Left()) throw HostError("the descriptor ends inside a data item");
        descriptor.PutData(key, in.Bytes(padded, "a data item").first(length));
        break;
      }
      default:
        throw HostError("the descriptor's key '" + Tarsa::FourCharText(key) +
                        "' has the unknown type '" + Tarsa::FourCharText(type) + "'");
    }
  }
  if (in.Left() != 0) throw HostError("the descriptor has bytes after its last item");
  return descriptor;
}

const char* Descriptor::TypeName(Type type) {
  switch (type) {
    case Type::kInteger:
      return "integer";
    case Type::kFloat:
      return "float";
    case Type::kEnumerated:
      return "enumerated";
    case Type::kData:
      return "data";
  }
  return "unknown";
}

}  // namespace Host
