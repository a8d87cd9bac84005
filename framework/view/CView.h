#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "framework/core/CRect.h"
#include "framework/process/CMessenger.h"
#include "framework/process/CObjID.h"
#include "framework/view/CMouseMessage.h"
#include "framework/view/CPort.h"
#include "framework/view/ViewConstants.h"

namespace Tarsa {

class CTracker;
class CWindow;
struct CMouseEvent;

// A node of a window's view tree: a frame in its parent's space, an image
// (the part of its own space the frame shows, which moves when it scrolls),
// scroll limits and a content rectangle, a binding that says how it follows
// its parent's size, and the option word's flags. Every view is a messenger
// whose supervisor is its parent, so views sit on the target chain.
//
// A view is made with its parent, which owns it from then on: children are
// deleted with their parent, last made first. A point p of a view's own
// space lies at frameOrigin + (p - image top left) in its parent's space.
class CView : public virtual CMessenger {
 public:
  // frame: in the parent's space (the window's, for a root). The content
  // starts as the frame's size unless a content size is given.
  CView(CObjID id, CView* parent, const CRect& frame, std::uint32_t options = kView_NoOptions,
        std::uint32_t binding = kBind_Fixed, std::int32_t contentWidth = -1,
        std::int32_t contentHeight = -1);
  ~CView() override;
  CView(const CView&) = delete;
  CView& operator=(const CView&) = delete;

  CView* Parent() const { return parent_; }
  const std::vector<CView*>& Children() const { return children_; }
  // Deletes a child and everything under it.
  void DeleteChild(CView* child);
  // Puts the view in front of its siblings: drawn last, offered the mouse
  // first (an open list laid over the window's other views).
  void BringToFront();
  // The window at the root, or null for a tree not in one.
  virtual CWindow* Window() const;

  // Geometry.
  CRect Frame() const;  // in the parent's space
  CSize Size() const { return {imageRight_ - imageLeft_, imageBottom_ - imageTop_}; }
  // The part of the own space the frame shows.
  CRect Image() const { return {imageLeft_, imageTop_, imageRight_, imageBottom_}; }
  CRect Limits() const { return {limitLeft_, limitTop_, limitRight_, limitBottom_}; }
  CRect Content() const { return {contentLeft_, contentTop_, contentRight_, contentBottom_}; }
  std::uint32_t ViewFlags() const { return viewFlags_; }
  std::uint32_t Binding() const { return binding_; }

  // Moves and sizes the frame (in the parent's space); the children follow
  // the change of size by their bindings.
  void SetFrame(const CRect& frame);
  void SetContent(const CRect& content);
  // Scrolls so that the image's top left is at `where`, kept in the limits.
  void ScrollTo(CPoint where);
  void ScrollBy(std::int32_t dx, std::int32_t dy);
  // Recomputes the scroll limits from the image and the content.
  void ClampScroll();
  // Whether pinning moves the content rather than the image.
  virtual bool PinsByMovingContent() const { return false; }
  // Called after the frame's size changed (children have followed already),
  // and after ScrollTo moved the image: a scrolled view keeps what depends
  // on its visible part up to date here.
  virtual void SizeChanged(std::int32_t /*dx*/, std::int32_t /*dy*/) {}
  virtual void OnScrolled() {}

  CPoint LocalToWindow(CPoint p) const;
  CPoint WindowToLocal(CPoint p) const;
  CRect LocalToWindow(const CRect& r) const;

  // Visible here and in every ancestor.
  bool IsVisible() const;

  // Drawing: Invalidate marks the view's frame for the next paint; Redraw
  // paints the window now.
  void Invalidate();
  void Redraw();
  // Draws this view and, above it, its children, each clipped to its frame.
  void DrawTree(CPort& port);
  // The view's own drawing, in its own space.
  virtual void Draw(CPort& /*port*/) {}

  // Mouse.
  // The hit region, in the own space: the image by default.
  virtual bool HitTest(CPoint where) const;
  bool TakesMouse() const;
  // Offers the message to the children, front to back, then takes it here.
  void DispatchMouse(CMouseMessage& message);
  // Counts a mouse-down as a single or repeated click and calls the hook;
  // false when the click was refused (the target would not change).
  bool RegisterClick(CMouseMessage& message);
  virtual void MouseDown(CMouseMessage& message);
  virtual void MouseUp(CMouseMessage& /*message*/) {}
  virtual void MouseMoved(CMouseMessage& /*message*/) {}
  virtual void MouseWheel(CMouseMessage& message);
  virtual void MouseEnter() {}
  virtual void MouseLeave() {}
  // The cursor over this view: a cursor number of the icon resources, or 0
  // for the parent's (the arrow at the root).
  virtual std::int32_t CursorId() const { return 0; }
  // Hooks of a click, by button: the first click, and a repeated one
  // (declining, with false, sends it on as a single click).
  virtual void Click(CMouseMessage& /*message*/) {}
  virtual bool MultiClick(CMouseMessage& /*message*/) { return false; }

  // A drag the view follows itself (CViewTracker), its steps by client
  // word: Track (false stops), keys (false stops), key releases, idle time.
  virtual bool TrackStep(CTracker& /*tracker*/, std::int32_t /*client*/, bool /*moved*/,
                         bool /*modifiersChanged*/) {
    return true;
  }
  virtual bool TrackKey(CTracker& /*tracker*/, std::int32_t /*client*/,
                        const CNativeEvent& /*event*/) {
    return true;
  }
  virtual void TrackKeyUp(CTracker& /*tracker*/, std::int32_t /*client*/,
                          const CNativeEvent& /*event*/) {}
  virtual void TrackIdle(CTracker& /*tracker*/, std::int32_t /*client*/,
                         const CMouseEvent& /*event*/) {}

  // Focus: whether the view can be the target, and whether Tab stops here.
  bool WantsTarget() const { return (viewFlags_ & kViewFlag_Target) != 0; }
  bool IsTabStop() const { return (viewFlags_ & kViewFlag_TabStop) != 0; }

  // A help text shown near the view after the pointer rests on it.
  void AddTip(const std::string& text, std::int32_t place = 0, double delay = 0.6);
  const std::string& Tip() const { return tip_; }
  double TipDelay() const { return tipDelay_; }

  // Once: marks the view started, invalidates when asked, runs OnStart,
  // takes the target when it is the view to have it, then starts children.
  void Start();
  bool IsStarted() const { return (viewFlags_ & kViewFlag_Started) != 0; }
  virtual void OnStart() {}
  // Whether this view takes the target when the window starts.
  virtual bool TakesTargetAtStart() const { return false; }

  void SetShown(bool shown) override;
  void SetEnabled(bool enabled) override;
  CNativeWindowId NativeWindow() const override;

 protected:
  // The parent changed size by (dx, dy): follow by the binding.
  void ParentResized(std::int32_t dx, std::int32_t dy);
  void OnBecameTarget() override { Invalidate(); }
  void OnLostTarget() override { Invalidate(); }

 private:
  void ClampAxis(bool scrolls, std::uint32_t limitLow, std::uint32_t limitHigh,
                 std::int32_t& image0, std::int32_t& image1, std::int32_t& limit0,
                 std::int32_t& limit1, std::int32_t& content0, std::int32_t& content1);
  void ResizeBy(std::int32_t dx, std::int32_t dy);

  CView* parent_ = nullptr;
  std::int32_t frameOriginX_ = 0;
  std::int32_t frameOriginY_ = 0;
  std::int32_t imageLeft_ = 0, imageTop_ = 0, imageRight_ = 0, imageBottom_ = 0;
  std::int32_t limitLeft_ = 0, limitTop_ = 0, limitRight_ = 0, limitBottom_ = 0;
  std::int32_t contentLeft_ = 0, contentTop_ = 0, contentRight_ = 0, contentBottom_ = 0;
  std::vector<CView*> children_;  // owned; back to front
  std::uint32_t viewFlags_ = 0;
  std::uint32_t binding_ = 0;
  std::string tip_;
  double tipDelay_ = 0.6;
};

}  // namespace Tarsa
