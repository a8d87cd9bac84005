#include "tools/resgen/icons/IconResources.h"

#include <cairo.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <limits>
#include <string>

#include "framework/core/CException.h"
#include "framework/icons/ResourceDataProvider.h"
#include "tools/resgen/icons/IconArt.h"

namespace Project {
namespace {

using Bytes = std::vector<std::uint8_t>;
using Provider = Tarsa::ResourceDataProvider;

// The data blocks' names; resolutions 2 and 3 have none.
constexpr std::array<const char*, 2> kBlockNames = {"IconsLowRes.dat", "IconsHighRes.dat"};

void PutU32(Bytes& bytes, std::size_t at, std::uint32_t value) {
  for (int i = 0; i < 4; ++i) bytes[at + i] = static_cast<std::uint8_t>(value >> (8 * i));
}

void PutText(Bytes& bytes, std::size_t at, std::size_t field, const std::string& text) {
  if (text.size() >= field) throw Tarsa::CError("icon name too long: " + text);
  std::memcpy(bytes.data() + at, text.data(), text.size());
}

cairo_status_t AppendPng(void* closure, const unsigned char* data, unsigned int length) {
  auto* out = static_cast<Bytes*>(closure);
  out->insert(out->end(), data, data + length);
  return CAIRO_STATUS_SUCCESS;
}

// One state of one image at a scale, as a PNG file.
Bytes Render(const IconArt& art, std::uint32_t state, int scale) {
  cairo_surface_t* surface =
      cairo_image_surface_create(CAIRO_FORMAT_ARGB32, art.width * scale, art.height * scale);
  cairo_t* cr = cairo_create(surface);
  cairo_scale(cr, scale, scale);
  art.draw(cr, LookFor(state));
  cairo_destroy(cr);
  Bytes png;
  const cairo_status_t status = cairo_surface_write_to_png_stream(surface, AppendPng, &png);
  cairo_surface_destroy(surface);
  if (status != CAIRO_STATUS_SUCCESS) {
    throw Tarsa::CError("icon " + art.name +
                        " cannot be encoded: " + cairo_status_to_string(status));
  }
  return png;
}

void Check(const IconArt& art) {
  const bool fits = art.width > 0 && art.height > 0 &&
                    static_cast<std::uint32_t>(art.width) <= Provider::kMaxImageSide / 2 &&
                    static_cast<std::uint32_t>(art.height) <= Provider::kMaxImageSide / 2;
  const bool hasNormal = std::find(art.states.begin(), art.states.end(), 0u) != art.states.end();
  const bool statesFit = std::all_of(art.states.begin(), art.states.end(),
                                     [](std::uint32_t s) { return s < Provider::kStates; });
  if (!fits || !hasNormal || !statesFit || art.name.empty() ||
      art.name.size() >= Provider::kEntryNameSize) {
    throw Tarsa::CError("icon \"" + art.name + "\" is badly described");
  }
}

IconResources Build() {
  std::vector<IconArt> all = SkinArt();
  for (auto& art : CursorArt()) all.push_back(std::move(art));
  // The index is kept in name order, which is also the provider's order.
  std::sort(all.begin(), all.end(),
            [](const IconArt& a, const IconArt& b) { return a.name < b.name; });
  for (std::size_t i = 1; i < all.size(); ++i) {
    if (all[i].name == all[i - 1].name) throw Tarsa::CError("icon named twice: " + all[i].name);
  }

  IconResources out;
  Bytes& index = out.index;
  index.assign(Provider::kEntriesStart + all.size() * Provider::kEntrySize, 0);
  std::memcpy(index.data(), Provider::kSignature.data(), Provider::kSignatureSize);
  for (std::size_t r = 0; r < kBlockNames.size(); ++r) {
    PutText(index, Provider::kSignatureSize + r * Provider::kBlockNameSize,
            Provider::kBlockNameSize, kBlockNames[r]);
  }
  Bytes* blocks[] = {&out.lowResolution, &out.highResolution};
  for (Bytes* block : blocks)
    block->assign(Provider::kBlockMagic.begin(), Provider::kBlockMagic.end());

  for (std::size_t i = 0; i < all.size(); ++i) {
    const IconArt& art = all[i];
    Check(art);
    const std::size_t entry = Provider::kEntriesStart + i * Provider::kEntrySize;
    const std::size_t body = entry + Provider::kEntryNameSize;
    PutText(index, entry, Provider::kEntryNameSize, art.name);
    for (std::uint32_t r = 0; r < kBlockNames.size(); ++r) {
      const int scale = static_cast<int>(r) + 1;
      PutU32(index, body + 0 + 4 * r, static_cast<std::uint32_t>(art.width * scale));
      PutU32(index, body + 16 + 4 * r, static_cast<std::uint32_t>(art.height * scale));
      // Readers take the hot spot of resolution 0 and scale it themselves;
      // the others are stored scaled all the same.
      PutU32(index, body + 32 + 4 * r, static_cast<std::uint32_t>(art.hotX * scale));
      PutU32(index, body + 48 + 4 * r, static_cast<std::uint32_t>(art.hotY * scale));
      for (const std::uint32_t state : art.states) {
        Bytes& block = *blocks[r];
        const Bytes png = Render(art, state, scale);
        if (block.size() + png.size() > std::numeric_limits<std::uint32_t>::max()) {
          throw Tarsa::CError("icon data block beyond 4 GiB");
        }
        PutU32(index, body + 64 + 32 * r + 4 * state, static_cast<std::uint32_t>(block.size()));
        PutU32(index, body + 192 + 32 * r + 4 * state, static_cast<std::uint32_t>(png.size()));
        block.insert(block.end(), png.begin(), png.end());
      }
    }
  }
  return out;
}

}  // namespace

const IconResources& BuildIconResources() {
  static const IconResources built = Build();
  return built;
}

}  // namespace Project
