#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "framework/core/CRect.h"
#include "framework/process/CNativeEventSource.h"
#include "framework/view/COffscreenImage.h"
#include "framework/view/CPort.h"

namespace Tarsa {

// The window kinds, with the class names the framework gives them.
enum class EWindowKind : std::int32_t {
  kDocument = 1,  // "Tarsa_WindowClass"
  kModal = 2,     // "Tarsa_ModalClass"
  kFloating = 3,  // "Tarsa_FloatingClass"
  kPopup = 4,     // "Tarsa_PopupClass"
  kLayered = 5,   // "Tarsa_LayeredClass"
};

const char* WindowClassName(EWindowKind kind);

// A window of the window system as the framework sees it: an id its events
// carry, a client size, a title, and a surface the framework paints with a
// port and then shows. Made by the native layer (CreateNativeWindow); owned
// by the CWindow that shows the framework's views in it.
class CNativeWindow {
 public:
  virtual ~CNativeWindow() = default;

  virtual CNativeWindowId Id() const = 0;
  virtual EWindowKind Kind() const = 0;
  virtual CSize ClientSize() const = 0;
  virtual void SetClientSize(CSize size) = 0;
  virtual CPoint Position() const = 0;
  virtual void SetPosition(CPoint where) = 0;
  virtual void SetTitle(const std::string& title) = 0;
  virtual void Show(bool shown) = 0;
  // Marks the window for painting; the loop's paint event then draws it.
  virtual void Invalidate(const CRect& rect) = 0;

  // A port over the window's surface, clipped to the area to paint; the
  // port is valid until EndPaint, which shows what was drawn.
  virtual CPort& BeginPaint(const CRect& area) = 0;
  virtual void EndPaint() = 0;

  // Writes what the window shows to a PNG file; false on failure.
  virtual bool SaveImage(const std::string& path) const = 0;
  // The window system's own handle (an X window id on X11), for tools that
  // drive the window from outside; 0 when there is none.
  virtual std::uint64_t SystemHandle() const = 0;
};

// A port that draws nowhere, for measuring text before a window is laid out.
std::unique_ptr<CPort> CreateMeasuringPort();

// A transparent image of that size in memory, with its port; it needs no
// display.
std::unique_ptr<COffscreenImage> CreateOffscreenImage(CSize size);

// Opens a window of the kind, hidden, over the parent when one is given
// (a modal window stays above it and blocks it). Throws CError when the
// window system cannot make one.
std::unique_ptr<CNativeWindow> CreateNativeWindow(EWindowKind kind, const std::string& title,
                                                  CSize size, const CNativeWindow* parent);

}  // namespace Tarsa
