#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <random>
#include <string>

#include "framework/plugin/HostSuites.h"
#include "host/actions/ActionFile.h"
#include "host/actions/Base64.h"
#include "host/io/HostError.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

using Tarsa::FourCC;

TEST(ActionFileTest, WritesTheDocumentedText) {
  Descriptor descriptor;
  descriptor.PutInteger(FourCC("actV"), 0);
  descriptor.PutEnumerated(FourCC("prjM"), FourCC("prjM"), FourCC("fisP"));
  descriptor.PutFloat(FourCC("focL"), 0.1);
  descriptor.PutData(FourCC("cnsD"), std::vector<uint8_t>{'L', 'i', 'n', 'e'});
  descriptor.PutData(FourCC("none"), {});
  EXPECT_EQ(ActionFile::Format(descriptor),
            "archway-action 1\n"
            "actV integer 0\n"
            "prjM enumerated prjM fisP\n"
            "focL float 0.1\n"
            "cnsD data 4 TGluZQ==\n"
            "none data 0\n");
}

TEST(ActionFileTest, EveryValueRoundTripsExactlyThroughAFile) {
  Descriptor descriptor;
  descriptor.PutInteger(FourCC("min "), std::numeric_limits<int32_t>::min());
  descriptor.PutInteger(FourCC("max "), std::numeric_limits<int32_t>::max());
  const double floats[] = {0.1,
                           -0.0,
                           1.0 / 3.0,
                           4.9e-324,
                           std::numeric_limits<double>::max(),
                           -std::numeric_limits<double>::infinity(),
                           1e21,
                           123456789.125};
  uint32_t key = FourCC("f000");
  for (double value : floats) descriptor.PutFloat(key++, value);
  // Codes that cannot stand as four plain characters.
  descriptor.PutEnumerated(FourCC("#hsh"), FourCC("Rds "), 0x00010203);
  std::vector<uint8_t> all(256);
  for (int i = 0; i < 256; ++i) all[i] = static_cast<uint8_t>(i);
  descriptor.PutData(FourCC("cnsD"), all);

  testing::ScratchFolder folder;
  const std::string path = folder.File("correction.action");
  ActionFile::Write(descriptor, path);
  EXPECT_EQ(ActionFile::Read(path), descriptor);
  EXPECT_EQ(folder.Listing(), "correction.action\n");  // no temporary left behind
}

TEST(ActionFileTest, DamagedFilesNameTheLine) {
  struct Case {
    const char* text;
    int line;
  };
  const Case cases[] = {
      {"archway-action 2\n", 1},
      {"\nactV integer 0\n", 1},
      {"archway-action 1\nactV integer 0\nfocL double 1.5\n", 3},
      {"archway-action 1\n# comment\n\nactV integer 2147483648\n", 4},
      {"archway-action 1\nactV integer 0x10\n", 2},
      {"archway-action 1\nfocL float 1.5e\n", 2},
      {"archway-action 1\nfocL float\n", 2},
      {"archway-action 1\nprjM enumerated prjM\n", 2},
      {"archway-action 1\nprjM enumerated prjM fisheye\n", 2},
      {"archway-action 1\ncnsD data 5 TGluZQ==\n", 2},
      {"archway-action 1\ncnsD data 4 TGlu ZQ==\n", 2},
      {"archway-action 1\ncnsD data 4 TGluZQ=\n", 2},
      {"archway-action 1\ncnsD data 4\n", 2},
      {"archway-action 1\nactV integer 0\r\nactV integer 1\n", 3},
      {"archway-action 1\nactVx integer 0\n", 2},
      {"archway-action 1\nactV\n", 2},
  };
  for (const Case& c : cases) {
    try {
      ActionFile::Parse(c.text);
      ADD_FAILURE() << "accepted: " << c.text;
    } catch (const HostError& error) {
      EXPECT_TRUE(std::string(error.what()).starts_with("line " + std::to_string(c.line) + ": "))
          << c.text << " -> " << error.what();
    }
  }
  EXPECT_THROW(ActionFile::Parse(""), HostError);

  // Cut anywhere, then a byte spoiled: parsed or refused, never a crash.
  const std::string whole = "archway-action 1\nfocL float 0.1\ncnsD data 4 TGluZQ==\n";
  std::mt19937 random(77);
  for (size_t length = 0; length <= whole.size(); ++length) {
    std::string bytes = whole.substr(0, length);
    for (int spoilt = 0; spoilt < 2; ++spoilt) {
      try {
        ActionFile::Parse(bytes);
      } catch (const HostError&) {
      }
      if (!bytes.empty()) bytes[random() % bytes.size()] = static_cast<char>(random());
    }
  }
}

TEST(ActionFileTest, ReadingNamesTheFile) {
  testing::ScratchFolder folder;
  const std::string path = folder.File("bad.action");
  testing::WriteBytes(path, "archway-action 1\nactV integer zero\n");
  for (const std::string& file : {path, folder.File("missing.action")}) {
    try {
      ActionFile::Read(file);
      ADD_FAILURE() << file;
    } catch (const HostError& error) {
      EXPECT_EQ(error.Path(), file);
    }
  }
}

TEST(Base64Test, StandardVectorsAndStrictDecoding) {
  const std::pair<std::string, std::string> vectors[] = {
      {"", ""},
      {"f", "Zg=="},
      {"fo", "Zm8="},
      {"foo", "Zm9v"},
      {"foob", "Zm9vYg=="},
      {"fooba", "Zm9vYmE="},
      {"foobar", "Zm9vYmFy"},
  };
  for (const auto& [plain, encoded] : vectors) {
    const std::vector<uint8_t> bytes(plain.begin(), plain.end());
    EXPECT_EQ(Base64::Encode(bytes), encoded);
    EXPECT_EQ(Base64::Decode(encoded), bytes);
  }
  for (const char* bad : {"Zg=", "Zh==", "Zm9=", "Zg==Zg==", "Zm9v\n", "Z===", "Zm9*"}) {
    EXPECT_FALSE(Base64::Decode(bad).has_value()) << bad;
  }
}

}  // namespace
}  // namespace Host
