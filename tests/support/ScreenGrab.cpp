#include "tests/support/ScreenGrab.h"

#include <X11/Xlib.h>
#include <X11/Xutil.h>

#include "host/io/HostDocument.h"
#include "host/io/ImageFile.h"

namespace Host::testing {

namespace {

// The right shift that brings a mask's lowest bit to bit 0.
int ShiftOf(unsigned long mask) {
  int shift = 0;
  while (mask != 0 && (mask & 1) == 0) {
    mask >>= 1;
    ++shift;
  }
  return shift;
}

// A window may go while it is read (its program ended): that is an answer
// of null, not the end of the test program, which Xlib's own handler is.
int IgnoreError(Display* /*display*/, XErrorEvent* /*error*/) { return 0; }

}  // namespace

std::unique_ptr<HostDocument> GrabWindow(unsigned long window) {
  Display* display = XOpenDisplay(nullptr);
  if (display == nullptr) return nullptr;
  XSetErrorHandler(IgnoreError);
  std::unique_ptr<HostDocument> document;
  XWindowAttributes attributes;
  if (XGetWindowAttributes(display, Window(window), &attributes) != 0 && attributes.width > 0 &&
      attributes.height > 0) {
    // From the screen, as it is shown: the window's own contents may be
    // held by the client alone.
    int x = 0, y = 0;
    Window child = 0;
    const Window root = DefaultRootWindow(display);
    XTranslateCoordinates(display, Window(window), root, 0, 0, &x, &y, &child);
    XImage* image = XGetImage(display, root, x, y, unsigned(attributes.width),
                              unsigned(attributes.height), AllPlanes, ZPixmap);
    if (image != nullptr) {
      document = HostDocument::Create(attributes.width, attributes.height, ImageMode::kRgb);
      const int shifts[3] = {ShiftOf(image->red_mask), ShiftOf(image->green_mask),
                             ShiftOf(image->blue_mask)};
      const unsigned long masks[3] = {image->red_mask, image->green_mask, image->blue_mask};
      for (int y = 0; y < attributes.height; ++y) {
        for (int x = 0; x < attributes.width; ++x) {
          const unsigned long pixel = XGetPixel(image, x, y);
          const std::size_t at = std::size_t(y) * attributes.width + x;
          for (int c = 0; c < 3; ++c)
            document->Plane8(c)[at] = std::uint8_t((pixel & masks[c]) >> shifts[c]);
        }
      }
      XDestroyImage(image);
    }
  }
  XCloseDisplay(display);
  return document;
}

std::unique_ptr<HostDocument> GrabWindowPng(unsigned long window, const std::string& path) {
  std::unique_ptr<HostDocument> document = GrabWindow(window);
  if (document != nullptr) ImageFile::Write(*document, path, FileFormat::kPng);
  return document;
}

bool RequestClose(unsigned long window) {
  Display* display = XOpenDisplay(nullptr);
  if (display == nullptr) return false;
  XSetErrorHandler(IgnoreError);
  XEvent event{};
  event.xclient.type = ClientMessage;
  event.xclient.window = Window(window);
  event.xclient.message_type = XInternAtom(display, "WM_PROTOCOLS", False);
  event.xclient.format = 32;
  event.xclient.data.l[0] = long(XInternAtom(display, "WM_DELETE_WINDOW", False));
  event.xclient.data.l[1] = CurrentTime;
  const bool sent = XSendEvent(display, Window(window), False, NoEventMask, &event) != 0;
  XFlush(display);
  XCloseDisplay(display);
  return sent;
}

}  // namespace Host::testing
