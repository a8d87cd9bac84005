#pragma once

#include <cairo.h>

#include <memory>
#include <string>

#include "framework/native/CairoPort.h"
#include "framework/view/CNativeWindow.h"

struct SDL_Window;

namespace Tarsa::Native {

// A window of the window system through SDL2, painted in software: the
// framework draws into a cairo image surface of the client's size, and the
// end of a paint copies the painted area to the window. Invalidating posts
// one expose event for the window until it is painted, so paints come from
// the loop in order with input. Owns the SDL window and the surface.
class SdlWindow : public CNativeWindow {
 public:
  SdlWindow(EWindowKind kind, const std::string& title, CSize size, const SdlWindow* parent);
  ~SdlWindow() override;
  SdlWindow(const SdlWindow&) = delete;
  SdlWindow& operator=(const SdlWindow&) = delete;

  CNativeWindowId Id() const override { return id_; }
  EWindowKind Kind() const override { return kind_; }
  CSize ClientSize() const override;
  void SetClientSize(CSize size) override;
  CPoint Position() const override;
  void SetPosition(CPoint where) override;
  void SetTitle(const std::string& title) override;
  void Show(bool shown) override;
  void Invalidate(const CRect& rect) override;

  CPort& BeginPaint(const CRect& area) override;
  void EndPaint() override;

  bool SaveImage(const std::string& path) const override;
  std::uint64_t SystemHandle() const override;

 private:
  // Makes the surface match the client size; its content is kept where the
  // sizes overlap.
  void FitSurface();

  EWindowKind kind_;
  SDL_Window* window_ = nullptr;
  CNativeWindowId id_ = 0;
  cairo_surface_t* surface_ = nullptr;
  cairo_t* paintContext_ = nullptr;
  std::unique_ptr<CairoPort> port_;
  bool exposePosted_ = false;
};

}  // namespace Tarsa::Native
