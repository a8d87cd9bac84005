#include "framework/layout/CViewBuilder.h"

#include <map>
#include <mutex>
#include <string>

#include "framework/controls/CControl.h"
#include "framework/layout/CViewProxy.h"
#include "framework/layout/CZilGenerator.h"
#include "framework/view/CView.h"

namespace Tarsa {

// In FrameworkBuilders.cpp.
void RegisterFrameworkBuilders();

namespace {

std::map<std::string, std::unique_ptr<CViewBuilder>, std::less<>>& Registry() {
  static std::map<std::string, std::unique_ptr<CViewBuilder>, std::less<>> registry;
  return registry;
}

// The framework's builders join on first use rather than at load: a static
// library's registrar objects would be dropped by the linker.
bool registeringFramework = false;

void EnsureFrameworkBuilders() {
  static std::once_flag once;
  std::call_once(once, [] {
    registeringFramework = true;
    RegisterFrameworkBuilders();
    registeringFramework = false;
  });
}

}  // namespace

void CViewBuilder::Register(std::string_view className, std::unique_ptr<CViewBuilder> builder) {
  if (!registeringFramework) EnsureFrameworkBuilders();
  Registry()[std::string(className)] = std::move(builder);
}

CViewBuilder* CViewBuilder::Find(std::string_view className) {
  EnsureFrameworkBuilders();
  auto& registry = Registry();
  const auto found = registry.find(className);
  return found != registry.end() ? found->second.get() : nullptr;
}

void CViewBuilder::Configure(CView& view, CZilGenerator& generator) {
  const CZilPropertyList& properties = generator.Properties();
  std::string tip;
  if (properties.GetString("view_tip", tip)) view.AddTip(ShownText(tip));
  const std::uint32_t options = generator.Options(0);
  bool invisible = (options & kView_Invisible) != 0;
  bool disabled = (options & kView_Disabled) != 0;
  properties.GetBool("view_invisible", invisible);
  properties.GetBool("view_disabled", disabled);
  if (invisible) view.SetShown(false);
  if (disabled) view.SetEnabled(false);
}

}  // namespace Tarsa
