#include "framework/controls/CStaticImage.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "framework/core/CException.h"
#include "framework/icons/CPNGFormat.h"
#include "framework/icons/CResourceDataProvider.h"

namespace Tarsa {

CStaticImage::CStaticImage(CObjID id, CView* parent, const CRect& frame, std::uint32_t binding)
    : CPane(id, parent, frame, kView_NoOptions, binding) {}

void CStaticImage::SetPixels(const std::uint8_t* rgba, std::int32_t width, std::int32_t height,
                             std::int32_t rowBytes) {
  width_ = rgba != nullptr ? std::max(0, width) : 0;
  height_ = rgba != nullptr ? std::max(0, height) : 0;
  pixels_.assign(std::size_t(width_) * height_ * 4, 0);
  for (std::int32_t y = 0; y < height_; ++y) {
    std::memcpy(pixels_.data() + std::size_t(y) * width_ * 4, rgba + std::size_t(y) * rowBytes,
                std::size_t(width_) * 4);
  }
  Invalidate();
}

bool CStaticImage::SetIcon(const std::string& name, std::uint32_t state) {
  width_ = height_ = 0;
  pixels_.clear();
  Invalidate();
  try {
    const ResourceDataProvider& icons = CResourceDataProvider::Module();
    std::size_t size = 0;
    const std::uint8_t* data = nullptr;
    if (!icons.GetData(name, 0, state, size, data)) return false;
    const auto image = CPNGFormat::Decode({data, size}, ResourceDataProvider::kMaxImageSide);
    const CRect bounds = image->Bounds();
    SetPixels(image->Data(), std::int32_t(bounds.Width()), std::int32_t(bounds.Height()),
              std::int32_t(image->RowBytes()));
    return true;
  } catch (const CException&) {
    // No icons in this program, or a damaged one: nothing to draw.
    return false;
  }
}

void CStaticImage::SetStretch(bool stretch) {
  stretch_ = stretch;
  Invalidate();
}

CRect CStaticImage::DrawnRect() const {
  const CRect image = Image();
  if (!HasImage()) return CRect{image.left, image.top, image.left, image.top};
  double scale = std::min(double(image.Width()) / width_, double(image.Height()) / height_);
  if (!stretch_) scale = std::min(scale, 1.0);
  const auto w = std::int32_t(std::lround(width_ * scale));
  const auto h = std::int32_t(std::lround(height_ * scale));
  const std::int32_t left = image.left + (std::int32_t(image.Width()) - w) / 2;
  const std::int32_t top = image.top + (std::int32_t(image.Height()) - h) / 2;
  return CRect{left, top, left + w, top + h};
}

void CStaticImage::Draw(CPort& port) {
  if (!HasImage()) return;
  port.DrawImage(pixels_.data(), width_, height_, width_ * 4, DrawnRect());
}

}  // namespace Tarsa
