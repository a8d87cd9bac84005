#include "framework/native/SdlWindow.h"

#include <SDL.h>
#include <SDL_syswm.h>

#include "framework/core/CException.h"
#include "framework/native/NativeDisplay.h"

namespace Tarsa {

const char* WindowClassName(EWindowKind kind) {
  switch (kind) {
    case EWindowKind::kModal:
      return "Tarsa_ModalClass";
    case EWindowKind::kFloating:
      return "Tarsa_FloatingClass";
    case EWindowKind::kPopup:
      return "Tarsa_PopupClass";
    case EWindowKind::kLayered:
      return "Tarsa_LayeredClass";
    case EWindowKind::kDocument:
      break;
  }
  return "Tarsa_WindowClass";
}

namespace {

// A cairo port on a one-pixel surface, owning both.
class MeasuringPort : public Native::CairoPort {
 public:
  MeasuringPort() : MeasuringPort(cairo_image_surface_create(CAIRO_FORMAT_RGB24, 1, 1)) {}
  ~MeasuringPort() override {
    cairo_destroy(cairo_);
    cairo_surface_destroy(surface_);
  }

 private:
  explicit MeasuringPort(cairo_surface_t* surface)
      : MeasuringPort(surface, cairo_create(surface)) {}
  MeasuringPort(cairo_surface_t* surface, cairo_t* cairo)
      : CairoPort(cairo), surface_(surface), cairo_(cairo) {}

  cairo_surface_t* surface_;
  cairo_t* cairo_;
};

}  // namespace

std::unique_ptr<CPort> CreateMeasuringPort() { return std::make_unique<MeasuringPort>(); }

std::unique_ptr<CNativeWindow> CreateNativeWindow(EWindowKind kind, const std::string& title,
                                                  CSize size, const CNativeWindow* parent) {
  return std::make_unique<Native::SdlWindow>(kind, title, size,
                                             dynamic_cast<const Native::SdlWindow*>(parent));
}

namespace Native {

SdlWindow::SdlWindow(EWindowKind kind, const std::string& title, CSize size,
                     const SdlWindow* parent)
    : kind_(kind) {
  if (!StartWindowSystem()) {
    throw CError("$$$/Tarsa/Native/Error/NoDisplay=The display cannot be opened.");
  }
  Uint32 flags = SDL_WINDOW_HIDDEN;
  if (kind == EWindowKind::kPopup) flags |= SDL_WINDOW_BORDERLESS | SDL_WINDOW_POPUP_MENU;
  if (kind == EWindowKind::kDocument || kind == EWindowKind::kModal) flags |= SDL_WINDOW_RESIZABLE;
  window_ = SDL_CreateWindow(title.c_str(), SDL_WINDOWPOS_CENTERED, SDL_WINDOWPOS_CENTERED,
                             std::max(1, size.width), std::max(1, size.height), flags);
  if (window_ == nullptr) {
    throw CError(std::string("$$$/Tarsa/Native/Error/Window=A window cannot be opened: ") +
                 SDL_GetError());
  }
  id_ = SDL_GetWindowID(window_);
  SDL_SetWindowData(window_, "Tarsa.class", const_cast<char*>(WindowClassName(kind)));
  if (parent != nullptr && kind == EWindowKind::kModal) {
    SDL_SetWindowModalFor(window_, parent->window_);
  }
  FitSurface();
}

SdlWindow::~SdlWindow() {
  port_.reset();
  if (paintContext_ != nullptr) cairo_destroy(paintContext_);
  if (surface_ != nullptr) cairo_surface_destroy(surface_);
  if (window_ != nullptr) SDL_DestroyWindow(window_);
}

CSize SdlWindow::ClientSize() const {
  int w = 0, h = 0;
  SDL_GetWindowSize(window_, &w, &h);
  return {w, h};
}

void SdlWindow::SetClientSize(CSize size) {
  SDL_SetWindowSize(window_, std::max(1, size.width), std::max(1, size.height));
  FitSurface();
}

CPoint SdlWindow::Position() const {
  int x = 0, y = 0;
  SDL_GetWindowPosition(window_, &x, &y);
  return {x, y};
}

void SdlWindow::SetPosition(CPoint where) { SDL_SetWindowPosition(window_, where.x, where.y); }

void SdlWindow::SetTitle(const std::string& title) { SDL_SetWindowTitle(window_, title.c_str()); }

void SdlWindow::Show(bool shown) {
  if (shown) {
    SDL_ShowWindow(window_);
    SDL_RaiseWindow(window_);
  } else {
    SDL_HideWindow(window_);
  }
}

void SdlWindow::FitSurface() {
  const CSize size = ClientSize();
  if (surface_ != nullptr && cairo_image_surface_get_width(surface_) == size.width &&
      cairo_image_surface_get_height(surface_) == size.height) {
    return;
  }
  cairo_surface_t* fresh = cairo_image_surface_create(CAIRO_FORMAT_RGB24, std::max(1, size.width),
                                                      std::max(1, size.height));
  if (surface_ != nullptr) {
    cairo_t* copy = cairo_create(fresh);
    cairo_set_source_surface(copy, surface_, 0, 0);
    cairo_paint(copy);
    cairo_destroy(copy);
    cairo_surface_destroy(surface_);
  }
  surface_ = fresh;
}

void SdlWindow::Invalidate(const CRect& /*rect*/) {
  // The whole client is painted each time: a dialog's surface is small, and
  // one region to track keeps the paint road simple.
  if (exposePosted_) return;
  SDL_Event e{};
  e.type = SDL_WINDOWEVENT;
  e.window.event = SDL_WINDOWEVENT_EXPOSED;
  e.window.windowID = static_cast<Uint32>(id_);
  exposePosted_ = SDL_PushEvent(&e) == 1;
}

CPort& SdlWindow::BeginPaint(const CRect& area) {
  exposePosted_ = false;
  FitSurface();
  paintContext_ = cairo_create(surface_);
  port_ = std::make_unique<CairoPort>(paintContext_);
  port_->Clip(area);
  return *port_;
}

void SdlWindow::EndPaint() {
  port_.reset();
  cairo_destroy(paintContext_);
  paintContext_ = nullptr;
  cairo_surface_flush(surface_);
  SDL_Surface* target = SDL_GetWindowSurface(window_);
  if (target == nullptr) return;
  SDL_Surface* source = SDL_CreateRGBSurfaceWithFormatFrom(
      cairo_image_surface_get_data(surface_), cairo_image_surface_get_width(surface_),
      cairo_image_surface_get_height(surface_), 32, cairo_image_surface_get_stride(surface_),
      SDL_PIXELFORMAT_RGB888);
  if (source == nullptr) return;
  SDL_BlitSurface(source, nullptr, target, nullptr);
  SDL_FreeSurface(source);
  SDL_UpdateWindowSurface(window_);
}

bool SdlWindow::SaveImage(const std::string& path) const {
  return surface_ != nullptr &&
         cairo_surface_write_to_png(surface_, path.c_str()) == CAIRO_STATUS_SUCCESS;
}

std::uint64_t SdlWindow::SystemHandle() const {
  SDL_SysWMinfo info;
  SDL_VERSION(&info.version);
  if (SDL_GetWindowWMInfo(window_, &info) != SDL_TRUE) return 0;
#if defined(SDL_VIDEO_DRIVER_X11)
  if (info.subsystem == SDL_SYSWM_X11) return static_cast<std::uint64_t>(info.info.x11.window);
#endif
  return 0;
}

}  // namespace Native
}  // namespace Tarsa
