#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "framework/pixels/CDisplayPixmap.h"

namespace Tarsa {

class CNativeCursor;
class ResourceDataProvider;

// A mouse cursor drawn from the icon resources: the image of a name (state
// 0), at the resolution the display wants, with the index's hot spot scaled
// to that resolution. The workspace's cursors go by number (26000, 14001),
// which the provider finds under "Alpha_" and the number. When the image is
// missing or damaged the system arrow stands in, so a cursor never fails.
//
// The native cursor is made on the first Set(), when the windows are up,
// and owned by this object; the provider must outlive it. Tools make their
// cursors once and keep them.
class CIconCursor {
 public:
  // The pixels and hot spot a cursor shows.
  struct Image {
    std::unique_ptr<CDisplayPixmap> pixels;
    std::int32_t hotX = 0;
    std::int32_t hotY = 0;
  };

  // A cursor of the module's own icons.
  explicit CIconCursor(std::int32_t id);
  CIconCursor(const ResourceDataProvider& provider, std::string_view name);
  ~CIconCursor();
  CIconCursor(const CIconCursor&) = delete;
  CIconCursor& operator=(const CIconCursor&) = delete;

  // Makes this the pointer's cursor.
  void Set();
  // Whether the last Set() showed the image rather than the arrow.
  bool ShowsImage() const;

  // The image of a name at a resolution, else at resolution 0 (with the hot
  // spot as stored); nothing when neither can be had and decoded.
  static std::optional<Image> LoadImage(const ResourceDataProvider& provider, std::string_view name,
                                        std::uint32_t resolution);

 private:
  const ResourceDataProvider* provider_;
  std::string name_;
  std::unique_ptr<CNativeCursor> native_;
};

}  // namespace Tarsa
