#pragma once

#include <memory>
#include <optional>
#include <string>

#include "framework/plugin/HostSuites.h"
#include "framework/resource/CTerminology.h"
#include "host/io/HostDocument.h"
#include "host/plugin/EnableExpression.h"

namespace Host {

class DynamicLibrary;

// A filter module file. Inspect() reads its property list from the file
// without loading it: the entry's name and the modes it is enabled for, so a
// document it would refuse is turned away before any of its code runs.
// Load() then loads it and finds the entry. Owns the loaded library; the
// entry is valid while the object lives.
class PluginModule {
 public:
  // The only entry name the host calls.
  static constexpr const char* kEntryName = "EntryFI";

  // Throws HostError naming the file when it is missing, not a module, has
  // no property list, names another entry or a malformed enable expression.
  static std::unique_ptr<PluginModule> Inspect(const std::string& path);
  ~PluginModule();

  PluginModule(const PluginModule&) = delete;
  PluginModule& operator=(const PluginModule&) = delete;

  const std::string& Path() const { return path_; }
  const EnableExpression& Enabled() const { return enabled_; }
  // Null for a module without a terminology.
  const Tarsa::CTerminology* Terminology() const { return terminology_ ? &*terminology_ : nullptr; }

  // Why the module does not take the document, in words for the user; empty
  // when it does.
  std::string Refusal(const HostDocument& document) const;

  // Loads the module once; throws HostError naming the file.
  void Load();
  bool Loaded() const { return entry_ != nullptr; }
  // Null before Load().
  Tarsa::HostEntryProc Entry() const { return entry_; }

 private:
  PluginModule(std::string path, EnableExpression enabled,
               std::optional<Tarsa::CTerminology> terminology);

  std::string path_;
  EnableExpression enabled_;
  std::optional<Tarsa::CTerminology> terminology_;
  std::unique_ptr<DynamicLibrary> library_;
  Tarsa::HostEntryProc entry_ = nullptr;
};

}  // namespace Host
