#include "framework/resource/CTerminology.h"

#include <algorithm>

#include "framework/core/CException.h"
#include "framework/files/CConstContainer.h"
#include "framework/resource/ResourceStreams.h"

namespace Tarsa {
namespace {

constexpr const char* kDamagedText =
    "$$$/Tarsa/Terminology/Error/Damaged=The plug-in's scripting terminology is damaged.";

// A count read from the bytes, bounded by what is left of them: every item
// it counts takes at least `smallest` bytes, so a damaged count is caught
// before anything is reserved for it.
std::uint16_t ReadCount(CConstContainer& in, std::size_t smallest) {
  const std::uint16_t count = in.ReadU16();
  if (count > (in.Size() - in.Position()) / smallest) throw CError(kDamagedText);
  return count;
}

}  // namespace

CTerminology::CTerminology(std::span<const std::uint8_t> bytes) {
  ReadOrDamaged(kDamagedText, [&] {
    CConstContainer in(bytes);
    in.SkipRead(6);  // version, language, script
    // Sizes below are each item's fixed part: lengths, codes and counts.
    const std::uint16_t suites = ReadCount(in, 12);
    for (std::uint16_t s = 0; s < suites; ++s) {
      in.ReadPascalString();  // vendor
      in.ReadPascalString();  // name
      in.SkipRead(8);         // id, level, version
      const std::uint16_t events = ReadCount(in, 24);
      for (std::uint16_t e = 0; e < events; ++e) {
        in.ReadPascalString();  // name
        in.ReadPascalString();  // description
        in.SkipRead(12);        // class, id, reply type
        in.ReadPascalString();  // reply description
        in.SkipRead(6);         // reply flags, direct-object type
        in.ReadPascalString();  // direct-object description
        in.SkipRead(2);         // direct-object flags
        const std::uint16_t count = ReadCount(in, 12);
        for (std::uint16_t p = 0; p < count; ++p) {
          Parameter parameter;
          parameter.name = in.ReadPascalString();
          parameter.key = in.ReadU32();
          parameter.type = in.ReadU32();
          in.ReadPascalString();  // description
          parameter.flags = in.ReadU16();
          parameters_.push_back(std::move(parameter));
        }
      }
      const std::uint16_t classes = ReadCount(in, 10);
      for (std::uint16_t c = 0; c < classes; ++c) {
        in.ReadPascalString();  // name
        in.SkipRead(4);         // id
        in.ReadPascalString();  // description
        const std::uint16_t properties = ReadCount(in, 12);
        for (std::uint16_t p = 0; p < properties; ++p) {
          in.ReadPascalString();
          in.SkipRead(8);
          in.ReadPascalString();
          in.SkipRead(2);
        }
        const std::uint16_t elements = ReadCount(in, 6);
        for (std::uint16_t k = 0; k < elements; ++k) {
          in.SkipRead(4);
          in.SkipRead(4 * std::size_t{ReadCount(in, 4)});
        }
      }
      const std::uint16_t operators = ReadCount(in, 6);
      for (std::uint16_t o = 0; o < operators; ++o) {
        in.ReadPascalString();
        in.SkipRead(4);
        in.ReadPascalString();
      }
      const std::uint16_t enumerations = ReadCount(in, 6);
      for (std::uint16_t n = 0; n < enumerations; ++n) {
        Enumeration enumeration;
        enumeration.id = in.ReadU32();
        const std::uint16_t values = ReadCount(in, 6);
        for (std::uint16_t v = 0; v < values; ++v) {
          Enumerator value;
          value.name = in.ReadPascalString();
          value.code = in.ReadU32();
          in.ReadPascalString();  // description
          enumeration.values.push_back(std::move(value));
        }
        enumerations_.push_back(std::move(enumeration));
      }
    }
  });
}

const CTerminology::Parameter* CTerminology::FindParameter(std::uint32_t key) const {
  const auto found = std::find_if(parameters_.begin(), parameters_.end(),
                                  [key](const Parameter& p) { return p.key == key; });
  return found == parameters_.end() ? nullptr : &*found;
}

const CTerminology::Enumeration* CTerminology::FindEnumeration(std::uint32_t id) const {
  const auto found = std::find_if(enumerations_.begin(), enumerations_.end(),
                                  [id](const Enumeration& e) { return e.id == id; });
  return found == enumerations_.end() ? nullptr : &*found;
}

}  // namespace Tarsa
