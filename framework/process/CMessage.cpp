#include "framework/process/CMessage.h"

namespace Tarsa {

CMessage::CMessage(CObjID name, double time, std::uint32_t modifiers, std::uintptr_t source)
    : source(source), modifiers(modifiers), time(time), name(name) {}

CMessage::CMessage(const CMessage& other)
    : source(other.source),
      modifiers(other.modifiers),
      time(other.time),
      name(other.name),
      flags(other.flags & ~kHandled) {}

CMessage& CMessage::operator=(const CMessage& other) {
  source = other.source;
  modifiers = other.modifiers;
  time = other.time;
  name = other.name;
  flags = other.flags & ~kHandled;
  return *this;
}

std::unique_ptr<CMessage> CMessage::Clone() const { return std::make_unique<CMessage>(*this); }

void CMessage::SetHandled(bool handled) {
  if (handled) {
    flags |= kHandled;
  } else {
    flags &= ~kHandled;
  }
}

}  // namespace Tarsa
