// archway-gallery: opens the control gallery on the display and writes every
// value a control sends to standard output; exits 0 on OK, 1 on Cancel or
// closing, 2 when there is no display. --screenshot FILE saves what the
// window shows once it has painted, and exits; --page 2 opens the second
// window (lists, popups, tabs, scrolling, progress) instead.

#include <cstdio>
#include <cstring>
#include <memory>
#include <string>

#include "framework/core/CException.h"
#include "framework/native/NativeDisplay.h"
#include "framework/native/SdlEventSource.h"
#include "framework/process/CProcess.h"
#include "tools/gallery/lib/GalleryWindow.h"
#include "tools/gallery/lib/MoreControlsWindow.h"

int main(int argc, char** argv) {
  std::string screenshot;
  bool second = false;
  for (int i = 1; i < argc; ++i) {
    if (std::strcmp(argv[i], "--screenshot") == 0 && i + 1 < argc) {
      screenshot = argv[++i];
    } else if (std::strcmp(argv[i], "--page") == 0 && i + 1 < argc &&
               (std::strcmp(argv[i + 1], "1") == 0 || std::strcmp(argv[i + 1], "2") == 0)) {
      second = std::strcmp(argv[++i], "2") == 0;
    } else {
      std::fprintf(stderr, "usage: archway-gallery [--page 1|2] [--screenshot FILE]\n");
      return 2;
    }
  }
  if (!Tarsa::Native::HasDisplay()) {
    std::fprintf(stderr, "archway-gallery: no display (DISPLAY is not set)\n");
    return 2;
  }
  try {
    Tarsa::CProcess process(std::make_unique<Tarsa::Native::SdlEventSource>());
    process.Start();
    const auto log = [](const std::string& line) {
      std::printf("%s\n", line.c_str());
      std::fflush(stdout);
    };
    std::unique_ptr<Tarsa::CWindow> window;
    if (second) {
      window = std::make_unique<Gallery::MoreControlsWindow>(log);
    } else {
      window = std::make_unique<Gallery::GalleryWindow>(log);
    }
    if (!screenshot.empty()) {
      window->Show();
      process.DoEvents(process.Now() + 0.5);
      window->PaintNow();
      return window->SaveImage(screenshot) ? 0 : 1;
    }
    const Tarsa::CObjID result = window->RunModal();
    return result == Tarsa::CObjID::Intern(Gallery::GalleryWindow::kOk) ||
                   result == Tarsa::CObjID::Intern(Gallery::MoreControlsWindow::kOk)
               ? 0
               : 1;
  } catch (const Tarsa::CException& error) {
    std::fprintf(stderr, "archway-gallery: %s\n", error.ErrorText().c_str());
    return 2;
  }
}
