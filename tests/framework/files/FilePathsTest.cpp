#include "framework/files/FilePaths.h"

#include <gtest/gtest.h>

#include <string>

#include "framework/core/CException.h"
#include "framework/files/CDirectory.h"
#include "framework/files/CFile.h"
#include "tests/support/TestSupport.h"

namespace Tarsa {
namespace {

struct SplitCase {
  const char* path;
  const char* root;
  const char* directory;
  const char* leaf;
  const char* name;
  const char* extension;
};

TEST(FilePaths, SplitPathFindsRootsDirectoriesAndExtensions) {
  const SplitCase cases[] = {
      {"C:", "C:", "", "", "", ""},
      {"C:/", "C:/", "", "", "", ""},
      {"C:dir/a", "C:", "dir/", "a", "a", ""},
      {"C:/dir/a.txt", "C:/", "dir/", "a.txt", "a", "txt"},
      {"//server/share/a.b", "//server/share/", "", "a.b", "a", "b"},
      {"//server/share/x/y.z/w", "//server/share/", "x/y.z/", "w", "w", ""},
      {"//server/share", "//server/", "", "share", "share", ""},
      {"/", "/", "", "", "", ""},
      {"/home/user/pic.tar.gz", "/", "home/user/", "pic.tar.gz", "pic.tar", "gz"},
      {"a/.profile", "", "a/", ".profile", ".profile", ""},
      {".", "", "", ".", ".", ""},
      {"rel/name.", "", "rel/", "name.", "name", ""},
      {"", "", "", "", "", ""},
  };
  for (const SplitCase& c : cases) {
    SCOPED_TRACE(c.path);
    const PathParts parts = SplitPath(c.path);
    EXPECT_EQ(parts.root, c.root);
    EXPECT_EQ(parts.directory, c.directory);
    EXPECT_EQ(parts.leaf, c.leaf);
    EXPECT_EQ(parts.name, c.name);
    EXPECT_EQ(parts.extension, c.extension);
  }
}

TEST(FilePaths, NamesAndTypeCodesComeFromTheLeaf) {
  const CFile photo = CFile::FromPath("/a/b/photo.jpeg");
  EXPECT_EQ(photo.GetName(), "photo.jpeg");
  EXPECT_EQ(photo.GetBaseName(), "photo");
  EXPECT_EQ(photo.GetExtension(), "jpeg");
  EXPECT_EQ(photo.GetTypeCode(), 0x6A706567u);  // 'j' 'p' 'e' 'g'
  EXPECT_EQ(CFile::FromPath("x.ab").GetTypeCode(), 0x61620000u);
  EXPECT_EQ(CFile::FromPath("x.abcde").GetTypeCode(), 0u);
  EXPECT_EQ(CFile::FromPath("noextension").GetTypeCode(), 0u);
  // A character outside 32..126 packs as a zero byte; é is one character.
  EXPECT_EQ(CFile::FromPath("x.a\xC3\xA9z").GetTypeCode(), 0x61007A00u);

  const CDirectory folder = CDirectory::FromPath("/a/lens.d");
  EXPECT_EQ(folder.GetPath(), "/a/lens.d/");
  EXPECT_EQ(folder.GetName(), "lens.d");
  EXPECT_EQ(folder.GetTypeCode(), 0x64000000u);
  EXPECT_EQ(CDirectory::FromPath("/").GetName(), "/");  // a root is its own label
  EXPECT_EQ(CDirectory::FromPath("//server/share/").GetName(), "//server/share/");
}

TEST(FilePaths, ParentsClimbToTheRoot) {
  struct ParentCase {
    const char* path;
    const char* parent;
    int depth;
  };
  const ParentCase cases[] = {
      {"/home/user/pic.jpg", "/home/user/", 3},
      {"/home/user/", "/home/", 2},
      {"/", "/", 0},
      {"C:/dir/", "C:/", 1},
      {"//server/share/x/", "//server/share/", 1},
      {"a/b", "a/", 2},
  };
  for (const ParentCase& c : cases) {
    SCOPED_TRACE(c.path);
    const CFile entry = CFile::FromPath(c.path);
    std::string parent;
    EXPECT_EQ(entry.GetParentPath(parent), c.depth == 0 ? 0 : 1);
    EXPECT_EQ(parent, c.parent);
    EXPECT_EQ(entry.GetDepth(), c.depth);
  }
  std::string two;
  EXPECT_EQ(CFile::FromPath("/home/user/pic.jpg").GetParentPath(two, 2), 2);
  EXPECT_EQ(two, "/home/");
  EXPECT_EQ(CFile::FromPath("/home/user/pic.jpg").GetParent().GetPath(), "/home/user/");

  for (const char* root : {"/", "C:/", "C:", "//server/share/"}) {
    EXPECT_TRUE(CDirectory::FromPath(root).IsRoot()) << root;
  }
  for (const char* path : {"/home/", "", "a/"}) {
    EXPECT_FALSE(CDirectory::FromPath(path).IsRoot()) << path;
  }
}

using EnvironmentGuard = Tarsa::testing::ScopedEnvironment;

TEST(FilePaths, FoldersFollowTheEnvironmentAndItsDefaults) {
  EnvironmentGuard home("HOME", "/h/me");
  {
    EnvironmentGuard config("XDG_CONFIG_HOME", "/x/cfg");
    EnvironmentGuard data("XDG_DATA_HOME", nullptr);
    EnvironmentGuard temp("TMPDIR", "/var/scratch");
    EXPECT_EQ(GetSpecialFolderPath(SpecialFolder::kUserConfig), "/x/cfg/");
    EXPECT_EQ(GetSpecialFolderPath(SpecialFolder::kUserData), "/h/me/.local/share/");
    EXPECT_EQ(GetSpecialFolderPath(SpecialFolder::kHome), "/h/me/");
    EXPECT_EQ(GetTemporaryDirectoryPath(), "/var/scratch/");
  }
  {
    // A relative XDG value is not a folder and falls back to the default.
    EnvironmentGuard config("XDG_CONFIG_HOME", "relative/cfg");
    EnvironmentGuard temp("TMPDIR", nullptr);
    EXPECT_EQ(GetSpecialFolderPath(SpecialFolder::kUserConfig), "/h/me/.config/");
    EXPECT_EQ(GetTemporaryDirectoryPath(), "/tmp/");
  }
  const std::string current = GetCurrentDirectoryPath();
  EXPECT_EQ(current.back(), '/');
  EXPECT_TRUE(CDirectory::FromPath(current).Exists());
}

}  // namespace
}  // namespace Tarsa
