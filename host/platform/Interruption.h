#pragma once

namespace Host {

// Ctrl-C as the host sees it: a request to stop that the filter learns of
// through the abort callback, not a kill. Catch() installs the handler for
// the rest of the process; the handler only raises a flag and puts the
// default action back, so a second Ctrl-C ends a filter that stopped
// listening. The flag is the host's one piece of process-wide state; it
// lives here because a signal handler can reach nothing else.
class Interruption {
 public:
  Interruption() = delete;

  static void Catch();
  static bool Requested();
};

}  // namespace Host
