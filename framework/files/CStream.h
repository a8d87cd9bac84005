#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>
#include <type_traits>

namespace Tarsa {

class CMemoryContainer;

// A typed reader and writer of bytes. Subclasses move the bytes; the helpers
// here give them types, in the machine's byte order or, with SwapBytes set,
// in the other one. A reader of a big-endian format sets SwapBytes before its
// first typed read. Floating-point values travel as their bit patterns. A
// stream owns nothing but its byte-order switch.
class CStream {
 public:
  static constexpr const char* kStringTooLongText =
      "$$$/Tarsa/Stream/Error/StringTooLong=A length-prefixed string is longer than 255 bytes.";

  CStream() = default;
  virtual ~CStream() = default;

  CStream(const CStream&) = delete;
  CStream& operator=(const CStream&) = delete;

  virtual void Read(void* buffer, std::size_t count) = 0;
  virtual void Write(const void* buffer, std::size_t count) = 0;
  virtual void SkipRead(std::uint64_t count) = 0;
  virtual void SkipWrite(std::uint64_t count) = 0;

  bool SwapBytes() const { return swapBytes_; }
  void SetSwapBytes(bool swap) { swapBytes_ = swap; }

  std::uint8_t ReadByte();
  void ReadByte(std::uint8_t& value) { value = ReadByte(); }
  std::uint16_t ReadU16();
  void ReadU16(std::uint16_t& value) { value = ReadU16(); }
  std::uint32_t ReadU32();
  void ReadU32(std::uint32_t& value) { value = ReadU32(); }
  std::uint64_t ReadU64();
  std::int16_t ReadI16();
  std::int32_t ReadI32();
  float ReadFloat();
  double ReadDouble();
  // One byte; anything but 0 is true.
  bool ReadBool();
  // A length byte, then that many 8-bit characters, taken as they are.
  std::string ReadPascalString();

  void WriteByte(std::uint8_t value);
  void WriteU16(std::uint16_t value);
  void WriteU32(std::uint32_t value);
  void WriteU64(std::uint64_t value);
  void WriteI16(std::int16_t value);
  void WriteI32(std::int32_t value);
  void WriteFloat(float value);
  void WriteDouble(double value);
  // One byte, 1 or 0.
  void WriteBool(bool value);
  // A length byte, then the characters; no terminator, no padding. A string
  // longer than 255 bytes is refused, with nothing written, rather than cut.
  void WritePascalString(std::string_view text);

  // A plain record whose first field is a u32: only that field follows the
  // byte order; the rest travels as it lies in memory.
  template <class T>
  void ReadObject(T& object) {
    static_assert(std::is_trivially_copyable_v<T> && sizeof(T) >= sizeof(std::uint32_t));
    unsigned char bytes[sizeof(T)];
    Read(bytes, sizeof(T));
    if (swapBytes_) ReverseFirstWord(bytes);
    std::memcpy(&object, bytes, sizeof(T));
  }
  template <class T>
  void WriteObject(const T& object) {
    static_assert(std::is_trivially_copyable_v<T> && sizeof(T) >= sizeof(std::uint32_t));
    unsigned char bytes[sizeof(T)];
    std::memcpy(bytes, &object, sizeof(T));
    if (swapBytes_) ReverseFirstWord(bytes);
    Write(bytes, sizeof(T));
  }

  // Replaces the container's contents by the next count bytes of this stream,
  // leaves it at position 0 and hands it this stream's byte order.
  void ReadInto(CMemoryContainer& container, std::uint32_t count);
  // Writes the container's whole contents, wherever its position is.
  void WriteAll(const CMemoryContainer& container);

 private:
  static void ReverseFirstWord(unsigned char* bytes);

  bool swapBytes_ = false;
};

}  // namespace Tarsa
