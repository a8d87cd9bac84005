#pragma once

// The program with the real module as a child process, run as a user runs
// it, for the end-to-end tests.

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <optional>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "tests/support/TestImages.h"

extern char** environ;

namespace Host::testing {

#ifdef ARCHWAY_REAL_MODULE

// Changes to the program's environment: a value sets the name, none
// removes it.
using Environment = std::vector<std::pair<std::string, std::optional<std::string>>>;

struct Finished {
  int status = -1;  // the exit status; -1 when the program did not exit by itself
  std::string errors;
};

// A program left running this long has hung; it is killed and the test fails.
constexpr auto kHung = std::chrono::seconds(120);

// The program with the real module, run as a user runs it: standard input
// empty, standard output dropped, standard error into errorFd or else into
// a file outside every folder the tests watch. Each run reads and saves the
// module's preferences in a fresh folder, so no run sees another's, unless
// the changes name XDG_CONFIG_HOME.
class ProgramRun {
 public:
  ProgramRun(const std::vector<std::string>& arguments, Environment changes, int errorFd = -1) {
    std::vector<std::string> argv = {ARCHWAY_RUNNER, arguments.front(), "--module",
                                     ARCHWAY_REAL_MODULE};
    argv.insert(argv.end(), arguments.begin() + 1, arguments.end());
    // Preferences in a folder of the run's own, unless the test shares one.
    const bool shared = std::ranges::any_of(
        changes, [](const auto& change) { return change.first == "XDG_CONFIG_HOME"; });
    if (!shared) changes.emplace_back("XDG_CONFIG_HOME", config_.Dir());
    std::vector<std::string> envp;
    for (char** entry = environ; *entry != nullptr; ++entry) {
      const std::string text = *entry;
      bool changed = false;
      for (const auto& change : changes) changed |= text.starts_with(change.first + "=");
      if (!changed) envp.push_back(text);
    }
    for (const auto& [name, value] : changes) {
      if (value) envp.push_back(name + "=" + *value);
    }
    std::vector<char*> argPointers, envPointers;
    for (std::string& text : argv) argPointers.push_back(text.data());
    for (std::string& text : envp) envPointers.push_back(text.data());
    argPointers.push_back(nullptr);
    envPointers.push_back(nullptr);

    const bool ownFile = errorFd < 0;
    if (ownFile) {
      errorFd = ::open(capture_.File("stderr").c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
    }
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, 0, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
    posix_spawn_file_actions_adddup2(&actions, errorFd, 2);
    if (posix_spawn(&pid_, argv[0].c_str(), &actions, nullptr, argPointers.data(),
                    envPointers.data()) != 0) {
      pid_ = -1;
    }
    posix_spawn_file_actions_destroy(&actions);
    if (ownFile) ::close(errorFd);
  }
  ~ProgramRun() {
    if (pid_ > 0) {
      ::kill(pid_, SIGKILL);
      ::waitpid(pid_, nullptr, 0);
    }
  }
  ProgramRun(const ProgramRun&) = delete;
  ProgramRun& operator=(const ProgramRun&) = delete;

  bool Started() const { return pid_ > 0 || ended_; }
  void Interrupt() const { ::kill(pid_, SIGINT); }

  // Whether the program has ended; its exit status in status.
  bool Ended(int& status) {
    if (pid_ <= 0) return true;
    int raw = 0;
    if (::waitpid(pid_, &raw, WNOHANG) != pid_) return false;
    pid_ = -1;
    ended_ = true;
    status = WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
    return true;
  }

  // Waits for the end; a hung program is killed and answers -1. The errors
  // are those of the program's own file.
  Finished Finish() {
    Finished finished;
    const auto deadline = std::chrono::steady_clock::now() + kHung;
    while (!Ended(finished.status)) {
      if (std::chrono::steady_clock::now() > deadline) {
        finished.errors = "hung";
        return finished;  // the destructor kills it
      }
      std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    finished.errors = ReadBytes(capture_.File("stderr"));
    return finished;
  }

 private:
  ScratchFolder config_;
  ScratchFolder capture_;
  pid_t pid_ = -1;
  bool ended_ = false;
};

inline Finished RunToEnd(const std::vector<std::string>& arguments,
                         const Environment& changes = {}) {
  return ProgramRun(arguments, changes).Finish();
}

inline bool HasLine(const std::string& text, const std::string& line) {
  return ("\n" + text).find("\n" + line + "\n") != std::string::npos;
}

#endif  // ARCHWAY_REAL_MODULE

}  // namespace Host::testing
