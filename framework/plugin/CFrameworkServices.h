#pragma once

namespace Tarsa {

// Start-up and shutdown of the framework's services for a module that the
// host loads and drives: the thread that starts the framework is remembered
// as the main thread, and the services that live from start-up to shutdown
// (string table, message names, memory service, the module-wide allocator,
// the display) are begun and ended here. Start() after Start() and
// Shutdown() without Start() are harmless. Main thread only.
class CFrameworkServices {
 public:
  CFrameworkServices() = delete;

  static void Start();
  // Drops the string table, the memory service and the module-wide
  // allocator, and lets the display go.
  static void Shutdown();

  static bool IsStarted();
  // True on the thread that ran Start(); false when nothing was started.
  static bool IsMainThread();
};

}  // namespace Tarsa
