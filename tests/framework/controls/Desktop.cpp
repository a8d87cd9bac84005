#include "tests/framework/controls/Desktop.h"

#include <spawn.h>
#include <sys/wait.h>

#include <filesystem>

#include "framework/native/SdlEventSource.h"

extern char** environ;

namespace Tarsa::testing {

Desktop::Desktop()
    : process_(std::make_unique<CProcess>(std::make_unique<Native::SdlEventSource>())) {
  process_->Start();
}

Desktop::~Desktop() = default;

void Desktop::Pump(double seconds) { process_->DoEvents(process_->Now() + seconds); }

int Desktop::Xdo(const std::vector<std::string>& arguments, double settle) {
  const int pid = XdoStart(arguments);
  if (pid < 0) return -1;
  const int status = XdoWait(pid);
  Pump(settle);
  return status;
}

int Desktop::XdoStart(const std::vector<std::string>& arguments) {
  std::vector<char*> argv;
  std::string program = "xdotool";
  argv.push_back(program.data());
  for (const std::string& a : arguments) argv.push_back(const_cast<char*>(a.c_str()));
  argv.push_back(nullptr);
  pid_t pid = -1;
  if (posix_spawnp(&pid, "xdotool", nullptr, nullptr, argv.data(), environ) != 0) return -1;
  return pid;
}

int Desktop::XdoWait(int pid) {
  int status = 0;
  // The loop runs while xdotool types and clicks, as it would under a user;
  // nested loops (a drag, an alert) run inside it.
  while (waitpid(pid, &status, WNOHANG) == 0) Pump(0.02);
  return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

void Desktop::Inject(const std::vector<CNativeEvent>& events, double settle) {
  auto& source = static_cast<Native::SdlEventSource&>(process_->EventSource());
  for (CNativeEvent event : events) {
    event.time = process_->Now();
    source.Inject(event);
  }
  Pump(settle);
}

std::string Desktop::Artefact(const std::string& name) {
  const std::filesystem::path folder = std::filesystem::path(ARCHWAY_ARTEFACTS_DIR);
  std::filesystem::create_directories(folder);
  return (folder / name).string();
}

}  // namespace Tarsa::testing
