#pragma once

#include <memory>
#include <string>
#include <vector>

#include "framework/process/CNativeEventSource.h"
#include "framework/process/CProcess.h"

namespace Tarsa::testing {

// A process on the real display (the X server the test runs under) and the
// means to drive it as a user would: xdotool's real input, given while the
// process's loop runs, and screenshots saved as test artefacts.
class Desktop {
 public:
  Desktop();
  ~Desktop();

  CProcess& Process() { return *process_; }
  // Runs the loop for a while.
  void Pump(double seconds);
  // Runs xdotool with the arguments, the loop running meanwhile, then lets
  // the loop settle; xdotool's exit status.
  int Xdo(const std::vector<std::string>& arguments, double settle = 0.3);
  // Starts xdotool and returns at once, for input that must arrive while
  // the test runs a loop of its own (work under a progress dialog); the
  // process id, or -1. XdoWait waits for it, the loop running meanwhile.
  int XdoStart(const std::vector<std::string>& arguments);
  int XdoWait(int pid);

  // Puts events into the process's event source, as the window system
  // would, and lets the loop handle them.
  void Inject(const std::vector<CNativeEvent>& events, double settle = 0.2);

  // The path of an artefact file of the test run (the folder is made).
  static std::string Artefact(const std::string& name);

 private:
  std::unique_ptr<CProcess> process_;
};

}  // namespace Tarsa::testing
