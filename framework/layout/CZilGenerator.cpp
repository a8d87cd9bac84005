#include "framework/layout/CZilGenerator.h"

#include <cctype>
#include <stdexcept>
#include <string>

#include "framework/layout/CSwiftViewScope.h"
#include "framework/layout/CViewBuilder.h"
#include "framework/layout/CViewProxy.h"
#include "framework/layout/CZilLexer.h"
#include "framework/layout/CZilSyntaxError.h"
#include "framework/layout/ZilKeywords.h"
#include "framework/resource/CResourceTable.h"
#include "framework/resource/ModuleResources.h"
#include "framework/view/CWindow.h"

namespace Tarsa {
namespace {

// Asks each class's builder for the size its content needs, leaves first.
void SizeFromBuilders(CViewProxy& proxy) {
  for (auto& child : proxy.children) SizeFromBuilders(*child);
  if (const CViewBuilder* builder = CViewBuilder::Find(proxy.ClassName())) {
    const CSize natural = builder->NaturalSize(proxy);
    proxy.naturalWidth = std::clamp(natural.width, 0, 65535);
    proxy.naturalHeight = std::clamp(natural.height, 0, 65535);
  }
}

}  // namespace

CZilGenerator::CZilGenerator() = default;
CZilGenerator::~CZilGenerator() = default;

const CZilPropertyList& CZilGenerator::Properties() const { return proxy_->properties; }

CRect CZilGenerator::Frame() const { return proxy_->ViewFrame(); }

std::uint32_t CZilGenerator::Options(std::uint32_t fallback) const {
  std::int32_t options = static_cast<std::int32_t>(fallback);
  Properties().GetInt("view_options", options);
  return static_cast<std::uint32_t>(options);
}

std::uint32_t CZilGenerator::Binding() const {
  std::int32_t binding = 0;
  Properties().GetInt("view_binding", binding);
  return static_cast<std::uint32_t>(binding);
}

void CZilGenerator::CountView(int line) {
  if (++views_ > kMaxViews) throw CZilSyntaxError(line, "the file holds too many views");
}

std::string_view CZilGenerator::LayoutText(std::string_view fileName, const CResourceTable& table) {
  std::string name(fileName);
  for (char& c : name) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
  const std::span<const std::uint8_t> bytes = table.Get(kLayoutType, name);
  if (bytes.empty()) throw std::logic_error("no layout resource " + name);
  return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

std::unique_ptr<CWindow> CZilGenerator::GenerateWindow(std::string_view fileName,
                                                       const CWindow* owner) {
  const CResourceTable table = ModuleResourceTable();
  return GenerateWindow(fileName, owner, table);
}

std::unique_ptr<CWindow> CZilGenerator::GenerateWindow(std::string_view fileName,
                                                       const CWindow* owner,
                                                       const CResourceTable& table) {
  return Generate(LayoutText(fileName, table), owner);
}

std::unique_ptr<CViewProxy> CZilGenerator::Layout(std::string_view text) {
  if (text.size() > kMaxText) throw std::logic_error("the layout file is too large");
  // A zero byte ends the text, as it would a resource copied to a C string.
  const std::string copy(text.substr(0, text.find('\0')));
  views_ = 0;
  CZilLexer lexer(copy);
  if (listener_) lexer.SetListener(listener_);
  std::vector<std::unique_ptr<CViewProxy>> roots;
  scope_ = std::make_unique<CSwiftViewScope>(nullptr, this);
  DefineZilKeywords(*scope_);
  try {
    scope_->ParseDefinition(lexer, roots);
    if (!lexer.AtEnd()) {
      lexer.Fail(lexer.IsPunct("}") ? "a '}' with no '{' before it"
                                    : "text is left after the definition");
    }
  } catch (...) {
    furthest_ = lexer.Furthest();
    scope_.reset();
    throw;
  }
  furthest_ = lexer.Furthest();
  scope_.reset();
  if (roots.empty()) throw std::logic_error("the layout file holds no view");
  if (roots.size() != 1) {
    throw std::logic_error("the layout file holds " + std::to_string(roots.size()) +
                           " views at the top; it must hold one, the window");
  }
  std::unique_ptr<CViewProxy> root = std::move(roots.front());
  SizeFromBuilders(*root);
  root->Measure();
  root->Place({0, 0, root->measuredWidth, root->measuredHeight});
  return root;
}

std::unique_ptr<CWindow> CZilGenerator::Generate(std::string_view text, const CWindow* owner) {
  std::unique_ptr<CViewProxy> root = Layout(text);
  owner_ = owner;
  window_ = nullptr;
  proxy_ = root.get();
  CViewBuilder* builder = CViewBuilder::Find(root->ClassName());
  bareWindow_ = builder == nullptr || !builder->MakesWindow();
  if (bareWindow_) {
    // A window class with no builder yet: a plain window stands in.
    builder = CViewBuilder::Find("CWindow");
  }
  viewId_ = CObjID();
  std::string id;
  if (root->properties.GetString("view_id", id)) viewId_ = CObjID::Intern(id);
  builder->Prepare(*this);
  std::unique_ptr<CWindow> window(dynamic_cast<CWindow*>(builder->Construct(nullptr, *this)));
  if (window == nullptr) throw std::logic_error("Warning! (view.get() != NULL)");
  window_ = window.get();
  builder->Configure(*window, *this);
  for (auto& child : root->children) Build(*child, window.get());
  proxy_ = nullptr;
  window_ = nullptr;
  return window;
}

CView* CZilGenerator::Build(CViewProxy& proxy, CView* parent) {
  CViewBuilder* builder = CViewBuilder::Find(proxy.ClassName());
  if (builder == nullptr || builder->MakesWindow()) builder = CViewBuilder::Find("");
  proxy_ = &proxy;
  parentView_ = parent;
  viewId_ = CObjID();
  std::string id;
  if (proxy.properties.GetString("view_id", id)) viewId_ = CObjID::Intern(id);
  CView* view = builder->Construct(parent, *this);
  if (view == nullptr) throw std::logic_error("Warning! (view.get() != NULL)");
  builder->Configure(*view, *this);
  for (auto& child : proxy.children) Build(*child, view);
  return view;
}

}  // namespace Tarsa
