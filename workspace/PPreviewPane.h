#pragma once

#include <cstdint>
#include <vector>

#include "filter/PPreviewTarget.h"
#include "framework/view/CZoomPane.h"

namespace Project {

class PFilter;

// The scrolling picture of the workspace: the preview hub's display tiles
// at the pane's zoom, with the constraints and the mesh drawn over them and
// a magnifier at 100 % under the mouse. Image space is the document's
// pixels (the warped picture with Preview on); view = image x zoom, in the
// zoom pane's scrolled coordinates. The display picture the hub renders is
// the image at the zoom, or at the image's own size from 100 % up, which
// the pane then enlarges. The filter (and with it the hub) outlives the
// pane; the pane connects to the hub in Attach and lets go in its
// destructor, before the hub's updates could reach a pane that is gone.
class PPreviewPane : public Tarsa::CZoomPane, public PPreviewTarget {
 public:
  PPreviewPane(Tarsa::CObjID id, Tarsa::CView* parent, const Tarsa::CRect& frame,
               std::uint32_t options = Tarsa::kView_NoOptions,
               std::uint32_t binding = Tarsa::kBind_Sizeable);
  ~PPreviewPane() override;

  void Attach(PFilter& filter);

  // The picture's rectangle in view coordinates, cut to what is in sight;
  // the tools test the mouse against it, both edges inclusive.
  Tarsa::CRect GetImageRect() const;
  float GetScale() const { return float(Scale()); }

  // The magnifier's two triggers: a tool's drag, and the key Q.
  void SetDragLoupe(bool on);
  void SetKeyLoupe(bool on);
  bool LoupeShown() const;
  // L held: the photograph instead of the result, here and in the loupe.
  void SetShowSource(bool on);
  // X held: a temporary zoom to 100 % (or twice the zoom from 100 % up)
  // about the mouse, and back on release.
  void SetTempZoom(bool keyDown);
  const Tarsa::CPoint& LastMouse() const { return lastMouse_; }

  // The display picture's rectangle and the part of it in sight, for the hub.
  Tarsa::CRect DisplayRect() const;

  void Draw(Tarsa::CPort& port) override;
  void MouseDown(Tarsa::CMouseMessage& message) override;
  void MouseMoved(Tarsa::CMouseMessage& message) override;
  void MouseEnter() override;
  void SizeChanged(std::int32_t dx, std::int32_t dy) override;

  // PPreviewTarget.
  void PreviewChanged(const Tarsa::CRect& area) override;
  void PreviewProgress(std::uint64_t done, std::uint64_t total) override;

 protected:
  void ZoomChanged() override;
  void ScrollChanged() override;

 private:
  // The display picture's scale to the image: the zoom, at most 1.
  double PictureScale() const;
  void UpdateDisplay();
  void DrawTiles(Tarsa::CPort& port);
  void DrawOverlays(Tarsa::CPort& port);
  // The mesh and the constraints with view = image x scale + origin.
  void DrawOverlays(Tarsa::CPort& port, double scale, double originX, double originY);
  void DrawLoupe(Tarsa::CPort& port);

  PFilter* filter_ = nullptr;
  Tarsa::CPoint lastMouse_{-1, -1};
  bool mouseInside_ = false;
  bool showDragLoupe_ = false;
  bool showKeyLoupe_ = false;
  bool showSource_ = false;
  bool tempZoom_ = false;
  double savedZoom_ = 1.0;
  std::vector<std::uint8_t> loupePixels_;
};

}  // namespace Project
