#include "framework/icons/CIconCursor.h"

#include "framework/core/CException.h"
#include "framework/icons/CPNGFormat.h"
#include "framework/icons/CResourceDataProvider.h"
#include "framework/icons/IconStates.h"
#include "framework/native/CNativeCursor.h"

namespace Tarsa {
namespace {

const ResourceDataProvider* ModuleProvider() {
  try {
    return &CResourceDataProvider::Module();
  } catch (const CException&) {
    // No icons at all: every cursor is the arrow.
    return nullptr;
  }
}

std::optional<CIconCursor::Image> LoadAt(const ResourceDataProvider& provider,
                                         std::string_view name, std::uint32_t resolution) {
  const std::uint32_t state = IconStateIndex(IconState::kNormal);
  std::size_t size = 0;
  const std::uint8_t* data = nullptr;
  std::uint32_t width = 0;
  std::uint32_t height = 0;
  std::int32_t hotX = 0;
  std::int32_t hotY = 0;
  std::uint32_t baseWidth = 0;
  std::uint32_t baseHeight = 0;
  if (!provider.GetData(name, resolution, state, size, data) ||
      !provider.GetSize(name, resolution, state, width, height) ||
      !provider.GetSize(name, 0, state, baseWidth, baseHeight) ||
      !provider.GetHotSpot(name, hotX, hotY)) {
    return std::nullopt;
  }
  CIconCursor::Image image;
  try {
    image.pixels = CPNGFormat::Decode({data, size}, ResourceDataProvider::kMaxImageSide);
  } catch (const CException&) {
    return std::nullopt;
  }
  // The index's size and the file's must agree, or the entry is damaged.
  const CRect bounds = image.pixels->Bounds();
  if (bounds.Width() != width || bounds.Height() != height) return std::nullopt;
  // The hot spot is stored for resolution 0 and scales with the image.
  image.hotX = static_cast<std::int32_t>(std::int64_t{hotX} * width / baseWidth);
  image.hotY = static_cast<std::int32_t>(std::int64_t{hotY} * height / baseHeight);
  return image;
}

}  // namespace

CIconCursor::CIconCursor(std::int32_t id)
    : provider_(ModuleProvider()), name_(std::to_string(id)) {}

CIconCursor::CIconCursor(const ResourceDataProvider& provider, std::string_view name)
    : provider_(&provider), name_(name) {}

CIconCursor::~CIconCursor() = default;

std::optional<CIconCursor::Image> CIconCursor::LoadImage(const ResourceDataProvider& provider,
                                                         std::string_view name,
                                                         std::uint32_t resolution) {
  if (resolution != 0) {
    if (auto image = LoadAt(provider, name, resolution)) return image;
  }
  return LoadAt(provider, name, 0);
}

void CIconCursor::Set() {
  if (!native_ || !native_->IsMade()) {
    std::optional<Image> image;
    if (provider_ != nullptr) {
      image = LoadImage(*provider_, name_, CNativeCursor::DisplayIconResolution());
    }
    native_ = std::make_unique<CNativeCursor>(image ? image->pixels.get() : nullptr,
                                              image ? image->hotX : 0, image ? image->hotY : 0);
  }
  native_->Set();
}

bool CIconCursor::ShowsImage() const { return native_ && native_->IsColour(); }

}  // namespace Tarsa
