// `archway edit` as a user runs it: the workspace opens on a generated
// photograph under the test's own X server, is driven with real X input
// (xdotool), and is read back from the server's pixels.
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "framework/plugin/HostSuites.h"
#include "host/actions/ActionFile.h"
#include "host/io/HostDocument.h"
#include "host/io/ImageFile.h"
#include "params/ConstraintBlob.h"
#include "tests/host/app/ProgramRun.h"
#include "tests/support/ScreenGrab.h"
#include "tests/support/TestSupport.h"

namespace Host::testing {
namespace {

using Tarsa::FourCC;

#ifdef ARCHWAY_REAL_MODULE

// The generated photograph.
constexpr int kPhotoWidth = 1200;
constexpr int kPhotoHeight = 800;
// Where the pane shows no picture.
constexpr std::uint8_t kPaneGrey = 0x80;
// The workspace solves and renders the first preview well within this on
// the slowest machine the tests run on (a shared 2-core one).
constexpr auto kOpening = std::chrono::seconds(30);

std::string Shell(const std::string& command) {
  std::string output;
  FILE* pipe = ::popen(command.c_str(), "r");
  if (pipe == nullptr) return output;
  char buffer[256];
  while (std::fgets(buffer, sizeof buffer, pipe) != nullptr) output += buffer;
  ::pclose(pipe);
  return output;
}

std::string ArtefactPath(const std::string& name) {
  const std::string dir = ARCHWAY_ARTEFACTS_DIR;
  (void)std::system(("mkdir -p '" + dir + "'").c_str());
  return dir + "/" + name;
}

struct Rect {
  int left = 0, top = 0, right = 0, bottom = 0;
  int Width() const { return right - left; }
  int Height() const { return bottom - top; }
};

bool IsPaneGrey(const HostDocument& shot, std::size_t at) {
  return shot.Plane8(0)[at] == kPaneGrey && shot.Plane8(1)[at] == kPaneGrey &&
         shot.Plane8(2)[at] == kPaneGrey;
}

// The preview pane is the box of its long runs of grey (a control's
// border may be grey too, but only for a few pixels); the picture is what
// is not grey inside it.
bool FindPicture(const HostDocument& shot, Rect& pane, Rect& picture, Rect& shown,
                 double zoom = 0) {
  constexpr int kLongRun = 40;
  pane = {shot.Width(), shot.Height(), 0, 0};
  for (int y = 0; y < shot.Height(); ++y) {
    int run = 0;
    for (int x = 0; x <= shot.Width(); ++x) {
      if (x < shot.Width() && IsPaneGrey(shot, std::size_t(y) * shot.Width() + x)) {
        ++run;
        continue;
      }
      if (run >= kLongRun) {
        pane = {std::min(pane.left, x - run), std::min(pane.top, y), std::max(pane.right, x),
                std::max(pane.bottom, y + 1)};
      }
      run = 0;
    }
  }
  if (pane.Width() < 100 || pane.Height() < 100) return false;
  shown = {pane.right, pane.bottom, pane.left, pane.top};
  for (int y = pane.top + 2; y < pane.bottom - 2; ++y) {
    for (int x = pane.left + 2; x < pane.right - 2; ++x) {
      if (IsPaneGrey(shot, std::size_t(y) * shot.Width() + x)) continue;
      shown = {std::min(shown.left, x), std::min(shown.top, y), std::max(shown.right, x + 1),
               std::max(shown.bottom, y + 1)};
    }
  }
  if (shown.Width() <= 50 || shown.Height() <= 50) return false;
  // The picture at the zoom, or else fitted in the pane less 3 pixels a
  // side, centred: where the result is transparent the pane's grey shows,
  // so the picture is larger than what is not grey, which must lie inside.
  if (zoom <= 0) {
    zoom =
        std::min(double(pane.Width() - 6) / kPhotoWidth, double(pane.Height() - 6) / kPhotoHeight);
  }
  const int width = int(std::lround(kPhotoWidth * zoom));
  const int height = int(std::lround(kPhotoHeight * zoom));
  picture = {pane.left + (pane.Width() - width) / 2, pane.top + (pane.Height() - height) / 2, 0, 0};
  picture.right = picture.left + width;
  picture.bottom = picture.top + height;
  // The tiles are drawn scaled, rounded outwards and smoothed: their edge
  // may spill two pixels.
  return shown.left >= picture.left - 2 && shown.right <= picture.right + 2 &&
         shown.top >= picture.top - 2 && shown.bottom <= picture.bottom + 2;
}

class Edit : public ::testing::Test {
 protected:
  void SetUp() override {
    const std::string synth = ARCHWAY_SYNTH;
    ASSERT_EQ(
        std::system((synth + " --scene room --projection fisheye-equisolid --focal-mm 10 --size " +
                     std::to_string(kPhotoWidth) + "x" + std::to_string(kPhotoHeight) + " -o " +
                     folder_.File("room.tif") + " --action " + folder_.File("room.action") +
                     " >/dev/null")
                        .c_str()),
        0);
    input_ = ReadBytes(folder_.File("room.tif"));
  }

  void Open(const std::vector<std::string>& extra) {
    std::vector<std::string> arguments = {"edit", "--action", folder_.File("room.action"), "-o",
                                          folder_.File("edited.tif")};
    arguments.insert(arguments.end(), extra.begin(), extra.end());
    arguments.push_back(folder_.File("room.tif"));
    run_ = std::make_unique<ProgramRun>(arguments, Environment{});
    const auto deadline = std::chrono::steady_clock::now() + kOpening;
    while (window_.empty() && std::chrono::steady_clock::now() < deadline) {
      std::this_thread::sleep_for(std::chrono::milliseconds(200));
      window_ = Trimmed(Shell("xdotool search --name '^Archway' 2>/dev/null | head -1"));
    }
  }

  static std::string Trimmed(std::string text) {
    while (!text.empty() && (text.back() == '\n' || text.back() == ' ')) text.pop_back();
    return text;
  }

  std::string Title() { return Trimmed(Shell("xdotool getwindowname " + window_)); }

  // The window once it stopped changing (two grabs alike), kept as an
  // artefact.
  // opening: the pane must show its picture fitted, as the workspace opens.
  std::unique_ptr<HostDocument> Settled(const std::string& artefact, bool opening = false) {
    std::unique_ptr<HostDocument> last;
    const auto deadline = std::chrono::steady_clock::now() + kOpening;
    while (std::chrono::steady_clock::now() < deadline) {
      std::this_thread::sleep_for(std::chrono::milliseconds(600));
      std::unique_ptr<HostDocument> shot = GrabWindow(std::stoul(window_));
      if (shot == nullptr) continue;
      Rect pane, picture, shown;
      // Until its first tiles the pane is grey: the window is still opening.
      if (last != nullptr && !Differ(*last, *shot, {0, 0, shot->Width(), shot->Height()}) &&
          (!opening || FindPicture(*shot, pane, picture, shown))) {
        ImageFile::Write(*shot, ArtefactPath(artefact), FileFormat::kPng);
        return shot;
      }
      last = std::move(shot);
    }
    if (last != nullptr)
      ImageFile::Write(*last, ArtefactPath("unsettled-" + artefact), FileFormat::kPng);
    return last;
  }

  // The window once the area of it showed something other than before, and
  // then stopped changing: input is taken in its own time on a loaded
  // machine, and a solve shows nothing until the picture is drawn again.
  std::unique_ptr<HostDocument> SettledAfterChange(const HostDocument& before, const Rect& area,
                                                   const std::string& artefact) {
    const auto deadline = std::chrono::steady_clock::now() + kOpening;
    while (std::chrono::steady_clock::now() < deadline) {
      std::unique_ptr<HostDocument> shot = GrabWindow(std::stoul(window_));
      if (shot != nullptr && Differ(before, *shot, area)) break;
      std::this_thread::sleep_for(std::chrono::milliseconds(100));
    }
    return Settled(artefact);
  }

  static bool Differ(const HostDocument& a, const HostDocument& b, const Rect& area) {
    if (a.Width() != b.Width() || a.Height() != b.Height()) return true;
    for (int y = area.top; y < area.bottom; ++y) {
      for (int x = area.left; x < area.right; ++x) {
        const std::size_t at = std::size_t(y) * a.Width() + x;
        for (int c = 0; c < 3; ++c)
          if (a.Plane8(c)[at] != b.Plane8(c)[at]) return true;
      }
    }
    return false;
  }

  // xdotool with the window focused first: there is no window manager.
  int Xdo(const std::string& arguments) {
    return std::system(
        ("xdotool windowfocus " + window_ + " " + arguments + " >/dev/null 2>&1").c_str());
  }

  // A point of the window in screen coordinates.
  std::string At(int x, int y) {
    const std::string geometry = Shell("xdotool getwindowgeometry --shell " + window_);
    int left = 0, top = 0;
    std::sscanf(geometry.c_str() + geometry.find("X="), "X=%d", &left);
    std::sscanf(geometry.c_str() + geometry.find("Y="), "Y=%d", &top);
    return std::to_string(left + x) + " " + std::to_string(top + y);
  }

  // The program's end: the exit status, and the input as it was.
  Finished End() {
    const Finished finished = run_->Finish();
    EXPECT_EQ(ReadBytes(folder_.File("room.tif")), input_) << "the input was touched";
    return finished;
  }

  ScratchFolder folder_;
  std::string input_;
  std::unique_ptr<ProgramRun> run_;
  std::string window_;
};

// The share of colour samples where shot's picture and the reference,
// reduced to the picture's size by the box average, differ by more than
// 24 levels; pixels where the pane's grey shows (no result) are left out.
double DifferingShare(const HostDocument& shot, const Rect& picture, const HostDocument& reference,
                      const std::string& artefact) {
  const double sx = double(reference.Width()) / picture.Width();
  const double sy = double(reference.Height()) / picture.Height();
  std::size_t compared = 0, differing = 0;
  std::unique_ptr<HostDocument> reduced =
      HostDocument::Create(picture.Width(), picture.Height(), ImageMode::kRgb);
  for (int y = 0; y < picture.Height(); ++y) {
    for (int x = 0; x < picture.Width(); ++x) {
      const std::size_t at = std::size_t(picture.top + y) * shot.Width() + picture.left + x;
      const int x0 = int(x * sx), x1 = std::max(x0 + 1, int((x + 1) * sx));
      const int y0 = int(y * sy), y1 = std::max(y0 + 1, int((y + 1) * sy));
      for (int c = 0; c < 3; ++c) {
        double sum = 0;
        for (int v = y0; v < y1; ++v)
          for (int u = x0; u < x1; ++u)
            sum += reference.Plane8(c)[std::size_t(v) * reference.Width() + u];
        const double mean = sum / ((x1 - x0) * (y1 - y0));
        reduced->Plane8(c)[std::size_t(y) * picture.Width() + x] = std::uint8_t(mean + 0.5);
        if (IsPaneGrey(shot, at)) continue;
        ++compared;
        // The preview reduces the source before the warp, the reference
        // after it: edges differ by a blur's worth, flat areas agree.
        if (std::abs(mean - shot.Plane8(c)[at]) > 24) ++differing;
      }
    }
  }
  ImageFile::Write(*reduced, ArtefactPath(artefact), FileFormat::kPng);
  return compared == 0 ? 1.0 : double(differing) / double(compared);
}

std::uint32_t Rgb(const HostDocument& shot, int x, int y) {
  const std::size_t at = std::size_t(y) * shot.Width() + x;
  return (std::uint32_t(shot.Plane8(0)[at]) << 16) | (std::uint32_t(shot.Plane8(1)[at]) << 8) |
         shot.Plane8(2)[at];
}

// Whether a pixel within radius of (x, y) has the colour, each channel
// within tolerance.
bool ColourNear(const HostDocument& shot, double x, double y, int radius, std::uint32_t colour,
                int tolerance) {
  for (int v = int(y) - radius; v <= int(y) + radius; ++v) {
    for (int u = int(x) - radius; u <= int(x) + radius; ++u) {
      if (u < 0 || v < 0 || u >= shot.Width() || v >= shot.Height()) continue;
      const std::uint32_t c = Rgb(shot, u, v);
      bool near = true;
      for (int shift : {16, 8, 0})
        near &= std::abs(int((c >> shift) & 0xFF) - int((colour >> shift) & 0xFF)) <= tolerance;
      if (near) return true;
    }
  }
  return false;
}

// The share of pixels of the block (x, y, size) of a that b shows moved by
// (dx, dy) within 3 levels; the best over small offsets, since a centre
// rounds either way.
double Agreement(const HostDocument& a, int x, int y, int size, const HostDocument& b, int dx,
                 int dy, int slack = 0) {
  double best = 0;
  for (int oy = -slack; oy <= slack; ++oy) {
    for (int ox = -slack; ox <= slack; ++ox) {
      std::size_t agree = 0, all = 0;
      for (int v = y; v < y + size; ++v) {
        for (int u = x; u < x + size; ++u) {
          const int bu = u + dx + ox, bv = v + dy + oy;
          if (bu < 0 || bv < 0 || bu >= b.Width() || bv >= b.Height()) continue;
          ++all;
          bool same = true;
          for (int c = 0; c < 3; ++c) {
            same &= std::abs(int(a.Plane8(c)[std::size_t(v) * a.Width() + u]) -
                             int(b.Plane8(c)[std::size_t(bv) * b.Width() + bu])) <= 3;
          }
          agree += same ? 1 : 0;
        }
      }
      if (all > 0) best = std::max(best, double(agree) / double(all));
    }
  }
  return best;
}

// Where the option column's controls are: the layout file binds the column
// to the window's top right, so they keep these offsets from the right edge
// and the top at any window size.
constexpr int kFocalFieldFromRight = 68;
constexpr int kFocalFieldTop = 241;
constexpr int kModelPopupFromRight = 189;
constexpr int kModelPopupTop = 172;
constexpr int kCancelFromRight = 185;
constexpr int kCancelTop = 54;

double TitleZoom(const std::string& title) {
  const std::size_t at = title.find(" @ ");
  return at == std::string::npos ? 0.0 : std::atof(title.c_str() + at + 3);
}

TEST_F(Edit, OpensWithThePreviewOfTheActionAndEscapeWritesNothing) {
  Open({});
  ASSERT_FALSE(window_.empty()) << "no workspace window";
  std::unique_ptr<HostDocument> shot = Settled("edit-opened.png", true);
  ASSERT_NE(shot, nullptr);
  Rect pane, picture, shown;
  ASSERT_TRUE(FindPicture(*shot, pane, picture, shown))
      << "pane " << pane.left << " " << pane.top << " " << pane.right << " " << pane.bottom
      << ", picture " << picture.left << " " << picture.top << " " << picture.right << " "
      << picture.bottom << ", shown " << shown.left << " " << shown.top << " " << shown.right << " "
      << shown.bottom;
  EXPECT_NE(Title().find("room.tif @ "), std::string::npos) << Title();

  ASSERT_EQ(RunToEnd({"apply", "--action", folder_.File("room.action"), "-o",
                      folder_.File("applied.tif"), folder_.File("room.tif")})
                .status,
            0);
  std::unique_ptr<HostDocument> applied = ImageFile::Read(folder_.File("applied.tif"));
  // Line edges and the picture's border take a few per cent.
  EXPECT_LT(DifferingShare(*shot, picture, *applied, "edit-applied-reduced.png"), 0.05);

  ASSERT_EQ(Xdo("key Escape"), 0);
  const Finished finished = End();
  EXPECT_EQ(finished.status, 0) << finished.errors;
  EXPECT_NE(finished.errors.find("closed without correcting it"), std::string::npos)
      << finished.errors;
  EXPECT_EQ(folder_.Listing().find("edited"), std::string::npos);
}

TEST_F(Edit, CancelWritesNothing) {
  Open({"--save-action", folder_.File("saved.action")});
  ASSERT_FALSE(window_.empty());
  std::unique_ptr<HostDocument> opened = Settled("edit-cancel.png", true);
  ASSERT_NE(opened, nullptr);
  ASSERT_EQ(Xdo("mousemove " + At(opened->Width() - kCancelFromRight, kCancelTop) + " click 1"), 0);
  const Finished finished = End();
  EXPECT_EQ(finished.status, 0) << finished.errors;
  EXPECT_EQ(folder_.Listing().find("edited"), std::string::npos);
  EXPECT_EQ(folder_.Listing().find("saved.action"), std::string::npos);
}

TEST_F(Edit, ClosingTheWindowIsCancel) {
  Open({});
  ASSERT_FALSE(window_.empty());
  ASSERT_NE(Settled("edit-closing.png", true), nullptr);
  ASSERT_TRUE(RequestClose(std::stoul(window_)));
  const Finished finished = End();
  EXPECT_EQ(finished.status, 0) << finished.errors;
  EXPECT_EQ(folder_.Listing().find("edited"), std::string::npos);
}

TEST_F(Edit, OkWritesWhatTheStoredActionReplays) {
  Open({"--save-action", folder_.File("saved.action")});
  ASSERT_FALSE(window_.empty());
  ASSERT_NE(Settled("edit-ok.png", true), nullptr);
  ASSERT_EQ(Xdo("key Return"), 0);
  const Finished finished = End();
  ASSERT_EQ(finished.status, 0) << finished.errors;
  ASSERT_EQ(RunToEnd({"apply", "--action", folder_.File("saved.action"), "-o",
                      folder_.File("replayed.tif"), folder_.File("room.tif")})
                .status,
            0);
  std::unique_ptr<HostDocument> edited = ImageFile::Read(folder_.File("edited.tif"));
  std::unique_ptr<HostDocument> replayed = ImageFile::Read(folder_.File("replayed.tif"));
  ASSERT_EQ(edited->PlaneCount(), replayed->PlaneCount());
  for (int p = 0; p < edited->PlaneCount(); ++p) {
    EXPECT_TRUE(std::ranges::equal(edited->Plane8(p), replayed->Plane8(p))) << "plane " << p;
  }
}

TEST_F(Edit, ConstraintsAreDrawnInTheirColoursWhereTheyLie) {
  Open({});
  ASSERT_FALSE(window_.empty());
  ASSERT_NE(Settled("edit-constraints-result.png", true), nullptr);
  // With Preview off the picture is the photograph, where each line's
  // traced curve runs from its first point to its last.
  ASSERT_EQ(Xdo("key p"), 0);
  std::unique_ptr<HostDocument> shot = Settled("edit-constraints-source.png");
  ASSERT_NE(shot, nullptr);
  Rect pane, picture, shown;
  ASSERT_TRUE(FindPicture(*shot, pane, picture, shown));
  const double scale = double(picture.Width()) / kPhotoWidth;

  const Descriptor action = ActionFile::Read(folder_.File("room.action"));
  const Descriptor::Item* blob = action.Find(FourCC("cnsD"));
  ASSERT_NE(blob, nullptr);
  const std::vector<Project::BlobRecord> records =
      Project::ConstraintBlob::Decode(blob->data.data(), blob->data.size());
  // The settings' default colours by orientation: unfixed, horizontal,
  // vertical, fixed.
  const std::uint32_t colours[] = {0x4AFFFF, 0xFFFF4A, 0xFF4AFF, 0x4AFF4A};
  int lines = 0, found = 0;
  for (const Project::BlobRecord& record : records) {
    const auto* line = std::get_if<Project::BlobLine>(&record);
    if (line == nullptr || line->kind < 1 || line->kind > 4) continue;
    ++lines;
    const std::uint32_t colour = colours[line->kind - 1];
    // Anti-aliasing over the photograph softens a 1-pixel line's colour.
    const bool first = ColourNear(*shot, picture.left + line->x0 * scale,
                                  picture.top + line->y0 * scale, 2, colour, 60);
    const bool last = ColourNear(*shot, picture.left + line->x1 * scale,
                                 picture.top + line->y1 * scale, 2, colour, 60);
    found += first && last ? 1 : 0;
  }
  ASSERT_GT(lines, 3);
  // Where lines meet at a corner of the room the one drawn later covers the
  // other's end.
  EXPECT_GE(found, lines - lines / 10) << found << " of " << lines;
  Xdo("key Escape");
  End();
}

TEST_F(Edit, ZoomScrollAndLoupeShowThePictureWhereExpected) {
  Open({});
  ASSERT_FALSE(window_.empty());
  std::unique_ptr<HostDocument> opened = Settled("edit-zoom-fit.png", true);
  ASSERT_NE(opened, nullptr);
  Rect pane, picture, shown;
  ASSERT_TRUE(FindPicture(*opened, pane, picture, shown));
  EXPECT_NEAR(TitleZoom(Title()), 100.0 * picture.Width() / kPhotoWidth, 0.1);
  ASSERT_EQ(RunToEnd({"apply", "--action", folder_.File("room.action"), "-o",
                      folder_.File("applied.tif"), folder_.File("room.tif")})
                .status,
            0);
  std::unique_ptr<HostDocument> applied = ImageFile::Read(folder_.File("applied.tif"));

  // 100 % typed into the zoom field: about the pane's centre, the picture
  // is the final rendering pixel for pixel.
  const std::string field = At(pane.left + 25, pane.bottom + 9);
  ASSERT_EQ(Xdo("mousemove " + field + " click 1 type 100"), 0);
  ASSERT_EQ(Xdo("key Return"), 0);
  std::unique_ptr<HostDocument> actual = Settled("edit-zoom-100.png");
  ASSERT_NE(actual, nullptr);
  EXPECT_NEAR(TitleZoom(Title()), 100.0, 1e-9);
  const int cx = (pane.left + pane.right) / 2, cy = (pane.top + pane.bottom) / 2;
  // The constraints drawn over the picture take a few per cent.
  EXPECT_GT(Agreement(*actual, cx - 100, cy - 100, 200, *applied, kPhotoWidth / 2 - cx,
                      kPhotoHeight / 2 - cy, 2),
            0.95);

  // A drag moves the picture with the hand; the wheel scrolls 36 pixels a
  // notch.
  ASSERT_EQ(
      Xdo("mousemove " + At(cx, cy) + " mousedown 1 sleep 0.2 mousemove " + At(cx - 40, cy - 25) +
          " sleep 0.2 mousemove " + At(cx - 80, cy - 50) + " sleep 0.2 mouseup 1"),
      0);
  std::unique_ptr<HostDocument> dragged = Settled("edit-zoom-dragged.png");
  ASSERT_NE(dragged, nullptr);
  EXPECT_GT(Agreement(*dragged, cx - 150, cy - 100, 150, *actual, 80, 50), 0.98);
  ASSERT_EQ(Xdo("mousemove " + At(cx, cy) + " click 5 click 5"), 0);
  std::unique_ptr<HostDocument> wheeled = Settled("edit-zoom-wheeled.png");
  ASSERT_NE(wheeled, nullptr);
  EXPECT_GT(Agreement(*wheeled, cx - 100, cy - 150, 150, *dragged, 0, 72), 0.98);

  // Back below 100 %, Q shows the loupe: a framed square of 140 pixels
  // about the mouse with the picture at 100 % in it.
  ASSERT_EQ(Xdo("mousemove " + field + " click 1 type 25"), 0);
  ASSERT_EQ(Xdo("key Return"), 0);
  std::unique_ptr<HostDocument> quarter = Settled("edit-zoom-25.png");
  ASSERT_NE(quarter, nullptr);
  EXPECT_NEAR(TitleZoom(Title()), 25.0, 1e-9);
  ASSERT_TRUE(FindPicture(*quarter, pane, picture, shown, 0.25));
  const int mx = (picture.left + picture.right) / 2, my = (picture.top + picture.bottom) / 2;
  ASSERT_EQ(Xdo("mousemove " + At(mx, my) + " keydown q"), 0);
  std::unique_ptr<HostDocument> loupe = Settled("edit-loupe.png");
  Xdo("keyup q");
  ASSERT_NE(loupe, nullptr);
  for (int t = -60; t <= 60; t += 20) {
    EXPECT_EQ(Rgb(*loupe, mx - 70, my + t), 0u) << "the loupe's left edge at " << t;
    EXPECT_EQ(Rgb(*loupe, mx + 69, my + t), 0u) << "the loupe's right edge at " << t;
    EXPECT_EQ(Rgb(*loupe, mx + t, my - 70), 0u) << "the loupe's top edge at " << t;
  }
  const int ix = int((mx - picture.left) * 4.0), iy = int((my - picture.top) * 4.0);
  EXPECT_GT(Agreement(*loupe, mx - 40, my - 40, 80, *applied, ix - mx, iy - my, 3), 0.95);
  std::unique_ptr<HostDocument> released = Settled("edit-loupe-released.png");
  ASSERT_NE(released, nullptr);
  EXPECT_NE(Rgb(*released, mx - 70, my), 0u) << "the loupe stays after Q";
  Xdo("key Escape");
  End();
}

TEST_F(Edit, FocalLengthAndModelChangesSolveAgainAndRedraw) {
  Open({"--save-action", folder_.File("saved.action")});
  ASSERT_FALSE(window_.empty());
  std::unique_ptr<HostDocument> opened = Settled("edit-focal-before.png", true);
  ASSERT_NE(opened, nullptr);
  Rect pane, picture, shown;
  ASSERT_TRUE(FindPicture(*opened, pane, picture, shown));
  const int right = opened->Width();
  ASSERT_EQ(Xdo("mousemove " + At(right - kFocalFieldFromRight, kFocalFieldTop) +
                " click 1 key End BackSpace BackSpace BackSpace BackSpace BackSpace BackSpace "
                "type 20"),
            0);
  ASSERT_EQ(Xdo("key Return"), 0);
  std::unique_ptr<HostDocument> refocused =
      SettledAfterChange(*opened, picture, "edit-focal-20.png");
  ASSERT_NE(refocused, nullptr);
  EXPECT_LT(Agreement(*refocused, picture.left + 20, picture.top + 20, 150, *opened, 0, 0), 0.9)
      << "the preview did not change";

  // The model popup's next item: Perspective.
  ASSERT_EQ(Xdo("mousemove " + At(right - kModelPopupFromRight, kModelPopupTop) + " click 1"), 0);
  std::this_thread::sleep_for(std::chrono::milliseconds(300));
  ASSERT_EQ(Xdo("key Down Return"), 0);
  std::unique_ptr<HostDocument> perspective =
      SettledAfterChange(*refocused, picture, "edit-perspective.png");
  ASSERT_NE(perspective, nullptr);
  EXPECT_LT(Agreement(*perspective, picture.left + 20, picture.top + 20, 150, *refocused, 0, 0),
            0.9)
      << "the preview did not change";

  // The first Return ends the popup's edit, the second presses OK.
  ASSERT_EQ(Xdo("key Return"), 0);
  ASSERT_EQ(Xdo("key Return"), 0);
  const Finished finished = End();
  ASSERT_EQ(finished.status, 0) << finished.errors;
  const Descriptor saved = ActionFile::Read(folder_.File("saved.action"));
  ASSERT_NE(saved.Find(FourCC("focL")), nullptr);
  // 20 mm over a 36 mm frame across the 1200 pixels of the longer side.
  EXPECT_NEAR(saved.Find(FourCC("focL"))->number, 20.0 * kPhotoWidth / 36.0, 0.5);
  ASSERT_NE(saved.Find(FourCC("prjM")), nullptr);
  EXPECT_EQ(saved.Find(FourCC("prjM"))->enumValue, FourCC("perP"));
  // What the workspace showed last is what the stored action renders.
  ASSERT_EQ(RunToEnd({"apply", "--action", folder_.File("saved.action"), "-o",
                      folder_.File("replayed.tif"), folder_.File("room.tif")})
                .status,
            0);
  EXPECT_LT(DifferingShare(*perspective, picture, *ImageFile::Read(folder_.File("replayed.tif")),
                           "edit-perspective-applied-reduced.png"),
            0.05);
}

TEST_F(Edit, AltTurnsCancelIntoResetWhichStartsAgainFromThePhoto) {
  Open({"--save-action", folder_.File("saved.action")});
  ASSERT_FALSE(window_.empty());
  std::unique_ptr<HostDocument> opened = Settled("edit-reset-before.png", true);
  ASSERT_NE(opened, nullptr);
  const int right = opened->Width();
  const int cancelX = right - kCancelFromRight;
  ASSERT_EQ(Xdo("mousemove " + At(cancelX, kCancelTop) + " keydown alt"), 0);
  std::unique_ptr<HostDocument> held = Settled("edit-reset-alt.png");
  ASSERT_NE(held, nullptr);
  // The button's label changed while Alt is held.
  EXPECT_LT(Agreement(*held, cancelX - 30, kCancelTop - 6, 12, *opened, 0, 0), 0.95);
  ASSERT_EQ(Xdo("mousedown 1 sleep 0.2 mouseup 1 sleep 0.5 keyup alt"), 0);
  std::unique_ptr<HostDocument> reset = Settled("edit-reset-after.png");
  ASSERT_NE(reset, nullptr) << "Reset closed the workspace";
  int status = 0;
  EXPECT_FALSE(run_->Ended(status));
  // Over the picture, which takes the keys from the button, Return is OK.
  Rect pane, picture, shown;
  ASSERT_TRUE(FindPicture(*reset, pane, picture, shown));
  ASSERT_EQ(Xdo("mousemove " + At((pane.left + pane.right) / 2, (pane.top + pane.bottom) / 2) +
                " sleep 0.3 key Return"),
            0);
  const Finished finished = End();
  ASSERT_EQ(finished.status, 0) << finished.errors;
  ASSERT_EQ(finished.errors, "");
  // Reset takes the photo's own 10 mm and drops the action's constraints.
  const Descriptor saved = ActionFile::Read(folder_.File("saved.action"));
  ASSERT_NE(saved.Find(FourCC("focL")), nullptr);
  EXPECT_NEAR(saved.Find(FourCC("focL"))->number, 10.0 * kPhotoWidth / 36.0, 0.5);
  const Descriptor::Item* blob = saved.Find(FourCC("cnsD"));
  EXPECT_TRUE(blob == nullptr ||
              Project::ConstraintBlob::Decode(blob->data.data(), blob->data.size()).empty());
}

#endif  // ARCHWAY_REAL_MODULE

}  // namespace
}  // namespace Host::testing
