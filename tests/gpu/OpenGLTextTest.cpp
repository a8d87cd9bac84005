#include "gpu/OpenGLText.h"

#include <gtest/gtest.h>

#include <string>

namespace Project {
namespace {

struct VersionCase {
  const char* text;
  int major;
  int minor;
};

TEST(OpenGLText, VersionFromTheFirstTwoDotsWithTheEndAsADot) {
  const VersionCase cases[] = {
      {"2.1 Mesa 22.3.6", 2, 1},
      {"4.5 (Compatibility Profile) Mesa", 4, 5},  // one dot: the end closes the minor
      {"2.0.1", 2, 0},
      {"3", 3, 0},
      {"", 0, 0},
      {"4.6.0 NVIDIA 535.104.05", 4, 6},
      {"99999999999.1", 2147483647, 1},  // atoi's digits, clamped instead of overflowing
  };
  for (const VersionCase& c : cases) {
    int major = -1;
    int minor = -1;
    ParseOpenGLVersion(c.text, major, minor);
    EXPECT_EQ(major, c.major) << '"' << c.text << '"';
    EXPECT_EQ(minor, c.minor) << '"' << c.text << '"';
  }
}

TEST(OpenGLText, ShaderPathCutsTheHostNameOff) {
  EXPECT_EQ(ShaderPathFromExecutable("/opt/archway/bin/archwayrunner"),
            "/opt/archway/bin/Required/ArchwayFragmentShader.fsh");
  // A plain cut: a shorter name takes part of its folder with it.
  EXPECT_EQ(ShaderPathFromExecutable("/opt/archway/bin/runner"),
            "/opt/arch/Required/ArchwayFragmentShader.fsh");

  // The host's buffer holds 255 characters and wants room for 17 more.
  const std::string folder = "/" + std::string(223, 'd');
  EXPECT_TRUE(ShaderPathFromExecutable(folder + "/archwayrunner").has_value());    // 238
  EXPECT_FALSE(ShaderPathFromExecutable(folder + "d/archwayrunner").has_value());  // 239
  EXPECT_FALSE(ShaderPathFromExecutable("/archwayrun").has_value());
}

}  // namespace
}  // namespace Project
