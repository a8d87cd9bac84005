#include "framework/files/CVolEntry.h"

#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <filesystem>

#include "framework/core/CException.h"
#include "framework/files/CDirectory.h"
#include "framework/files/CFile.h"
#include "framework/files/FilePaths.h"
#include "tests/framework/files/FilesTestSupport.h"

namespace Tarsa {
namespace {

namespace fs = std::filesystem;
using testing::Bytes;
using testing::SystemCode;

TEST(CFile, ConstructorsNameOnlyFilesAndMakeThemOnRequest) {
  testing::ScratchFolder folder;
  fs::create_directory(folder.File("sub"));
  folder.Put("there.txt", {1});
  const CDirectory dir(folder.Dir());

  EXPECT_EQ(SystemCode([&] { CFile f(folder.File("sub")); }), 2);
  EXPECT_EQ(SystemCode([&] { CFile f(folder.File("absent.txt")); }), 2);
  EXPECT_EQ(SystemCode([&] { CFile f(dir, "absent.txt", false); }), 2);
  EXPECT_FALSE(fs::exists(folder.File("absent.txt")));
  EXPECT_EQ(SystemCode([&] { CFile f(dir, "sub", true); }), 2);

  const CFile made(dir, "made.txt", true);
  EXPECT_TRUE(fs::is_regular_file(made.GetPath()));
  EXPECT_EQ(fs::file_size(made.GetPath()), 0u);
  EXPECT_TRUE(made.Exists());
  // Making is no truncation: an existing file keeps its bytes.
  EXPECT_EQ(CFile(dir, "there.txt", true).GetPath(), folder.File("there.txt"));
  EXPECT_EQ(folder.Get("there.txt"), (Bytes{1}));

  // A keyed path resolves to its text before the disk is asked.
  const CFile keyed("$$$/Test/Path=" + folder.File("there.txt"));
  EXPECT_EQ(keyed.GetPath(), folder.File("there.txt"));
}

TEST(CFile, RenameReplacesTheTargetWhole) {
  testing::ScratchFolder folder;
  folder.Put("new.tmp", {7, 8});
  folder.Put("prefs", {1, 2, 3});
  CFile side(folder.File("new.tmp"));
  side.Rename(folder.File("prefs"));
  EXPECT_EQ(side.GetPath(), folder.File("prefs"));
  EXPECT_EQ(folder.Get("prefs"), (Bytes{7, 8}));
  EXPECT_FALSE(fs::exists(folder.File("new.tmp")));
  // A rename into a missing folder fails with the system's code and moves nothing.
  EXPECT_NE(SystemCode([&] { side.Rename(folder.File("missing/prefs")); }), 0);
  EXPECT_EQ(side.GetPath(), folder.File("prefs"));
}

TEST(CDirectory, ConstructorNamesOnlyDirectoriesAndMakesThemOnRequest) {
  testing::ScratchFolder folder;
  folder.Put("file", {7});
  EXPECT_EQ(SystemCode([&] { CDirectory d(folder.File("file")); }), 267);
  EXPECT_EQ(SystemCode([&] { CDirectory d(folder.File("file"), true); }), 267);
  EXPECT_EQ(folder.Get("file"), (Bytes{7}));
  EXPECT_EQ(SystemCode([&] { CDirectory d(folder.File("absent")); }), 267);
  EXPECT_FALSE(fs::exists(folder.File("absent")));

  const CDirectory made(folder.File("made"), true);
  EXPECT_EQ(made.GetPath(), folder.File("made/"));
  EXPECT_TRUE(fs::is_directory(made.GetPath()));
  EXPECT_TRUE(made.Exists());
  EXPECT_FALSE(CDirectory::FromPath(folder.File("file")).Exists());
  EXPECT_FALSE(CFile::FromPath(folder.File("made")).Exists());
}

TEST(CDirectory, DeleteGoesDepthFirstAndLeavesLinkTargets) {
  testing::ScratchFolder folder;
  fs::create_directories(folder.File("tree/a/b/c"));
  fs::create_directories(folder.File("outside"));
  folder.Put("outside/keep.txt", {1});
  folder.Put("tree/top.txt", {1});
  folder.Put("tree/a/b/c/deep.txt", {1});
  folder.Put("tree/a/b/mid.txt", {1});
  fs::create_directory_symlink(folder.File("outside"), folder.File("tree/a/link"));

  CDirectory(folder.File("tree")).Delete();
  EXPECT_FALSE(fs::exists(folder.File("tree")));
  EXPECT_TRUE(fs::exists(folder.File("outside/keep.txt")));

  CVolEntry file(folder.File("outside/keep.txt"));
  file.Delete();
  EXPECT_FALSE(fs::exists(folder.File("outside/keep.txt")));
  EXPECT_EQ(SystemCode([&] { file.Delete(); }), ENOENT);
}

TEST(FilePaths, ChildrenAndPathsAreMadeOnRequestOnly) {
  testing::ScratchFolder folder;
  const CDirectory dir(folder.Dir());
  folder.Put("plain", "");

  CDirectory child;
  EXPECT_FALSE(GetChildDirectory(dir, "kid", child, false));
  EXPECT_FALSE(fs::exists(folder.File("kid")));
  EXPECT_TRUE(GetChildDirectory(dir, "kid", child, true));
  EXPECT_EQ(child.GetPath(), folder.File("kid/"));
  EXPECT_FALSE(GetChildDirectory(dir, "plain", child, true));

  CFile file;
  EXPECT_FALSE(GetChildFile(dir, "kid", file, true));
  EXPECT_TRUE(GetChildFile(dir, "new.txt", file, true));
  EXPECT_TRUE(fs::is_regular_file(folder.File("new.txt")));

  CDirectory deep;
  EXPECT_FALSE(GetDirectoryFromPath(folder.File("p/q/r/"), deep, false));
  EXPECT_FALSE(fs::exists(folder.File("p")));
  EXPECT_TRUE(GetDirectoryFromPath(folder.File("p/q/r/"), deep, true));
  EXPECT_TRUE(fs::is_directory(folder.File("p/q/r")));
  EXPECT_FALSE(GetDirectoryFromPath(folder.File("plain/x/"), deep, true));

  CFile deepFile;
  EXPECT_TRUE(GetFileFromPath(folder.File("m/n/f.txt"), deepFile, true));
  EXPECT_EQ(deepFile.GetPath(), folder.File("m/n/f.txt"));
  EXPECT_TRUE(fs::is_regular_file(folder.File("m/n/f.txt")));
  EXPECT_FALSE(GetFileFromPath(folder.File("p/q"), deepFile, true));
  EXPECT_FALSE(GetFileFromPath(folder.File("none.txt"), deepFile, false));
}

TEST(CVolEntry, KindsAndTimesComeFromTheDisk) {
  testing::ScratchFolder folder;
  folder.Put("f.txt", {1, 2});
  const CVolEntry file(folder.File("f.txt"));
  const CVolEntry dir(folder.Dir());
  const CVolEntry missing(folder.File("none"));
  EXPECT_TRUE(file.Exists() && file.IsFile() && !file.IsDirectory());
  EXPECT_TRUE(dir.Exists() && !dir.IsFile() && dir.IsDirectory());
  EXPECT_FALSE(missing.Exists() || missing.IsFile() || missing.IsDirectory());

  // A whole second, which every file system stores exactly.
  const auto stamp = std::chrono::sys_seconds(std::chrono::seconds(1577836800));
  fs::last_write_time(file.GetPath(), std::chrono::file_clock::from_sys(stamp));
  EXPECT_EQ(file.GetWriteTime(), 1577836800ull * 1000000000ull);
  EXPECT_GT(file.GetCreationTime(), 0u);

  std::uint64_t created = 1, accessed = 1, written = 1;
  EXPECT_FALSE(missing.GetTimes(created, accessed, written));
  EXPECT_EQ(created + accessed + written, 0u);
}

}  // namespace
}  // namespace Tarsa
