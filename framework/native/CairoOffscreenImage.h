#pragma once

#include <cairo.h>

#include <memory>

#include "framework/native/CairoPort.h"
#include "framework/view/COffscreenImage.h"

namespace Tarsa::Native {

// An off-screen image as a cairo ARGB image surface, with a CairoPort over
// a context of its own. It owns the surface, the context and the port, and
// destroys them port first.
class CairoOffscreenImage final : public COffscreenImage {
 public:
  explicit CairoOffscreenImage(CSize size);
  ~CairoOffscreenImage() override;
  CairoOffscreenImage(const CairoOffscreenImage&) = delete;
  CairoOffscreenImage& operator=(const CairoOffscreenImage&) = delete;

  CPort& Port() override { return *port_; }
  CSize Size() const override { return size_; }
  std::vector<std::uint8_t> ReadPixels() const override;
  bool SavePng(const std::string& path) const override;

 private:
  CSize size_;
  cairo_surface_t* surface_;
  cairo_t* cairo_;
  std::unique_ptr<CairoPort> port_;
};

}  // namespace Tarsa::Native
