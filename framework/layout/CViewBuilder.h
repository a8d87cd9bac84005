#pragma once

#include <memory>
#include <string_view>

#include "framework/core/CRect.h"

namespace Tarsa {

class CView;
class CViewProxy;
class CZilGenerator;

// What makes the views of one class that a layout file may name: Prepare
// (for a window, before it exists), Construct (makes the view with its
// parent, from what the generator holds for the view at hand: its id,
// frame and properties), and Configure (applies the properties every view
// shares: tips, visibility, enabling). The size a class needs for its own
// content feeds the layout's measuring.
//
// Builders are registered by class name in one process-wide map, which
// owns them; the framework's own are there from the first look-up.
class CViewBuilder {
 public:
  virtual ~CViewBuilder() = default;

  virtual void Prepare(CZilGenerator& /*generator*/) {}
  // The new view, owned by `parent` (by the caller for a window).
  virtual CView* Construct(CView* parent, CZilGenerator& generator) = 0;
  virtual void Configure(CView& view, CZilGenerator& generator);
  virtual CSize NaturalSize(const CViewProxy& /*proxy*/) const { return {}; }
  virtual bool MakesWindow() const { return false; }

  static void Register(std::string_view className, std::unique_ptr<CViewBuilder> builder);
  // The builder of a class, or null.
  static CViewBuilder* Find(std::string_view className);
};

}  // namespace Tarsa
