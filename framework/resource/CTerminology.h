#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <vector>

namespace Tarsa {

// The scripting terminology as a host reads it, parsed from the resource's
// bytes: what a recorded action may say to the plug-in. A header (version,
// language, script, suite count), then per suite its vendor, name, id, level,
// version and events; per event its name, description, class, id, reply and
// direct-object types and its parameters (name, key, type, description,
// flags); then classes, comparison operators and enumerations (id, then per
// value a name, a code and a description). Strings are a length byte and the
// text; 16-bit values and four-character codes little-endian, with no
// padding anywhere. Only parameters and enumerations are kept; the rest is
// read past. Damaged bytes throw CError.
class CTerminology {
 public:
  struct Parameter {
    std::string name;
    std::uint32_t key = 0;
    std::uint32_t type = 0;
    std::uint16_t flags = 0;
  };

  struct Enumerator {
    std::string name;
    std::uint32_t code = 0;
  };

  struct Enumeration {
    std::uint32_t id = 0;
    std::vector<Enumerator> values;
  };

  explicit CTerminology(std::span<const std::uint8_t> bytes);

  // Every event's parameters, in the order the resource has them.
  const std::vector<Parameter>& Parameters() const { return parameters_; }
  const std::vector<Enumeration>& Enumerations() const { return enumerations_; }

  // The parameter with the key, or the enumeration with the id; null when
  // the terminology has none.
  const Parameter* FindParameter(std::uint32_t key) const;
  const Enumeration* FindEnumeration(std::uint32_t id) const;

 private:
  std::vector<Parameter> parameters_;
  std::vector<Enumeration> enumerations_;
};

}  // namespace Tarsa
