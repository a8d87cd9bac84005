#include "params/BehaviorFile.h"

#include <gtest/gtest.h>

#include <string>
#include <string_view>

#include "framework/files/CFile.h"
#include "framework/files/CFileContainer.h"
#include "tests/params/TestFiles.h"

namespace Project {
namespace {

PSettings Apply(std::string_view text) {
  PSettings s(1000);
  ApplyBehaviorText(s, reinterpret_cast<const std::uint8_t*>(text.data()), text.size());
  return s;
}

TEST(BehaviorFile, ValuesOutOfRangeOrUnreadableChangeNothing) {
  for (const char* line : {"iterative.num=0", "iterative.num=20",
                           "iterative.num=", "iterative.num=x5", "iterative.num=99999999999999"}) {
    EXPECT_EQ(Apply(line).iterationNumber, 8) << line;
  }
  EXPECT_EQ(Apply("iterative.num=19").iterationNumber, 19);
  EXPECT_EQ(Apply("iterative.num=  +12abc").iterationNumber, 12);  // as the C scanner reads
  EXPECT_EQ(Apply("mesh.resolution=20").meshResolution, 6);
  EXPECT_EQ(Apply("mesh.resolution=1").meshResolution, 1);
  for (const char* line : {"mesh.regular_weight=0.1", "mesh.regular_weight=0",
                           "mesh.regular_weight=nan", "mesh.regular_weight=-0.01"}) {
    EXPECT_EQ(Apply(line).regularWeight, 0.001f) << line;
  }
  EXPECT_EQ(Apply("mesh.regular_weight=0.0999").regularWeight, 0.0999f);
  for (const char* line : {"mesh.line_weight=0", "mesh.line_weight=inf", "mesh.line_weight=nan",
                           "iterative.converged=0", "iterative.converged=2"}) {
    const PSettings s = Apply(line);
    EXPECT_EQ(s.lineWeight, 30.0f) << line;
    EXPECT_EQ(s.convergedMeasure, 0.001f) << line;
  }
  EXPECT_EQ(Apply("mesh.line_weight=10").lineWeight, 10.0f);
  EXPECT_EQ(Apply("iterative.converged=0.005").convergedMeasure, 0.005f);
}

TEST(BehaviorFile, SwitchesTakeTrueOrFalseWithinTheLineLength) {
  const PSettings s = Apply(
      "iterative.cache_order=true\niterative.debug_solve=true\n"
      "ui.show_behavioral= true\nmesh.use_triangle=false\n");
  EXPECT_EQ(s.cacheDssPermutation, 1);
  EXPECT_EQ(s.useDebugSolve, 1);
  EXPECT_EQ(s.showBehavioral, 1);
  EXPECT_EQ(s.meshUseTriangle, 0);
  EXPECT_EQ(Apply("mesh.use_triangle=maybe").meshUseTriangle, 1);
  // Ten characters behind the key pass the length test; eleven fail it.
  EXPECT_EQ(Apply("mesh.use_triangle=false     ").meshUseTriangle, 0);
  EXPECT_EQ(Apply("mesh.use_triangle=false      ").meshUseTriangle, 1);
}

TEST(BehaviorFile, LineRules) {
  // CR, LF and CR LF end lines, the last needs none, case matters.
  const PSettings s = Apply("# note\r\n\nITERATIVE.NUM=3\rmesh.resolution=7\r\niterative.num=4");
  EXPECT_EQ(s.iterationNumber, 4);
  EXPECT_EQ(s.meshResolution, 7);

  const std::string key = "iterative.num=5";
  EXPECT_EQ(Apply(key + std::string(254 - key.size(), ' ')).iterationNumber, 5);
  const std::string dropped = key + std::string(255 - key.size(), ' ');
  EXPECT_EQ(Apply(dropped + "\n").iterationNumber, 8);
  // Reading goes on behind a dropped line as if a new one began there.
  EXPECT_EQ(Apply(dropped + "mesh.resolution=3\n").meshResolution, 3);
}

TEST(BehaviorFile, LoadsFromTheDirectory) {
  testing::ScratchDirectory scratch;
  PSettings s(1000);
  LoadBehaviorFile(s, scratch.Get());  // no file: nothing happens
  EXPECT_EQ(s.iterationNumber, 8);
  std::string text;  // longer than one read buffer, so lines cross its edges
  for (int i = 0; i < 600; ++i) text += "unknown.filler=" + std::to_string(i) + "\n";
  text += "iterative.num=13\n";
  Tarsa::CFileContainer(Tarsa::CFile(scratch.Get(), kBehaviorFileName, true),
                        Tarsa::CFilePort::kMode_ReadWrite)
      .Write(text.data(), text.size());
  LoadBehaviorFile(s, scratch.Get());
  EXPECT_EQ(s.iterationNumber, 13);
}

}  // namespace
}  // namespace Project
