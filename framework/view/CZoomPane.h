#pragma once

#include <array>
#include <cstdint>

#include "framework/process/CObjID.h"
#include "framework/view/CPane.h"

namespace Tarsa {

// A pane that shows a picture (a document measured in image pixels) at a
// zoom kept between two limits, and scrolls over it through the view model:
// the content is the picture at the zoom, its top left at PictureOrigin(),
// and the image (the part the frame shows) moves over it, so scroll bars,
// the wheel and the panner all work on it as on any scrolling view. A
// picture smaller than the frame on an axis is centred there.
//
// View coordinates are the pane's own space, the one its Draw and its mouse
// messages use: view = image point x Scale() + PictureOrigin(). Because that
// space scrolls, the visible part is Image(), not (0, 0, width, height).
//
// Every change of the zoom calls ZoomChanged(), and every move or resize of
// the visible part ScrollChanged(); each is also sent up the supervisor
// chain as a message (ZoomChangedName(), ScrollChangedName(), from this
// pane), so that a scroller or a dialog can follow. A subclass draws the
// picture in its own Draw, after the base has painted the background.
class CZoomPane : public CPane {
 public:
  // The zoom steps that ZoomIn and ZoomOut walk.
  static constexpr std::array<double, 19> kLadder{
      0.001, 0.005, 0.01, 0.025, 0.0625, 0.125, 0.25, 1.0 / 3.0, 0.5, 2.0 / 3.0,
      1.0,   2.0,   3.0,  4.0,   6.0,    8.0,   10.0, 12.0,      16.0};
  // The largest picture, in view pixels, in each coordinate mode.
  static constexpr std::int32_t kBigCoordinateExtent = 32000;
  static constexpr std::int32_t kCoordinateExtent = 1073741823;
  // Bit 6 of the modifier word: a wheel that reports fine steps, which
  // zooms by whole ladder steps.
  static constexpr std::uint32_t kModifier_HighResolutionWheel = 1u << 6;
  // Pixels a wheel line scrolls.
  static constexpr std::int32_t kWheelLine = 36;

  // The scroll bits are added to the binding: the pane always scrolls.
  CZoomPane(CObjID id, CView* parent, const CRect& frame, std::uint32_t options = kView_NoOptions,
            std::uint32_t binding = kBind_Fixed);

  // The picture's size in image pixels; the limits follow it.
  void SetDocumentSize(CSize size);
  CSize DocumentSize() const { return document_; }

  double Zoom() const { return zoom_; }
  double ZoomMin() const { return zoomMin_; }
  double ZoomMax() const { return zoomMax_; }
  // The limits the layout asks for. The effective ones are narrower when
  // the picture would shrink below one pixel, or grow beyond the largest
  // extent of the coordinate mode (kView_BigCoordinates: 32000 pixels).
  void SetZoomLimits(double layoutMin, double layoutMax);
  // Pixels kept free around the picture on each side by FitInView.
  void SetFitCushion(int pixels) { fitCushion_ = pixels; }
  int FitCushion() const { return fitCushion_; }
  // The display's scale factor (no high-density displays here) and the
  // factor from image to view pixels.
  double DisplayScale() const { return 1.0; }
  double Scale() const { return zoom_ / DisplayScale(); }

  // Sets the zoom, kept in the limits, keeping viewPoint (the frame's
  // centre when null) over the same picture point. False when the zoom
  // stayed as it was.
  bool SetZoom(double value, const CPointF* viewPoint = nullptr);
  // The next ladder step up or down, within the limits; nothing at a limit.
  bool ZoomIn(const CPointF* viewPoint = nullptr);
  bool ZoomOut(const CPointF* viewPoint = nullptr);
  bool CanZoomIn() const { return zoom_ < zoomMax_; }
  bool CanZoomOut() const { return zoom_ > zoomMin_; }
  // The largest zoom at which the picture fits the frame less the cushion
  // on each side, within the limits.
  double FitZoom() const;
  bool FitInView();
  // 100%, about the centre.
  bool ActualPixels();
  // Whether the wheel zooms without Alt held.
  void SetWheelZooms(bool zooms) { wheelZooms_ = zooms; }

  // The picture in view coordinates.
  CPoint PictureOrigin() const { return {0, 0}; }
  CRect PictureRect() const;
  // The part of the picture in sight (the picture cut to Image()).
  CRect VisiblePictureRect() const;
  CPointF ViewToImage(CPointF view) const;
  CPointF ImageToView(CPointF image) const;

  // The ladder's steps next to a zoom, falling back on the limits; and the
  // wheel's tenth of the way towards the next step.
  static double StepUp(double zoom, double zoomMin, double zoomMax);
  static double StepDown(double zoom, double zoomMin, double zoomMax);
  static double WheelZoom(double zoom, bool up, double zoomMin, double zoomMax);

  // The names of the messages a pane sends up its chain.
  static CObjID ZoomChangedName();
  static CObjID ScrollChangedName();

  void MouseWheel(CMouseMessage& message) override;
  void SizeChanged(std::int32_t dx, std::int32_t dy) override;
  void OnScrolled() override;

 protected:
  // The hooks; both redraw the pane unless a subclass does otherwise.
  virtual void ZoomChanged() { Invalidate(); }
  virtual void ScrollChanged() { Invalidate(); }

 private:
  void UpdateLimits();
  // Sets the zoom and the content, scrolls so that the picture point under
  // viewPoint stays there, and runs the hooks for what changed.
  bool ApplyZoom(double zoom, const CPointF* viewPoint);
  void Announce(CObjID name);

  CSize document_;
  double zoom_ = 1.0;
  double layoutMin_ = 0.001;
  double layoutMax_ = 16.0;
  double zoomMin_ = 0.001;
  double zoomMax_ = 16.0;
  int fitCushion_ = 3;
  bool wheelZooms_ = false;
  bool adjusting_ = false;  // the pane's own scrolling, reported once at its end
};

}  // namespace Tarsa
