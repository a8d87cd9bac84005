#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "host/app/CommandLine.h"
#include "host/app/ImageBatch.h"
#include "host/io/HostError.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

TEST(ImageBatchTest, FoldersExpandToTheirImagesAndResultsGoBeside) {
  testing::ScratchFolder folder;
  for (const char* name :
       {"b.TIF", "a.png", "c.jpeg", "notes.txt", ".hidden.tif", "a-archway.png", "d.tiff"}) {
    testing::WriteBytes(folder.File(name), "x");
  }
  std::filesystem::create_directory(folder.File("sub.tif"));
  const auto jobs = ImageBatch::Plan({folder.File("")}, std::nullopt);
  ASSERT_EQ(jobs.size(), 4u);
  const char* inputs[] = {"a.png", "b.TIF", "c.jpeg", "d.tiff"};
  const char* outputs[] = {"a-archway.png", "b-archway.TIF", "c-archway.jpeg", "d-archway.tiff"};
  for (size_t i = 0; i < jobs.size(); ++i) {
    EXPECT_EQ(std::filesystem::path(jobs[i].input).filename(), inputs[i]);
    EXPECT_EQ(jobs[i].output, folder.File(outputs[i]));
  }
  EXPECT_EQ(ImageBatch::DefaultOutput("photo"), "photo-archway");
}

TEST(ImageBatchTest, OutputOptionsAndTheirRefusals) {
  testing::ScratchFolder folder;
  std::filesystem::create_directory(folder.File("out"));
  std::filesystem::create_directory(folder.File("empty"));
  testing::WriteBytes(folder.File("a.tif"), "x");
  testing::WriteBytes(folder.File("b.tif"), "x");
  const std::string a = folder.File("a.tif"), b = folder.File("b.tif");

  EXPECT_EQ(ImageBatch::Plan({a}, folder.File("x.png"))[0].output, folder.File("x.png"));
  const auto intoFolder = ImageBatch::Plan({a, b}, folder.File("out"));
  EXPECT_EQ(intoFolder[1].output, folder.File("out/b.tif"));

  EXPECT_THROW(ImageBatch::Plan({a, b}, folder.File("x.tif")), HostError);  // a file for two
  EXPECT_THROW(ImageBatch::Plan({a}, folder.File("")), HostError);          // would replace a
  EXPECT_THROW(ImageBatch::Plan({a}, a), HostError);
  EXPECT_THROW(ImageBatch::Plan({a}, folder.File("nowhere/")), HostError);
  EXPECT_THROW(ImageBatch::Plan({a, a}, std::nullopt), HostError);  // same result twice
  EXPECT_THROW(ImageBatch::Plan({folder.File("empty")}, std::nullopt), HostError);
}

TEST(CommandLineTest, ParsesOptionsInBothFormsAndRefusesTheRest) {
  const CommandLine line = CommandLine::Parse({"apply", "--action=a.act", "-o", "out.tif",
                                               "--host-version", "17", "--no-gpu", "--", "-x.tif"});
  EXPECT_EQ(line.command, CommandLine::Command::kApply);
  EXPECT_EQ(line.action, "a.act");
  EXPECT_EQ(line.output, "out.tif");
  EXPECT_EQ(line.hostVersion, 17);
  EXPECT_TRUE(line.noGraphicsProcessor);
  EXPECT_EQ(line.inputs, std::vector<std::string>{"-x.tif"});
  EXPECT_EQ(CommandLine::Parse({"edit", "x", "--help"}).command, CommandLine::Command::kHelp);

  const std::vector<std::vector<std::string>> wrong = {
      {},
      {"fix", "a.tif"},
      {"apply"},
      {"apply", "--action"},
      {"apply", "--frobnicate", "a.tif"},
      {"apply", "--host-version", "18x", "a.tif"},
      {"apply", "--no-gpu=1", "a.tif"},
  };
  for (const auto& arguments : wrong) EXPECT_THROW(CommandLine::Parse(arguments), HostError);
}

}  // namespace
}  // namespace Host
