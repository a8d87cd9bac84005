// Reading profile files, the file check, the order of entries and the
// choice of the entry nearest a photo.
#include "lens/profiles/PLensProfiles.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <random>
#include <string>
#include <vector>

#include "lens/camera/PFisheyeCameraModel.h"
#include "lens/camera/PRadialDistortCameraModel.h"
#include "lens/camera/PTangentialDistortCameraModel.h"
#include "tests/support/MetadataPackets.h"
#include "tests/support/TestSupport.h"
#include "tools/lensprofile/lib/Calibration.h"
#include "tools/lensprofile/lib/ProfileXmp.h"

namespace Project::testing {
namespace {

[[maybe_unused]] ::testing::Environment* const kToolkit =
    ::testing::AddGlobalTestEnvironment(new ToolkitEnvironment);

bool Parse(PLensProfiles& profiles, const std::string& xmp, bool firstOnly = false) {
  return profiles.ParseFile(xmp.data(), xmp.size(), firstOnly);
}

std::string Written(const std::string& calibration) {
  return LensTool::ProfileXmp::Write(LensTool::Calibration::Parse(calibration));
}

constexpr const char* kShared =
    "Make: Orvane Test\nModel: TC-1 Full\nLens: Orvane Test 14mm F2.8\n"
    "CameraPrettyName: Pretty Body\nLensPrettyName: Pretty & <Lens>\n"
    "SensorFormatFactor: 1\nCameraRawProfile: true\nImageWidth: 4000.4\nImageLength: 3000.5\n"
    "FocalLength: 14\n";

TEST(LensProfilesTest, ToolWrittenProfileReadsBackIntoEqualModels) {
  const std::string xmp =
      Written(std::string(kShared) +
              "[entry]\nApertureValue: 5\nFocusDistance: 2.5\n"
              "[PerspectiveModel]\nFocalLengthX: 0.3889\nFocalLengthY: 0.39\nImageXCenter: 0.51\n"
              "ImageYCenter: 0.49\nScaleFactor: 1.02\nRadialDistortParam1: -0.2\n"
              "RadialDistortParam2: 0.03\nRadialDistortParam3: -0.004\nResidualMeanError: 0.002\n"
              "ResidualStandardDeviation: 0.001\n"
              "[entry]\nApertureValue: 3\n"
              "[PerspectiveModel]\nFocalLengthX: 0.3889\nFocalLengthY: 0.3889\n"
              "RadialDistortParam1: -0.1\nTangentialDistortParam2: 0.0015\n");
  PLensProfiles profiles;
  ASSERT_TRUE(Parse(profiles, xmp));
  ASSERT_EQ(profiles.Count(), 2u);

  // Same camera, lens and focal length: the smaller aperture goes first.
  const PhotoInfo& tangential = profiles.Entry(0);
  const PhotoInfo& radial = profiles.Entry(1);
  EXPECT_EQ(radial.GetMake(), "Orvane Test");
  EXPECT_EQ(radial.GetModel(), "TC-1 Full");
  EXPECT_EQ(radial.GetLens(), "Orvane Test 14mm F2.8");
  EXPECT_EQ(radial.GetCameraPrettyName(), "Pretty Body");
  EXPECT_EQ(radial.GetLensPrettyName(), "Pretty & <Lens>");
  EXPECT_EQ(radial.GetImageWidth(), 4000u);  // floor of value + 0.5
  EXPECT_EQ(radial.GetImageHeight(), 3001u);
  EXPECT_FLOAT_EQ(radial.GetFocalLength(), 14);
  EXPECT_FLOAT_EQ(radial.GetApertureValue(), 5);
  EXPECT_FLOAT_EQ(radial.GetSensorFormatFactor(), 1);
  EXPECT_TRUE(radial.GetCameraRawProfile());
  EXPECT_FLOAT_EQ(radial.GetFocusDistance(), 2.5f);

  PRadialDistortCameraModel expected;
  expected.focalX = 0.3889f;
  expected.focalY = 0.39f;
  expected.centerX = 0.51f;
  expected.centerY = 0.49f;
  expected.radial1 = -0.2f;
  expected.radial2 = 0.03f;
  expected.radial3 = -0.004f;
  expected.residualMeanError = 0.002f;
  expected.residualStdDev = 0.001f;
  ASSERT_EQ(radial.GetCameraModel()->GetType(), PGenericCameraModel::kTypeRadial);
  const auto& readRadial = static_cast<const PRadialDistortCameraModel&>(*radial.GetCameraModel());
  EXPECT_TRUE(readRadial.IsSameModel(expected));
  EXPECT_FLOAT_EQ(readRadial.scale, 1.02f);

  // One tangential term makes the tangential model; the other stays 0, and
  // an absent centre keeps its default.
  PTangentialDistortCameraModel expectedTangential;
  expectedTangential.focalX = expectedTangential.focalY = 0.3889f;
  expectedTangential.radial1 = -0.1f;
  expectedTangential.tangential2 = 0.0015f;
  ASSERT_EQ(tangential.GetCameraModel()->GetType(), PGenericCameraModel::kTypeTangential);
  EXPECT_TRUE(static_cast<const PTangentialDistortCameraModel&>(*tangential.GetCameraModel())
                  .IsSameModel(expectedTangential));

  // The fisheye model, and a missing FocalLengthX read as none at all.
  const std::string fisheyeXmp = Written(
      "Make: M\nLens: F\n[entry]\n[FisheyeModel]\nFocalLengthY: 0.25\nImageXCenter: 0.5\n"
      "RadialDistortParam1: -0.0417\nRadialDistortParam2: 0.0005\nScaleFactor: 3\n");
  PLensProfiles fisheye;
  ASSERT_TRUE(Parse(fisheye, fisheyeXmp));
  PFisheyeCameraModel expectedFisheye;
  expectedFisheye.focalX = 0;
  expectedFisheye.focalY = 0.25f;
  expectedFisheye.radial1 = -0.0417f;
  expectedFisheye.radial2 = 0.0005f;
  const PGenericCameraModel& readFisheye = *fisheye.Entry(0).GetCameraModel();
  ASSERT_EQ(readFisheye.GetType(), PGenericCameraModel::kTypeFisheye);
  EXPECT_TRUE(static_cast<const PFisheyeCameraModel&>(readFisheye).IsSameModel(expectedFisheye));
  EXPECT_FLOAT_EQ(readFisheye.scale, 1.0f) << "a fisheye reads no scale";
}

TEST(LensProfilesTest, ShippedProfilesAreSound) {
  const std::filesystem::path folder =
      std::filesystem::path(ARCHWAY_TEST_DATA_DIR).parent_path().parent_path() /
      "resources/profiles";
  int files = 0;
  for (const auto& file : std::filesystem::directory_iterator(folder)) {
    SCOPED_TRACE(file.path().string());
    PLensProfiles profiles;
    EXPECT_TRUE(Parse(profiles, Tarsa::testing::ReadBytes(file.path().string())));
    EXPECT_GE(profiles.Count(), 2u);
    ++files;
  }
  EXPECT_EQ(files, 4);
}

TEST(LensProfilesTest, FileCheckRefusesWhatIsNotOneLens) {
  // Built directly: the tool itself refuses the mixed form.
  const auto entry = [](std::vector<LensTool::ProfileField> changes, const char* model) {
    LensTool::ProfileEntry e;
    e.fields = {{"Make", "M"}, {"Model", "B"}, {"Lens", "L"}, {"SensorFormatFactor", "1.5"}};
    for (const auto& change : changes) {
      auto same = std::find_if(e.fields.begin(), e.fields.end(),
                               [&](const auto& field) { return field.name == change.name; });
      if (same != e.fields.end()) {
        same->value = change.value;
      } else {
        e.fields.push_back(change);
      }
    }
    e.modelStruct = model;
    e.modelFields = {{"FocalLengthX", "0.4"}, {"FocalLengthY", "0.4"}};
    return e;
  };
  struct Case {
    const char* what;
    LensTool::ProfileEntry second;
    bool accepted;
  };
  const Case cases[] = {
      {"fisheye and perspective", entry({}, "FisheyeModel"), false},
      {"another lens", entry({{"Lens", "L2"}}, "PerspectiveModel"), false},
      {"another raw flag", entry({{"CameraRawProfile", "True"}}, "PerspectiveModel"), false},
      {"sensor 0.06 apart", entry({{"SensorFormatFactor", "1.56"}}, "PerspectiveModel"), false},
      {"sensor 0.04 apart", entry({{"SensorFormatFactor", "1.54"}}, "PerspectiveModel"), true},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    LensTool::Calibration calibration;
    calibration.entries = {entry({}, "PerspectiveModel"), c.second};
    const std::string xmp = LensTool::ProfileXmp::Write(calibration);
    PLensProfiles profiles;
    EXPECT_EQ(Parse(profiles, xmp), c.accepted);
    EXPECT_EQ(profiles.Count(), c.accepted ? 2u : 0u) << "a refused file adds nothing";
    PLensProfiles first;
    EXPECT_TRUE(Parse(first, xmp, true)) << "the first entry alone is a sound file";
    EXPECT_EQ(first.Count(), 1u);
  }
}

std::unique_ptr<PhotoInfo> Entry(float focal, float aperture) {
  auto entry = std::make_unique<PhotoInfo>();
  entry->SetMake("M");
  entry->SetLens("L");
  entry->SetFocalLength(focal);
  entry->SetApertureValue(aperture);
  entry->SetCameraModel(std::make_unique<PRadialDistortCameraModel>());
  return entry;
}

TEST(LensProfilesTest, EntriesAreOrderedAndTheNearestIsChosen) {
  PLensProfiles profiles;
  profiles.Insert(Entry(24, 3));
  profiles.Insert(Entry(14, 4));
  profiles.Insert(Entry(10, 3));
  profiles.Insert(Entry(14.005f, 2.97f));  // the same focal length within 0.01
  const auto focalsAndApertures = [](const std::vector<const PhotoInfo*>& list) {
    std::vector<std::pair<float, float>> out;
    for (const PhotoInfo* p : list) out.emplace_back(p->GetFocalLength(), p->GetApertureValue());
    return out;
  };
  std::vector<const PhotoInfo*> inOrder;
  for (std::size_t i = 0; i < profiles.Count(); ++i) inOrder.push_back(&profiles.Entry(i));
  using Pairs = std::vector<std::pair<float, float>>;
  EXPECT_EQ(focalsAndApertures(inOrder), (Pairs{{10, 3}, {14.005f, 2.97f}, {14, 4}, {24, 3}}));

  struct Case {
    const char* what;
    float focal, aperture;
    Pairs expected;
  };
  const Case cases[] = {
      // 14 is nearest to 15; between the two 14s the aperture nearer to 3.
      {"nearest", 15, 3, {{14.005f, 2.97f}, {14, 4}, {10, 3}, {24, 3}}},
      // No focal length and no aperture: the farthest from 0, the longest.
      {"longest", 0, 0, {{24, 3}, {14, 4}, {14.005f, 2.97f}, {10, 3}}},
      // 10 and 14 both 2 from 12: the list's order stands.
      {"equal distance", 12, 3, {{10, 3}, {14.005f, 2.97f}, {14, 4}, {24, 3}}},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    PhotoInfo photo;
    photo.SetFocalLength(c.focal);
    photo.SetApertureValue(c.aperture);
    std::vector<const PhotoInfo*> all;
    const PhotoInfo* best = profiles.BestProfile(photo, &all);
    EXPECT_EQ(focalsAndApertures(all), c.expected);
    EXPECT_EQ(best, all.front());
    std::vector<const PhotoInfo*> two;
    profiles.BestProfile(photo, &two, 2);
    EXPECT_EQ(focalsAndApertures(two), Pairs(c.expected.begin(), c.expected.begin() + 2));
  }
  EXPECT_EQ(PLensProfiles().BestProfile(PhotoInfo()), nullptr);
}

// Whatever the bytes, reading never fails loudly, and what it accepts is a
// sound file.
void ExpectSafe(const std::string& bytes, bool firstOnly) {
  PLensProfiles profiles;
  if (profiles.ParseFile(bytes.data(), bytes.size(), firstOnly)) {
    std::vector<const PhotoInfo*> entries;
    for (std::size_t i = 0; i < profiles.Count(); ++i) entries.push_back(&profiles.Entry(i));
    EXPECT_TRUE(PLensProfiles::PassesFileCheck(entries));
  } else {
    EXPECT_EQ(profiles.Count(), 0u);
  }
}

TEST(LensProfilesTest, DamagedAndHostileFilesAreRefusedSafely) {
  const std::string sound =
      Written(std::string(kShared) +
              "[entry]\n[PerspectiveModel]\nFocalLengthX: 0.4\nFocalLengthY: 0.4\n"
              "TangentialDistortParam1: 0.001\n[entry]\nFocalLength: 24\n[PerspectiveModel]\n"
              "FocalLengthX: 0.6\nFocalLengthY: 0.6\nRadialDistortParam1: -0.1\n");
  const auto replaced = [&sound](const std::string& from, const std::string& to) {
    std::string out = sound;
    for (std::size_t at = out.find(from); at != std::string::npos;
         at = out.find(from, at + to.size())) {
      out.replace(at, from.size(), to);
    }
    return out;
  };
  std::vector<std::string> hostile = {
      "",
      std::string(1, '\0'),
      "<",
      std::string(100000, '<'),
      replaced("0.4<", "1e400<"),
      replaced("0.4<", "nan<"),
      replaced("0.4<", "-inf<"),
      replaced("0.6<", "-0.6<"),
      replaced(">1<", ">99999999999999999999<"),
      replaced("<cp:Version>1", "<cp:Version>-1"),
      replaced("rdf:parseType=\"Resource\"", ""),
      replaced("</rdf:Seq>", std::string(20000, 'x') + "</rdf:Seq>"),
      "<!DOCTYPE x [<!ENTITY a \"aaaaaaaaaa\"><!ENTITY b \"&a;&a;&a;&a;&a;&a;&a;\">]>" + sound,
  };
  std::string deep = sound;
  const std::size_t body = deep.find("<cp:Make>");
  for (int i = 0; i < 5000; ++i) deep.insert(body, "<cp:Make>");
  hostile.push_back(deep);
  std::string many = sound;
  std::string items;
  for (int i = 0; i < 10001; ++i) items += "<rdf:li>x</rdf:li>";
  many.insert(many.find("</rdf:Seq>"), items);
  hostile.push_back(many);
  for (const std::string& bytes : hostile) {
    SCOPED_TRACE(bytes.substr(0, 60));
    ExpectSafe(bytes, false);
    ExpectSafe(bytes, true);
  }

  std::mt19937 random(20240611);
  for (int i = 0; i < 300; ++i) {
    std::string bytes = sound;
    switch (i % 3) {
      case 0:
        for (int flips = 1 + int(random() % 8); flips > 0; --flips) {
          bytes[random() % bytes.size()] = char(random() % 256);
        }
        break;
      case 1:
        bytes.resize(random() % bytes.size());
        break;
      default:
        for (int cuts = 1 + int(random() % 4); cuts > 0; --cuts) {
          const std::size_t at = random() % bytes.size();
          bytes.insert(at, 1, "<>\"&/:="[random() % 7]);
        }
    }
    ExpectSafe(bytes, i % 2 == 0);
  }
}

}  // namespace
}  // namespace Project::testing
