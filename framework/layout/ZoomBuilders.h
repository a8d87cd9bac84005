#pragma once

#include <memory>

#include "framework/controls/CScroller.h"
#include "framework/layout/CPaneBuilder.h"
#include "framework/view/CZoomPane.h"

namespace Tarsa {

class CZilPropertyList;

// The layout properties of a zoom pane (zoom_min, zoom_max, both numbers or
// texts such as '0.001', and fit_in_view_cushion) and of a scroller
// (scroller_attributes, the single-bar switches, scroller_gap_left).
void ConfigureZoomPane(CZoomPane& pane, const CZilPropertyList& properties);
void ConfigureScroller(CScroller& scroller, const CZilPropertyList& properties);

// The builder of a zoom pane class T. Without a factory T is made as
// T(id, parent, frame, options, binding); a class made otherwise gives its
// own factory and still gets the zoom properties applied.
template <class T = CZoomPane>
std::unique_ptr<CViewBuilder> MakeZoomPaneBuilder(typename CPaneBuilder<T>::Factory factory = {}) {
  if (!factory) {
    factory = [](CView* parent, CZilGenerator& g) {
      return new T(g.ViewId(), parent, g.Frame(), g.Options(kView_NoOptions), g.Binding());
    };
  }
  return std::make_unique<CPaneBuilder<T>>(std::move(factory), [](T& pane, CZilGenerator& g) {
    ConfigureZoomPane(pane, g.Properties());
  });
}

// The builder of a scroller class T, made as T(id, parent, frame,
// attributes, binding): a subclass that only names a scroller registers
// with CViewBuilder::Register("Name", MakeScrollerBuilder<Name>()).
template <class T = CScroller>
std::unique_ptr<CViewBuilder> MakeScrollerBuilder() {
  return std::make_unique<CPaneBuilder<T>>(
      [](CView* parent, CZilGenerator& g) {
        return new T(g.ViewId(), parent, g.Frame(), kScroller_XBar | kScroller_YBar, g.Binding());
      },
      [](T& scroller, CZilGenerator& g) { ConfigureScroller(scroller, g.Properties()); });
}

// Registers CZoomPane, CScroller and CZoomProgressCombo.
void RegisterZoomBuilders();

}  // namespace Tarsa
