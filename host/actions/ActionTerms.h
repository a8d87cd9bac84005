#pragma once

#include <string>

#include "framework/resource/CTerminology.h"
#include "host/plugin/Descriptor.h"

namespace Host {

// What a module's scripting terminology lets an action say to it, as the
// host checks a recorded action before replaying it: a parameter the
// terminology declares must have its declared type (an enumerated one its
// enumeration's type), and a float must be a finite number. Which enumerated
// values it takes, and keys the terminology does not declare, the module
// judges itself: a stored action may carry a value the terminology does not
// offer.
// Holds its own copy of the terminology.
class ActionTerms {
 public:
  explicit ActionTerms(Tarsa::CTerminology terminology);

  // Why the item cannot be handed to the module, in words for the user;
  // empty when it can.
  std::string Refusal(const Descriptor::Item& item) const;

 private:
  Tarsa::CTerminology terminology_;
};

}  // namespace Host
