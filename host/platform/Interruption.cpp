#include "host/platform/Interruption.h"

#include <signal.h>

#include <csignal>

namespace Host {

namespace {

volatile std::sig_atomic_t interrupted = 0;

void OnInterrupt(int) { interrupted = 1; }

}  // namespace

void Interruption::Catch() {
  struct sigaction action = {};
  action.sa_handler = OnInterrupt;
  sigemptyset(&action.sa_mask);
  // SA_RESETHAND: the second Ctrl-C gets the default action.
  action.sa_flags = SA_RESETHAND | SA_RESTART;
  ::sigaction(SIGINT, &action, nullptr);
}

bool Interruption::Requested() { return interrupted != 0; }

}  // namespace Host
