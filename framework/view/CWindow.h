#pragma once

#include <map>
#include <memory>
#include <string>

#include "framework/process/CNativeWindowHandler.h"
#include "framework/process/CTimer.h"
#include "framework/view/CNativeWindow.h"
#include "framework/view/CView.h"

namespace Tarsa {

class CIconCursor;
class CNativeCursor;

// The root of a view tree, shown in a native window: it paints the tree
// into the window, turns the window's mouse events into mouse messages for
// the view under the pointer, follows the window's size with its children's
// bindings, and gives the keyboard its dialog meaning: Tab and Shift-Tab
// move the target between tab stops in tree order, Return presses the
// default view, Escape (or closing the window) the cancel view. A modal
// window runs the process's loop until EndModal.
//
// Owns its native window and, as every view, its children. Registered with
// the process, which must outlive it.
class CWindow : public CView, public CNativeWindowHandler {
 public:
  CWindow(CObjID id, EWindowKind kind, const std::string& title, CSize size,
          const CWindow* parent = nullptr);
  ~CWindow() override;

  CWindow* Window() const override { return const_cast<CWindow*>(this); }
  CNativeWindow& Native() { return *native_; }
  const CNativeWindow& Native() const { return *native_; }
  CNativeWindowId NativeId() const { return native_->Id(); }

  void Show();
  void Hide();
  bool IsOpen() const { return open_; }
  void SetTitle(const std::string& title) { native_->SetTitle(title); }
  // Sizes the window's client area; the views follow by their bindings.
  void SetClientSize(CSize size);

  void InvalidateArea(const CRect& area);
  // Paints the whole tree now, without waiting for the loop.
  void PaintNow();
  bool SaveImage(const std::string& path) { return native_->SaveImage(path); }

  void HandleNative(const CNativeEvent& event) override;
  void HandleMessage(CMessage& message) override;

  // The view a mouse-down went to keeps the mouse until the button is up.
  CView* Capture() const { return capture_; }
  void SetCapture(CView* view) { capture_ = view; }
  // The view under the pointer; a change calls the leave and enter hooks.
  void SetHover(CView* view);
  CView* Hover() const { return hover_; }
  // A mouse-down on view: the click count, 1 for a first click.
  std::int32_t CountClick(const CView* view, const CMouseMessage& message);

  // The cursor number shown now (0: the arrow), and whether its image could
  // be shown (else the arrow stands in).
  std::int32_t CursorShown() const { return cursorShown_; }
  bool CursorShowsImage() const;

  // The views Return and Escape press (by id, looked up when pressed).
  void SetDefaultView(CObjID id) { defaultView_ = id; }
  void SetCancelView(CObjID id) { cancelView_ = id; }
  CObjID DefaultView() const { return defaultView_; }
  CObjID CancelView() const { return cancelView_; }

  // Moves the target to the next (or previous) tab stop; false when there
  // is none.
  bool FocusNext(bool backwards);

  // Shows the window, starts its views, and runs the loop until EndModal;
  // the id EndModal was given, or none when the process quit.
  CObjID RunModal();
  void EndModal(CObjID result);
  bool ModalEnded() const { return modalEnded_; }

  // A view in the tree by id, or null.
  CView* FindView(CObjID id);

  static constexpr double kDoubleClickTime = 0.5;  // seconds

 protected:
  // Closing the window by its frame: presses the cancel view, or ends a
  // modal loop with no result, or hides the window.
  virtual void CloseRequested();
  void OnBecameTarget() override {}

 private:
  void DeliverMouse(const CNativeEvent& event);
  // Shows the cursor the view under the pointer asks for.
  void UpdateCursor();
  // From the tip timer: shows the hovered view's tip once the pointer has
  // rested long enough.
  void ShowTipIfDue(double now);
  void DrawTip(CPort& port);

  class TipTimer : public CTimer {
   public:
    explicit TipTimer(CWindow& window) : CTimer(0.1), window_(window) {}
    void Fire(double time, double /*elapsed*/) override { window_.ShowTipIfDue(time); }

   private:
    CWindow& window_;
  };

  std::unique_ptr<CNativeWindow> native_;
  bool open_ = false;
  CView* capture_ = nullptr;
  CView* hover_ = nullptr;
  const CView* lastClickView_ = nullptr;
  std::uint32_t lastClickButton_ = 0;
  double lastClickTime_ = -1e9;
  CPoint lastClickWhere_;
  std::int32_t lastClickCount_ = 0;
  CObjID defaultView_;
  CObjID cancelView_;
  bool modalEnded_ = false;
  CObjID modalResult_;
  std::unique_ptr<TipTimer> tipTimer_;
  double restingSince_ = 0.0;
  CPoint pointer_;
  bool tipShown_ = false;
  std::int32_t cursorShown_ = -1;
  std::map<std::int32_t, std::unique_ptr<CIconCursor>> cursors_;
  std::unique_ptr<CNativeCursor> arrow_;
};

}  // namespace Tarsa
