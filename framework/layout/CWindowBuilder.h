#pragma once

#include <string>

#include "framework/controls/CControl.h"
#include "framework/layout/CViewBuilder.h"
#include "framework/layout/CZilGenerator.h"
#include "framework/view/CWindow.h"

namespace Tarsa {

// The builder of a window class T, made as T(id, kind, title, size, owner):
// the root of a layout file. The size is the root's measured size, which a
// dialog keeps as its least. The window and its native window exist once
// Construct returns; the caller owns it.
template <class T>
class CWindowBuilder : public CViewBuilder {
 public:
  CView* Construct(CView* /*parent*/, CZilGenerator& generator) override {
    std::string title;
    generator.Properties().GetString("window_title", title);
    const CRect frame = generator.Frame();
    return new T(
        generator.ViewId(), EWindowKind::kModal, ShownText(title),
        CSize{static_cast<std::int32_t>(frame.Width()), static_cast<std::int32_t>(frame.Height())},
        generator.Owner());
  }
  bool MakesWindow() const override { return true; }
};

}  // namespace Tarsa
