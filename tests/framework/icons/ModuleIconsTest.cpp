#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>
#include <set>

#include "framework/core/CException.h"
#include "framework/icons/CPNGFormat.h"
#include "framework/icons/CResourceDataProvider.h"
#include "framework/icons/IconStates.h"
#include "framework/resource/CResourceWriter.h"
#include "framework/resource/ModuleResources.h"
#include "tests/framework/icons/ContactSheet.h"
#include "tests/framework/icons/IconTestIndex.h"

namespace Tarsa::testing {
namespace {

const std::vector<std::uint32_t> kFilledStates = {0, 1, 2, 4, 6};

std::unique_ptr<CDisplayPixmap> Image(const ResourceDataProvider& icons, const std::string& name,
                                      std::uint32_t resolution, std::uint32_t state) {
  std::size_t size = 0;
  const std::uint8_t* data = nullptr;
  if (!icons.GetData(name, resolution, state, size, data)) return nullptr;
  return CPNGFormat::Decode({data, size});
}

// Every image of the module, each state at each resolution: state 0 always
// there, the two resolutions with the same states, the second at exactly
// double the size, and every PNG decoding to the size the index states.
TEST(ModuleIcons, EveryImageDecodesAtBothResolutionsToTheStatedSize) {
  const CResourceDataProvider& icons = CResourceDataProvider::Module();
  ASSERT_GT(icons.Count(), 50u);
  EXPECT_EQ(icons.BlockName(0), "IconsLowRes.dat");
  EXPECT_EQ(icons.BlockName(1), "IconsHighRes.dat");
  for (const std::string& name : icons.Names()) {
    SCOPED_TRACE(name);
    std::uint32_t width[2] = {};
    std::uint32_t height[2] = {};
    ASSERT_TRUE(icons.GetSize(name, 0, 0, width[0], height[0]));
    ASSERT_TRUE(icons.GetSize(name, 1, 0, width[1], height[1]));
    EXPECT_EQ(width[1], 2 * width[0]);
    EXPECT_EQ(height[1], 2 * height[0]);
    for (std::uint32_t state = 0; state < kIconStateCount; ++state) {
      SCOPED_TRACE(state);
      std::uint32_t w = 0;
      std::uint32_t h = 0;
      const bool has = icons.GetSize(name, 0, state, w, h);
      EXPECT_EQ(has, icons.GetSize(name, 1, state, w, h));
      if (!has) continue;
      EXPECT_NE(std::find(kFilledStates.begin(), kFilledStates.end(), state), kFilledStates.end());
      for (std::uint32_t resolution : {0u, 1u}) {
        const auto image = Image(icons, name, resolution, state);
        ASSERT_NE(image, nullptr);
        EXPECT_EQ(image->Bounds().Width(), width[resolution]);
        EXPECT_EQ(image->Bounds().Height(), height[resolution]);
      }
    }
    for (std::uint32_t resolution : {2u, 3u}) {
      std::size_t size = 0;
      const std::uint8_t* data = nullptr;
      EXPECT_FALSE(icons.GetData(name, resolution, 0, size, data));
    }
  }
}

// The cursors the workspace asks for by number, each with its hot spot on
// a pixel of the image that is not transparent, or next to one.
TEST(ModuleIcons, EveryWorkspaceCursorIsThereWithItsHotSpotOnTheImage) {
  const CResourceDataProvider& icons = CResourceDataProvider::Module();
  const int cursors[] = {26000, 26005, 26006, 26008, 26009, 26010, 26019, 26020,
                         26029, 26030, 26053, 26054, 26056, 26057, 26058, 26059,
                         26060, 26061, 26062, 26063, 26070, 14000, 14001};
  for (const int number : cursors) {
    SCOPED_TRACE(number);
    const std::string name = std::to_string(number);
    std::int32_t x = -1;
    std::int32_t y = -1;
    ASSERT_TRUE(icons.GetHotSpot(name, x, y));
    const auto image = Image(icons, name, 0, 0);
    ASSERT_NE(image, nullptr);
    ASSERT_TRUE(x >= 0 && y >= 0 && x < image->Bounds().Width() && y < image->Bounds().Height());
    int alpha = 0;
    for (int dy = -1; dy <= 1; ++dy) {
      for (int dx = -1; dx <= 1; ++dx) {
        if (image->Bounds().Contains({x + dx, y + dy, x + dx + 1, y + dy + 1})) {
          alpha =
              std::max<int>(alpha, image->Data()[(y + dy) * image->RowBytes() + (x + dx) * 4 + 3]);
        }
      }
    }
    EXPECT_GT(alpha, 128);
  }
}

TEST(ModuleIcons, ATableWithoutAGoodIndexIsRefusedInWords) {
  EXPECT_THROW(CResourceDataProvider{CResourceTable{}}, CError);
  CResourceWriter writer;
  Bytes index = IndexBuilder().bytes();
  index.push_back(0);
  writer.Add(CResourceDataProvider::kIndexType, CResourceDataProvider::kIndexName, index);
  try {
    CResourceDataProvider provider(CResourceTable::Adopt(writer.Write()));
    FAIL() << "a damaged index was taken";
  } catch (const CError& error) {
    EXPECT_NE(error.ErrorText().find("damaged"), std::string::npos) << error.ErrorText();
  }
}

// --- the contact sheet -----------------------------------------------------

struct Group {
  enum Kind { kSingle, kHorizontal, kVertical, kNine } kind = kSingle;
  std::string base;
};

// Groups the names into controls: pieces that make one stretchable control
// are drawn assembled, the rest as they are.
std::vector<Group> Groups(const std::vector<std::string>& names) {
  const std::set<std::string> all(names.begin(), names.end());
  std::vector<Group> groups;
  std::set<std::string> done;
  for (const std::string& name : names) {
    if (name.starts_with("Alpha_") || name == "Crosshair") continue;
    const auto dot = name.rfind('.');
    const std::string base = dot == std::string::npos ? name : name.substr(0, dot);
    Group group{Group::kSingle, name};
    if (all.contains(base + ".TopLeft")) {
      group = {Group::kNine, base};
    } else if (all.contains(base + ".Top") && all.contains(base + ".Middle")) {
      group = {Group::kVertical, base};
    } else if (all.contains(base + ".Left") && all.contains(base + ".Middle")) {
      group = {Group::kHorizontal, base};
    }
    if (done.insert(group.base).second) groups.push_back(group);
  }
  return groups;
}

// Draws a group at a resolution and state at (x, y): stretchable controls
// at a length of 60 (pixels of resolution 0), frames at 60 by 44.
void DrawGroup(ContactSheet& sheet, const ResourceDataProvider& icons, const Group& group,
               std::uint32_t resolution, std::uint32_t state, int x, int y) {
  const int scale = static_cast<int>(resolution) + 1;
  const auto image = [&](const std::string& part) {
    auto found = Image(icons, group.base + part, resolution, state);
    return found ? std::move(found) : Image(icons, group.base + part, resolution, 0);
  };
  // Repeats a piece over [x0, x1) by [y0, y1); an end of 0 means one piece
  // across that way.
  const auto tile = [&](const std::unique_ptr<CDisplayPixmap>& piece, int x0, int y0, int x1,
                        int y1) {
    if (!piece) return;
    const int w = static_cast<int>(piece->Bounds().Width());
    const int h = static_cast<int>(piece->Bounds().Height());
    if (x1 == 0) x1 = x0 + w;
    if (y1 == 0) y1 = y0 + h;
    for (int ty = y0; ty < y1; ty += h) {
      for (int tx = x0; tx < x1; tx += w) sheet.Blend(*piece, tx, ty, x1 - tx, y1 - ty);
    }
  };
  if (group.kind == Group::kSingle) {
    if (auto single = Image(icons, group.base, resolution, state)) sheet.Blend(*single, x, y);
    return;
  }
  const int length = 60 * scale;
  if (group.kind == Group::kHorizontal || group.kind == Group::kVertical) {
    const bool across = group.kind == Group::kHorizontal;
    const auto first = image(across ? ".Left" : ".Top");
    const auto middle = image(".Middle");
    const auto last = image(across ? ".Right" : ".Bottom");
    const int firstLength =
        static_cast<int>(across ? first->Bounds().Width() : first->Bounds().Height());
    const int lastLength =
        last ? static_cast<int>(across ? last->Bounds().Width() : last->Bounds().Height()) : 0;
    if (across) {
      tile(middle, x + firstLength, y, x + length - lastLength, 0);
      sheet.Blend(*first, x, y);
      if (last) sheet.Blend(*last, x + length - lastLength, y);
    } else {
      tile(middle, x, y + firstLength, 0, y + length - lastLength);
      sheet.Blend(*first, x, y);
      if (last) sheet.Blend(*last, x, y + length - lastLength);
    }
    return;
  }
  const int width = 60 * scale;
  const int height = 44 * scale;
  const auto corner = image(".TopLeft");
  const int c = static_cast<int>(corner->Bounds().Width());
  tile(image(".Center"), x + c, y + c, x + width - c, y + height - c);
  tile(image(".Top"), x + c, y, x + width - c, 0);
  tile(image(".Bottom"), x + c, y + height - c, x + width - c, 0);
  tile(image(".Left"), x, y + c, 0, y + height - c);
  tile(image(".Right"), x + width - c, y + c, 0, y + height - c);
  sheet.Blend(*corner, x, y);
  sheet.Blend(*image(".TopRight"), x + width - c, y);
  sheet.Blend(*image(".BottomLeft"), x, y + height - c);
  sheet.Blend(*image(".BottomRight"), x + width - c, y + height - c);
}

// Every image of the module, both resolutions, every state, laid out for a
// person to look at: the controls assembled from their pieces on the
// dialog's grey, one row a control and a column a state (resolution 0, then
// 1); then the cursors on light and dark ground, with their hot spot marked
// in red on a third copy. The order of the rows is written beside it.
TEST(ModuleIcons, ContactSheetOfEveryImage) {
  const CResourceDataProvider& icons = CResourceDataProvider::Module();
  const std::vector<Group> groups = Groups(icons.Names());
  std::vector<std::string> cursors;
  for (const std::string& name : icons.Names()) {
    if (name.starts_with("Alpha_") || name == "Crosshair") cursors.push_back(name);
  }
  constexpr int kPad = 8;
  constexpr int kColumns0 = 68;
  constexpr int kColumns1 = 128;
  constexpr int kRow = 96;
  constexpr int kCursorCell = 72;
  const int states = static_cast<int>(kFilledStates.size());
  const int width = std::max(kPad + states * (kColumns0 + kColumns1), 4 * 304);
  const auto rowHeight = [&](const Group& group) {
    return group.kind == Group::kVertical || group.kind == Group::kNine ? kRow + 36 : kRow / 2 + 12;
  };
  int height = kPad + static_cast<int>((cursors.size() + 3) / 4) * kCursorCell;
  for (const Group& group : groups) height += rowHeight(group);
  ContactSheet sheet(width, height, 0xECECEC);

  std::filesystem::create_directories(ArtefactFolder() + "/icons");
  std::ofstream legend(ArtefactFolder() + "/icons/contact-sheet.txt");
  int y = kPad;
  for (const Group& group : groups) {
    legend << "row at y " << y << ": " << group.base << "\n";
    for (int s = 0; s < states; ++s) {
      DrawGroup(sheet, icons, group, 0, kFilledStates[s], kPad + s * kColumns0, y);
      DrawGroup(sheet, icons, group, 1, kFilledStates[s], kPad + states * kColumns0 + s * kColumns1,
                y);
    }
    y += rowHeight(group);
  }
  // Cursors, four to a row: each at resolution 0 and 1, on white, on dark
  // grey, and on white with the hot spot in red.
  for (std::size_t i = 0; i < cursors.size(); ++i) {
    const int x = kPad + static_cast<int>(i % 4) * (width / 4);
    const int top = y + static_cast<int>(i / 4) * kCursorCell;
    legend << "cursor at " << x << ", " << top << ": " << cursors[i] << "\n";
    std::int32_t hotX = 0;
    std::int32_t hotY = 0;
    icons.GetHotSpot(cursors[i], hotX, hotY);
    int at = x;
    for (std::uint32_t resolution : {0u, 1u}) {
      const auto image = Image(icons, cursors[i], resolution, 0);
      ASSERT_NE(image, nullptr);
      const int size = static_cast<int>(image->Bounds().Width());
      const int scale = static_cast<int>(resolution) + 1;
      for (int copy = 0; copy < 3; ++copy) {
        sheet.Fill(at, top, size, size, copy == 1 ? 0x3A3A3A : 0xFFFFFF);
        sheet.Blend(*image, at, top);
        if (copy == 2) sheet.Fill(at + hotX * scale, top + hotY * scale, scale, scale, 0xFF0000);
        at += size + 2;
      }
    }
  }
  ASSERT_TRUE(sheet.Save(ArtefactFolder() + "/icons/contact-sheet.png"));
}

}  // namespace
}  // namespace Tarsa::testing
