#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string_view>

#include "framework/core/CRect.h"
#include "framework/layout/CGenerator.h"
#include "framework/layout/CZilLexer.h"
#include "framework/layout/CZilPropertyList.h"
#include "framework/process/CObjID.h"
#include "framework/resource/FourCharCode.h"

namespace Tarsa {

class CResourceTable;
class CSwiftViewScope;
class CView;
class CViewProxy;
class CWindow;

// Runs a layout file: parses it with a root CSwiftViewScope that holds the
// keywords, measures and places the views, then makes them top-down through
// their classes' builders. While a view is made, the generator holds what
// its builder reads: the view's proxy (frame and properties), its id, its
// parent, the owner window and the window under construction. A class
// with no builder yet is made as a placeholder pane (or, at the root, a
// plain window) so that a file's tree is whole before all its classes
// exist. Nothing of a run outlives it but the window, which the caller owns.
class CZilGenerator : public CGenerator {
 public:
  static constexpr std::uint32_t kLayoutType = FourCharCode("ZILf");
  // Limits that keep a damaged file from taking the program with it.
  static constexpr std::size_t kMaxText = 1u << 20;
  static constexpr int kMaxViews = 2000;

  CZilGenerator();
  ~CZilGenerator() override;

  // The layout resource named by the upper-cased file name, from the
  // module's resources or a given table.
  std::unique_ptr<CWindow> GenerateWindow(std::string_view fileName, const CWindow* owner);
  std::unique_ptr<CWindow> GenerateWindow(std::string_view fileName, const CWindow* owner,
                                          const CResourceTable& table);
  std::unique_ptr<CWindow> Generate(std::string_view text, const CWindow* owner) override;
  // Parses, measures and places the file's views without making them.
  std::unique_ptr<CViewProxy> Layout(std::string_view text);
  // The text of the layout resource of a file name.
  static std::string_view LayoutText(std::string_view fileName, const CResourceTable& table);

  // For builders, while a view is made.
  const CViewProxy& Proxy() const { return *proxy_; }
  const CZilPropertyList& Properties() const;
  CObjID ViewId() const { return viewId_; }
  CRect Frame() const;
  std::uint32_t Options(std::uint32_t fallback) const;
  std::uint32_t Binding() const;
  CView* ParentView() const { return parentView_; }
  const CWindow* Owner() const { return owner_; }
  CWindow* Window() const { return window_; }
  bool BareWindow() const { return bareWindow_; }

  // The parser counts views as it meets them (line: where, for the message).
  void CountView(int line);
  // Told of each token the parser takes (an editor's syntax colouring);
  // it has no effect on the result.
  void SetListener(CZilLexer::Listener listener) { listener_ = std::move(listener); }
  // How far into the text the last parse came.
  std::size_t Furthest() const { return furthest_; }

 private:
  CView* Build(CViewProxy& proxy, CView* parent);

  std::unique_ptr<CSwiftViewScope> scope_;
  const CViewProxy* proxy_ = nullptr;
  CObjID viewId_;
  CView* parentView_ = nullptr;
  const CWindow* owner_ = nullptr;
  CWindow* window_ = nullptr;
  bool bareWindow_ = false;
  int views_ = 0;
  std::size_t furthest_ = 0;
  CZilLexer::Listener listener_;
};

}  // namespace Tarsa
