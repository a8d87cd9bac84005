// Asking the host for candidate profiles, ranking them, and the match as a
// whole against the host's own lens profile service.
#include "lens/profiles/PLensMatcher.h"

#include <gtest/gtest.h>

#include <cstring>
#include <filesystem>
#include <string>
#include <vector>

#include "host/plugin/HostBuffers.h"
#include "host/plugin/LensProfileService.h"
#include "lens/camera/PRadialDistortCameraModel.h"
#include "tests/support/MetadataPackets.h"
#include "tests/support/RecordingPresenter.h"
#include "tests/support/TestSupport.h"

namespace Project::testing {
namespace {

// The run as the matcher sees it, with the host's basic suite.
class FakeRun : public PLensMatcher::Run {
 public:
  const Tarsa::HostBufferSuite* basic = Host::HostBuffers::Suite();
  const Tarsa::HostLensProfilesSuite* lens = nullptr;
  int lensAsked = 0;
  PhotoInfo photo;
  PhotoInfo record;
  std::string key = "old key";

  const Tarsa::HostBufferSuite* BasicSuite() override { return basic; }
  const Tarsa::HostLensProfilesSuite* LensProfilesSuite() override {
    ++lensAsked;
    return lens;
  }
  const PhotoInfo* LensPhoto() override { return &photo; }
  PhotoInfo& LensRecord() override { return record; }
  std::string& LensKey() override { return key; }
  float LensCropRatio() override { return PLensMatcher::CropRatio(record, photo); }
};

// A lens profile service that answers a fixed list and counts its queries.
struct CountingService {
  static inline int queries = 0;
  static inline std::vector<PLensRepresent> answer;
  static inline std::vector<std::string> seenNames;
  static inline float seenCrop = -1;
  static inline std::vector<std::int32_t> seenConstants;

  static char* Copy(const std::string& text) {
    auto* block = static_cast<char*>(
        Host::HostBuffers::Suite()->allocate(std::uint32_t(text.size() + 1), nullptr));
    std::memcpy(block, text.c_str(), text.size() + 1);
    return block;
  }
  static Tarsa::HostStatus Query(void* block) {
    ++queries;
    auto& query = *static_cast<Tarsa::HostLensQuery*>(block);
    seenNames = {query.make, query.model, query.lens};
    seenCrop = query.cropFactor;
    seenConstants = {query.constant36, query.constant40, query.constant44};
    query.results = static_cast<Tarsa::HostLensResult**>(Host::HostBuffers::Suite()->allocate(
        std::uint32_t(answer.size() * sizeof(void*)), nullptr));
    for (std::size_t i = 0; i < answer.size(); ++i) {
      auto* result = static_cast<Tarsa::HostLensResult*>(
          Host::HostBuffers::Suite()->allocate(sizeof(Tarsa::HostLensResult), nullptr));
      *result = {nullptr,
                 Copy(answer[i].path),
                 Copy(answer[i].make),
                 Copy(answer[i].model),
                 Copy(""),
                 Copy(answer[i].lens),
                 Copy(""),
                 0,
                 1,
                 0,
                 0,
                 answer[i].cropFactor};
      query.results[i] = result;
    }
    query.resultCount = std::uint32_t(answer.size());
    return 0;
  }
  static inline const Tarsa::HostLensProfilesSuite kSuite = {nullptr, Query,
                                                             [] { return Tarsa::HostStatus(0); }};
};

// A photo with a crop factor of 1.5 (21 mm equivalent of 14 mm).
PhotoInfo Photo(const std::string& make, const std::string& model, const std::string& lens) {
  PhotoInfo photo = Read(Packet("exif:FocalLength=\"14/1\" exif:FocalLengthIn35mmFilm=\"21\""));
  photo.SetMake(make);
  photo.SetModel(model);
  photo.SetLens(lens);
  return photo;
}

PLensRepresent Candidate(const char* path, const char* make, const char* model, const char* lens,
                         float crop) {
  PLensRepresent c;
  c.path = path;
  c.make = make;
  c.model = model;
  c.lens = lens;
  c.cropFactor = crop;
  return c;
}

TEST(LensMatcherTest, CandidatesAreRankedAgainstThePhoto) {
  CountingService::answer = {
      Candidate("/a", "Other", "APS", "L14", 1.5f), Candidate("/b", "M", "Full", "L14", 1.0f),
      Candidate("/c", "M", "APS", "L14", 1.5f),     Candidate("/d", "M", "APS", "L24", 1.5f),
      Candidate("/e", "M", "X", "L14", 1.6f),       Candidate("/f", "M", "Y", "L14", 1.3f),
      Candidate("/c", "M", "APS", "L14", 1.5f),  // a duplicate
  };
  FakeRun run;
  run.lens = &CountingService::kSuite;
  run.photo = Photo("M", "APS", "L14");
  run.record.SetCameraModel(std::make_unique<PRadialDistortCameraModel>());
  PLensMatcher matcher(run);
  EXPECT_FALSE(matcher.MatchProfile(false)) << "no candidate's file exists";
  EXPECT_EQ(matcher.LastError(), PLensMatcher::kNoMatch);

  EXPECT_EQ(CountingService::seenNames, (std::vector<std::string>{"M", "APS", "L14"}));
  EXPECT_FLOAT_EQ(CountingService::seenCrop, 1.5f);
  EXPECT_EQ(CountingService::seenConstants, (std::vector<std::int32_t>{1, 1, 0}));
  // Make, then lens, then model; then a sensor no smaller than the photo's
  // (f at 1.3 and b at 1.0, nearer first) before a smaller one (e at 1.6,
  // although nearer than b).
  std::vector<std::string> paths;
  for (const auto& candidate : matcher.Candidates()) paths.push_back(candidate->path);
  EXPECT_EQ(paths, (std::vector<std::string>{"/c", "/f", "/b", "/e", "/d", "/a"}));
  EXPECT_EQ(run.record.GetCameraModel(), nullptr) << "the missing file blanks the record";
  EXPECT_EQ(run.key, "");
}

TEST(LensMatcherTest, RefusalsComeBeforeTheHostIsAsked) {
  struct Case {
    const char* what;
    bool basic, lens;
    const char* make;
    std::int32_t code;
    int lensAsked;
  };
  const Case cases[] = {
      {"no basic suite", false, true, "M", PLensMatcher::kNoBasicSuite, 0},
      {"no lens suite", true, false, "M", PLensMatcher::kNoLensSuite, 1},
      {"no make", true, true, "", PLensMatcher::kNoMatch, 1},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    CountingService::queries = 0;
    FakeRun run;
    run.basic = c.basic ? Host::HostBuffers::Suite() : nullptr;
    run.lens = c.lens ? &CountingService::kSuite : nullptr;
    run.photo = Photo(c.make, "APS", "L14");
    PLensMatcher matcher(run);
    EXPECT_FALSE(matcher.MatchProfile(false));
    EXPECT_EQ(matcher.LastError(), c.code);
    EXPECT_EQ(run.lensAsked, c.lensAsked);
    EXPECT_EQ(CountingService::queries, 0);

    // Warned, the failure is shown once and then cleared.
    Tarsa::testing::ScopedRecorder recorder;
    EXPECT_FALSE(matcher.MatchProfile(true));
    ASSERT_EQ(recorder.texts.size(), 1u);
    EXPECT_EQ(recorder.texts[0], Tarsa::ResolveText(PLensMatcher::TextOf(c.code)).Str());
    EXPECT_EQ(matcher.LastError(), 0);
  }
}

TEST(LensMatcherTest, CropRatio) {
  struct Case {
    const char* what;
    const char* model;
    float sensor;
    float photoCrop;  // from focal lengths 10 mm and 10 x crop
    float ratio;
  };
  const Case cases[] = {
      {"same camera and lens", "APS", 1.0f, 1.5f, 1.0f},
      {"sensors within 0.01", "Full", 1.505f, 1.5f, 1.0f},
      {"photo over profile", "Full", 1.0f, 1.5f, 1.5f},
      {"profile without sensor", "Full", 0.0f, 1.5f, 0.0f},
      {"photo without crop", "Full", 1.0f, 0.0f, 0.0f},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    PhotoInfo photo;
    photo.SetMake("M");
    photo.SetModel("APS");
    photo.SetLens("L");
    if (c.photoCrop > 0) {
      const std::string equivalent = std::to_string(int(10 * c.photoCrop));
      photo =
          Read(Packet("tiff:Make=\"M\" tiff:Model=\"APS\" aux:Lens=\"L\" "
                      "exif:FocalLength=\"10/1\" exif:FocalLengthIn35mmFilm=\"" +
                      equivalent + "\""));
    }
    PhotoInfo record;
    record.SetMake("M");
    record.SetModel(c.model);
    record.SetLens("L");
    record.SetSensorFormatFactor(c.sensor);
    EXPECT_FLOAT_EQ(PLensMatcher::CropRatio(record, photo), c.ratio);
  }
}

TEST(LensMatcherTest, MatchesThroughTheHostsService) {
  // The shipped profiles in the user's folder, with a file that is none.
  Tarsa::testing::ScratchFolder home;
  const std::filesystem::path folder = home.Dir() + "archway/profiles";
  std::filesystem::create_directories(folder);
  const std::filesystem::path shipped =
      std::filesystem::path(ARCHWAY_TEST_DATA_DIR).parent_path().parent_path() /
      "resources/profiles";
  for (const auto& file : std::filesystem::directory_iterator(shipped)) {
    std::filesystem::copy_file(file.path(), folder / file.path().filename());
  }
  Tarsa::testing::WriteBytes(folder / "broken.xmp", "<rdf:RDF><qm:Came");
  Tarsa::testing::ScopedEnvironment data("XDG_DATA_HOME", home.Dir().c_str());

  // A 1.5 crop body with the full-frame 14 mm lens.
  FakeRun run;
  run.lens = Host::LensProfileService::Suite();
  run.photo = Photo("Orvane Test", "TC-1 APS", "Orvane Test 14mm F2.8");
  PLensMatcher matcher(run);
  ASSERT_TRUE(matcher.MatchProfile(false));
  ASSERT_EQ(matcher.Candidates().size(), 1u);
  EXPECT_EQ(matcher.Candidates()[0]->path, (folder / "tc1-full-14mm.xmp").string());
  EXPECT_FLOAT_EQ(matcher.Candidates()[0]->cropFactor, 1.0f);
  EXPECT_EQ(matcher.Profiles().Count(), 2u);
  // Both entries share focal length and aperture; with no subject distance
  // the farther focus distance wins.
  EXPECT_FLOAT_EQ(run.record.GetFocusDistance(), 5.0f);
  ASSERT_EQ(run.record.GetCameraModel()->GetType(), PGenericCameraModel::kTypeRadial);
  EXPECT_FLOAT_EQ(
      static_cast<const PRadialDistortCameraModel*>(run.record.GetCameraModel())->radial1, -0.2f);
  EXPECT_FLOAT_EQ(run.LensCropRatio(), 1.5f);

  // A lens the folders do not know: the host answers nothing.
  FakeRun other;
  other.lens = Host::LensProfileService::Suite();
  other.photo = Photo("Orvane Test", "TC-1 APS", "Orvane Test 50mm F1.8");
  PLensMatcher none(other);
  EXPECT_FALSE(none.MatchProfile(false));
  EXPECT_TRUE(none.Candidates().empty());
  EXPECT_EQ(none.LastError(), PLensMatcher::kNoMatch);
}

}  // namespace
}  // namespace Project::testing
