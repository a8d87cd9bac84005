#include "host/plugin/PluginModule.h"

#include "framework/core/CException.h"
#include "framework/resource/CPropertyList.h"
#include "framework/resource/ElfResources.h"
#include "framework/resource/ModuleResources.h"
#include "host/io/HostError.h"
#include "host/platform/DynamicLibrary.h"

namespace Host {

namespace {

// The default text of a keyed framework string ("$$$/key=Default").
std::string DefaultText(const std::string& keyed) {
  if (!keyed.starts_with("$$$/")) return keyed;
  const size_t equals = keyed.find('=');
  return equals == std::string::npos ? keyed : keyed.substr(equals + 1);
}

}  // namespace

PluginModule::PluginModule(std::string path, EnableExpression enabled,
                           std::optional<Tarsa::CTerminology> terminology)
    : path_(std::move(path)), enabled_(enabled), terminology_(std::move(terminology)) {}

PluginModule::~PluginModule() = default;

std::unique_ptr<PluginModule> PluginModule::Inspect(const std::string& path) {
  std::string entry;
  std::string expression;
  std::optional<Tarsa::CTerminology> terminology;
  try {
    const Tarsa::CResourceTable table = Tarsa::ReadResourcesFromElf(path);
    const Tarsa::CPropertyList properties(
        table.Get(Tarsa::kPropertyListType, Tarsa::kPropertyListNumber));
    entry = properties.EntryName();
    expression = properties.EnableExpression();
    const auto* terms = table.Find(Tarsa::kTerminologyType, Tarsa::kTerminologyNumber);
    if (terms != nullptr) terminology.emplace(terms->data);
  } catch (const Tarsa::CException& error) {
    // The framework's texts already name the file where it matters.
    const std::string text = DefaultText(error.ErrorText());
    if (text.find(path) != std::string::npos) throw HostError(text);
    throw HostError(path, text);
  }
  if (entry != kEntryName) {
    throw HostError(path, "the module's entry is '" + entry + "', not '" + kEntryName + "'");
  }
  try {
    return std::unique_ptr<PluginModule>(
        new PluginModule(path, EnableExpression::Parse(expression), std::move(terminology)));
  } catch (const HostError& error) {
    throw HostError(path, error.Problem());
  }
}

std::string PluginModule::Refusal(const HostDocument& document) const {
  if (enabled_.Allows(document.Mode())) return {};
  std::string takes;
  for (ImageMode mode : enabled_.AllowedModes()) {
    takes += (takes.empty() ? "" : ", ") + std::string(ModeName(mode));
  }
  return std::string("the module does not take ") + ModeName(document.Mode()) + " images" +
         (takes.empty() ? " (it takes no mode at all)" : " (it takes " + takes + ")");
}

void PluginModule::Load() {
  if (entry_ != nullptr) return;
  std::unique_ptr<DynamicLibrary> library = DynamicLibrary::Open(path_);
  void* entry = library->Symbol(kEntryName);
  if (entry == nullptr) {
    throw HostError(path_, std::string("the module exports no function '") + kEntryName + "'");
  }
  library_ = std::move(library);
  entry_ = reinterpret_cast<Tarsa::HostEntryProc>(entry);
}

}  // namespace Host
