#include "params/PPreferences.h"

#include <gtest/gtest.h>

#include "framework/files/CFile.h"
#include "framework/files/CFileContainer.h"
#include "framework/files/CMemoryContainer.h"
#include "params/PreferencesDirectory.h"
#include "tests/params/TestFiles.h"

namespace Project {
namespace {

using testing::ByteBuilder;
constexpr std::int32_t kWidth = 3600;

bool ReadBytes(PPreferences& prefs, const std::vector<std::uint8_t>& bytes) {
  Tarsa::CMemoryContainer in;
  in.Write(bytes.data(), bytes.size());
  return prefs.Read(in);
}

// A file around the chunk list body.
std::vector<std::uint8_t> File(const ByteBuilder& body, bool bigEndian = false) {
  ByteBuilder file(bigEndian);
  file.Code("Trsa").Code("AXCo").U32(0).U32(0).U32(body.Size()).Bytes(body.Get());
  return file.Get();
}

TEST(PPreferences, WritesTheFileByteForByte) {
  PPreferences prefs(kWidth);
  prefs.displayFlags = 0x11223344;
  prefs.windowLocation = {10, -20, 300, 400};
  prefs.settings.focalLength = 1.5f;
  prefs.settings.projectionModel = 9;  // stored as Auto
  prefs.settings.lastLoadDirectory = "/xy";
  prefs.settings.loupeSize = 99;
  prefs.settings.imageScale = 50;  // not stored

  ByteBuilder set;
  set.U8(0).U16(64).U8(0).U8(0).U8(0).U32(0).U32(0);
  set.U32(0xFF4AFFFF).U32(0xFFFFFF4A).U32(0xFFFF4AFF).U32(0xFFFF4A4A).U32(0xFF4AFF4A);
  set.U32(0xFF4AFF4A).U8(0).U8(0).U16(8).F32(1.5f).F32(15.0f).F32(1.0f).U32(3);
  set.U8(1).U8(1).U8(1).U8(0).U32(3).Bytes("/xy").U8(1).U32(99);
  ByteBuilder body;
  body.Code("AXCo").Code("DFlg").U32(0).U32(0).U32(4).U32(0x11223344);
  body.Code("AXCo").Code("DLoc").U32(0).U32(0).U32(16).U32(10).U32(-20).U32(300).U32(400);
  body.Code("AXCo").Code("BSet").U32(0).U32(1).U32(74).Bytes(set.Get()).U32(0);

  Tarsa::CMemoryContainer out;
  prefs.Write(out);
  EXPECT_EQ(std::vector<std::uint8_t>(out.Data(), out.Data() + out.Size()), File(body));
}

TEST(PPreferences, ReadsHandWrittenFilesInEitherByteOrder) {
  for (const bool big : {false, true}) {
    SCOPED_TRACE(big ? "big-endian" : "little-endian");
    ByteBuilder set(big);  // a version 0 block: no loupe fields
    set.U8(1).U16(0x1234).U8(2).U8(3).U8(4).U32(-5).U32(6);
    set.U32(1).U32(2).U32(3).U32(4).U32(5).U32(0xFF000006);  // colours
    set.U8(1).U8(1).U16(15).F32(850.25f).F32(12.0f).F32(2.0f).U32(7);
    set.U8(0).U8(0).U8(0).U8(9).U32(4).Bytes("/a/b");
    ByteBuilder body(big);
    body.Code("AXCo").Code("DFlg").U32(0).U32(0).U32(4).U32(0x01020304);
    body.Code("AXCo").Code("DLoc").U32(0).U32(0).U32(16).U32(1).U32(-2).U32(3).U32(-4);
    body.Code("AXCo").Code("BSet").U32(0).U32(0).U32(set.Size()).Bytes(set.Get()).U32(0);

    PPreferences prefs(kWidth);
    EXPECT_TRUE(ReadBytes(prefs, File(body, big)));
    EXPECT_EQ(prefs.displayFlags, 0x01020304u);
    EXPECT_EQ(prefs.windowLocation, (PPreferences::WindowLocation{1, -2, 3, -4}));
    const PSettings& s = prefs.settings;
    EXPECT_EQ(s.reservedWord, 0x1234);
    EXPECT_EQ(s.reservedValueA, -5);
    EXPECT_EQ(s.colorInvalid, 4u);  // stored before colorFixed
    EXPECT_EQ(s.colorFixed, 5u);
    EXPECT_EQ(s.colorMesh, 0xFF000006u);
    EXPECT_EQ(s.reservedFlagE, 0);  // never taken from the file
    EXPECT_EQ(s.iterationNumber, 15);
    EXPECT_EQ(s.focalLength, 850.25f);
    EXPECT_EQ(s.cropFactor, 2.0f);
    EXPECT_EQ(s.projectionModel, PSettings::kModelAuto);  // 7 is unknown
    EXPECT_EQ(s.reservedFlagG, 9);
    EXPECT_EQ(s.lastLoadDirectory.Str(), "/a/b");
    EXPECT_EQ(s.loupeSize, 140);
  }
}

TEST(PPreferences, RoundTripsThroughTheDirectory) {
  testing::ScratchDirectory scratch;
  PPreferences saved(kWidth);
  saved.displayFlags = 2;
  saved.windowLocation = {5, 6, 700, 800};
  saved.settings.focalLength = 1234.5f;
  saved.settings.projectionModel = PSettings::kModelFullSpherical;
  saved.settings.lastLoadDirectory = "/home/x/ü/";
  saved.settings.loupeSize = 220;
  saved.settings.iterationNumber = 17;
  saved.settings.regularizerModel = PSettings::kRegularizerPanini;  // not stored
  saved.Save(scratch.Get());
  saved.Save(scratch.Get());  // replaces, and leaves no side file
  EXPECT_EQ(scratch.Get().GetEntryNames(), std::vector<std::string>{"Archway Prefs.qmp"});

  PPreferences loaded(kWidth);
  loaded.Load(scratch.Get());
  EXPECT_EQ(loaded.displayFlags, 2u);
  EXPECT_EQ(loaded.windowLocation, saved.windowLocation);
  EXPECT_EQ(loaded.settings.version, 1u);
  EXPECT_EQ(loaded.settings.focalLength, 1234.5f);
  EXPECT_EQ(loaded.settings.projectionModel, PSettings::kModelFullSpherical);
  EXPECT_EQ(loaded.settings.lastLoadDirectory.Str(), "/home/x/ü/");
  EXPECT_EQ(loaded.settings.loupeSize, 220);
  EXPECT_EQ(loaded.settings.regularizerModel, PSettings::kRegularizerAuto);
  // The iteration count is stored and read back, yet a run still begins at 8.
  EXPECT_EQ(loaded.settings.iterationNumber, 17);
  PSettings run(kWidth);
  run = loaded.settings;
  EXPECT_EQ(run.iterationNumber, 8);
}

TEST(PPreferences, RefusedFilesLeaveTheDefaults) {
  const auto file = [](const char* magic, const char* kind, std::uint32_t high,
                       std::uint32_t length) {
    ByteBuilder bytes;
    bytes.Code(magic).Code(kind).U32(0).U32(high).U32(length);
    bytes.Code("AXCo").Code("DFlg").U32(0).U32(0).U32(4).U32(77).U32(0);
    return bytes.Get();
  };
  std::vector<std::uint8_t> headerOnly = file("Trsa", "AXCo", 0, 28);
  headerOnly.resize(20);
  for (const auto& bytes : {headerOnly, file("Tsra", "AXCo", 0, 28), file("Trsa", "AXCp", 0, 28),
                            file("Trsa", "AXCo", 1, 28), file("Trsa", "AXCo", 0, 4)}) {
    PPreferences prefs(kWidth);
    EXPECT_FALSE(ReadBytes(prefs, bytes));
    EXPECT_EQ(prefs.displayFlags, 3u);
  }
  PPreferences control(kWidth);
  EXPECT_TRUE(ReadBytes(control, file("Trsa", "AXCo", 0, 28)));
  EXPECT_EQ(control.displayFlags, 77u);
}

TEST(PPreferences, SkipsForeignChunksUnknownVersionsAndDamage) {
  ByteBuilder body;
  body.Code("Othr").Code("DFlg").U32(0).U32(0).U32(8).U32(111).U32(222);  // another owner's
  body.Code("AXCo").Code("BSet").U32(0).U32(2).U32(3).U8(1).U8(2).U8(3);  // a future version
  body.Code("AXCo").Code("DLoc").U32(0).U32(1).U32(16).U32(1).U32(1).U32(1).U32(1);
  body.Code("AXCo").Code("DFlg").U32(0).U32(0).U32(4).U32(5);
  body.Code("AXCo").Code("BSet").U32(0).U32(1).U32(3).U8(7).U16(8);  // too short for its fields
  body.Code("AXCo").Code("DFlg").U32(0).U32(0).U32(4).U32(6);        // behind the damage
  PPreferences prefs(kWidth);
  EXPECT_TRUE(ReadBytes(prefs, File(body)));
  EXPECT_EQ(prefs.displayFlags, 5u);
  EXPECT_EQ(prefs.windowLocation, PPreferences::kUnplacedWindow);
  EXPECT_EQ(prefs.settings.reservedFlagA, 0);
}

TEST(PPreferences, MissingOrForeignFilesAndDirectoriesFailQuietly) {
  testing::ScratchDirectory scratch;
  PPreferences prefs(kWidth);
  prefs.Load(scratch.Get());
  EXPECT_EQ(prefs.displayFlags, 3u);
  const Tarsa::CDirectory gone = Tarsa::CDirectory::FromPath(scratch.Dir() + "gone/");
  EXPECT_NO_THROW(prefs.Save(gone));
  EXPECT_FALSE(gone.Exists());

  Tarsa::CDirectory dir;
  ASSERT_TRUE(GetPreferencesDirectory(scratch.Get(), dir));
  EXPECT_EQ(dir.GetPath(),
            scratch.Dir() + "Orvane/Orvane Quillmark VX 2099/Orvane Quillmark VX 2099 Settings/");
  EXPECT_TRUE(dir.Exists());
  testing::ScratchDirectory blocked;  // a file where the first level should be
  Tarsa::CFile(blocked.Get(), "Orvane", true);
  EXPECT_FALSE(GetPreferencesDirectory(blocked.Get(), dir));
}

}  // namespace
}  // namespace Project
