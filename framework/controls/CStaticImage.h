#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "framework/view/CPane.h"

namespace Tarsa {

// An image the user looks at: RGBA pixels handed in, or an icon resource
// found by name (and state) among the module's icons. It is drawn at its
// own size, centred, or shrunk to fit the view, keeping its proportions.
// An icon that cannot be found draws nothing.
class CStaticImage : public CPane {
 public:
  CStaticImage(CObjID id, CView* parent, const CRect& frame, std::uint32_t binding = kBind_Fixed);

  // 8-bit RGBA rows, straight alpha; the pixels are copied.
  void SetPixels(const std::uint8_t* rgba, std::int32_t width, std::int32_t height,
                 std::int32_t rowBytes);
  // An icon of the module; false when there is none by that name and state.
  bool SetIcon(const std::string& name, std::uint32_t state = 0);
  // Scales the image up to fill the view as well (down it always goes).
  void SetStretch(bool stretch);
  bool HasImage() const { return width_ > 0 && height_ > 0; }
  CSize ImageSize() const { return {width_, height_}; }
  // Where the image is drawn, in the view's space.
  CRect DrawnRect() const;

  void Draw(CPort& port) override;

 private:
  std::vector<std::uint8_t> pixels_;
  std::int32_t width_ = 0;
  std::int32_t height_ = 0;
  bool stretch_ = false;
};

}  // namespace Tarsa
