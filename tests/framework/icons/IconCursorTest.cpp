#include <gtest/gtest.h>

#include <SDL.h>

#include <cstdlib>

#include "framework/icons/CIconCursor.h"
#include "tests/framework/icons/ContactSheet.h"
#include "tests/framework/icons/IconTestIndex.h"

// Starting SDL's X11 video asks the session's message bus once, and the bus
// library keeps that buffer for the life of the process.
extern "C" const char* __lsan_default_suppressions() { return "leak:libdbus-1.so\n"; }

namespace Tarsa::testing {
namespace {

Bytes OpaquePng(int width, int height) {
  return PngOfRgba(width, height, Bytes(static_cast<std::size_t>(width) * height * 4, 255));
}

// A provider with cursors as the index and the blocks state them: "Both"
// at both resolutions with a hot spot of (3, 5), "LowOnly" at resolution 0,
// "Liar" whose file is larger than its entry says, "Junk" no PNG at all.
class CursorIcons {
 public:
  CursorIcons() {
    const Bytes low = OpaquePng(8, 8);
    const Bytes high = OpaquePng(16, 16);
    const Bytes junk = {1, 2, 3, 4, 5, 6, 7, 8, 9};
    Bytes lowBlock = DataBlock(low);
    Bytes highBlock = DataBlock(high);
    const auto lowAt = 4u;
    const auto junkAt = static_cast<std::uint32_t>(lowBlock.size());
    lowBlock.insert(lowBlock.end(), junk.begin(), junk.end());
    const auto lowSize = static_cast<std::uint32_t>(low.size());
    const auto highSize = static_cast<std::uint32_t>(high.size());

    IndexBuilder index;
    index.Block(0, "Low.dat").Block(1, "High.dat");
    index.Entry("Both").Size(0, 8, 8).Size(1, 16, 16).HotSpot(0, 3, 5);
    index.State(0, 0, lowAt, lowSize).State(1, 0, 4, highSize);
    index.Entry("LowOnly").Size(0, 8, 8).HotSpot(0, 1, 2).State(0, 0, lowAt, lowSize);
    index.Entry("Liar").Size(0, 4, 4).State(0, 0, lowAt, lowSize);
    index.Entry("Junk").Size(0, 3, 3).State(0, 0, junkAt, 9);
    provider.blocks["Low.dat"] = lowBlock;
    provider.blocks["High.dat"] = highBlock;
    EXPECT_TRUE(provider.Parse(index.bytes()));
  }
  MapProvider provider;
};

TEST(IconCursor, HotSpotScalesWithTheResolutionDrawn) {
  CursorIcons icons;
  const auto low = CIconCursor::LoadImage(icons.provider, "Both", 0);
  ASSERT_TRUE(low);
  EXPECT_EQ(low->pixels->Bounds().Width(), 8);
  EXPECT_EQ(low->hotX, 3);
  EXPECT_EQ(low->hotY, 5);
  const auto high = CIconCursor::LoadImage(icons.provider, "Both", 1);
  ASSERT_TRUE(high);
  EXPECT_EQ(high->pixels->Bounds().Width(), 16);
  EXPECT_EQ(high->hotX, 6);
  EXPECT_EQ(high->hotY, 10);
  // Without its high-resolution image a cursor is shown at resolution 0.
  const auto fallback = CIconCursor::LoadImage(icons.provider, "LowOnly", 1);
  ASSERT_TRUE(fallback);
  EXPECT_EQ(fallback->pixels->Bounds().Width(), 8);
  EXPECT_EQ(fallback->hotX, 1);
}

TEST(IconCursor, MissingOrDamagedImagesGiveNoImage) {
  CursorIcons icons;
  EXPECT_FALSE(CIconCursor::LoadImage(icons.provider, "None", 0));
  EXPECT_FALSE(CIconCursor::LoadImage(icons.provider, "Liar", 0));
  EXPECT_FALSE(CIconCursor::LoadImage(icons.provider, "Junk", 0));
}

// Cursors need a real window system (SDL's headless driver has none); the
// windowed run under a virtual X server covers this.
TEST(IconCursor, SetMakesAColourCursorOrTheArrow) {
  const char* display = std::getenv("DISPLAY");
  if (display == nullptr || display[0] == '\0') GTEST_SKIP() << "no display";
  ASSERT_EQ(SDL_InitSubSystem(SDL_INIT_VIDEO), 0) << SDL_GetError();
  {
    CursorIcons icons;
    CIconCursor image(icons.provider, "Both");
    image.Set();
    EXPECT_TRUE(image.ShowsImage());
    CIconCursor missing(icons.provider, "None");
    missing.Set();
    EXPECT_FALSE(missing.ShowsImage());
    CIconCursor module(26000);
    module.Set();
    EXPECT_TRUE(module.ShowsImage());
  }
  SDL_QuitSubSystem(SDL_INIT_VIDEO);
}

}  // namespace
}  // namespace Tarsa::testing
