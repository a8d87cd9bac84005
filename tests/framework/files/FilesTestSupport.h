#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <string>
#include <system_error>
#include <vector>

#include "framework/core/CException.h"

namespace Tarsa::testing {

using Bytes = std::vector<std::uint8_t>;

constexpr const char* kEndOfData =
    "$$$/Tarsa/Container/Error/EndOfData=The end of data was reached while reading from a "
    "container.";

// Whether action fails with a CError worded exactly text.
inline bool FailsWith(const char* text, const std::function<void()>& action) {
  try {
    action();
  } catch (const CError& e) {
    return e.ErrorText() == text;
  }
  return false;
}

// The code of the CSystemError that action raises; 0 when it raises none.
inline int SystemCode(const std::function<void()>& action) {
  try {
    action();
  } catch (const CSystemError& e) {
    return e.Code();
  }
  return 0;
}

// A fresh folder under the temporary directory for one test, removed with
// all it holds when the test ends. Files are made and read here through the
// standard library, independently of the code under test.
class TempFolder {
 public:
  TempFolder() {
    const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
    const std::filesystem::path base = std::filesystem::temp_directory_path();
    const std::string stem =
        std::string("archway_files_") + info->test_suite_name() + "_" + info->name() + "_";
    for (int n = 0;; ++n) {
      path_ = base / (stem + std::to_string(n));
      if (std::filesystem::create_directory(path_)) break;
    }
  }
  ~TempFolder() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
  }
  TempFolder(const TempFolder&) = delete;
  TempFolder& operator=(const TempFolder&) = delete;

  // The folder's path with its trailing '/', and paths inside it.
  std::string Dir() const { return path_.string() + "/"; }
  std::string Path(const std::string& name) const { return Dir() + name; }

  void WriteBytes(const std::string& name, const Bytes& bytes) const {
    std::ofstream out(Path(name), std::ios::binary | std::ios::trunc);
    out.write(reinterpret_cast<const char*>(bytes.data()),
              static_cast<std::streamsize>(bytes.size()));
  }
  Bytes ReadBytes(const std::string& name) const {
    std::ifstream in(Path(name), std::ios::binary);
    return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
  }

 private:
  std::filesystem::path path_;
};

}  // namespace Tarsa::testing
