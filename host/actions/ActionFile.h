#pragma once

#include <string>
#include <string_view>

#include "host/actions/ActionTerms.h"
#include "host/plugin/Descriptor.h"

namespace Host {

// Action files: a descriptor stored as text, so that a correction made once
// can be replayed on other images. The format is described for users in
// docs/action-files.md: a header line, then one item per line,
//
//   archway-action 1
//   <key> integer <value>
//   <key> float <value>
//   <key> enumerated <type> <value>
//   <key> data <length> <base64>
//
// with four-character codes written as their characters, or as 0x and eight
// hex digits when a character is not printable. Floats are written in the
// shortest form that reads back to the same double, so a file written from a
// descriptor reads back to an equal one. Reading is strict and names the line
// of any fault, a value the module's terminology refuses included. Operations
// only.
class ActionFile {
 public:
  static constexpr const char* kHeader = "archway-action 1";

  ActionFile() = delete;

  // Throws HostError naming the file, and the line when its text is at fault
  // or `terms` (when given) refuse one of its values.
  static Descriptor Read(const std::string& path, const ActionTerms* terms = nullptr);
  // Written whole under a temporary name, then renamed; throws HostError.
  static void Write(const Descriptor& descriptor, const std::string& path);

  static std::string Format(const Descriptor& descriptor);
  // Throws HostError("line N: ...") for text that is not an action.
  static Descriptor Parse(std::string_view text, const ActionTerms* terms = nullptr);
};

}  // namespace Host
