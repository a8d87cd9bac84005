#pragma once

#include <stdlib.h>

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <optional>
#include <set>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace TestSupport {

using Bytes = std::vector<std::uint8_t>;

// A whole file's bytes, and a file made of bytes, through the standard
// library: independent of the code under test.
inline std::string ReadBytes(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}
inline void WriteBytes(const std::string& path, std::string_view bytes) {
  std::ofstream(path, std::ios::binary | std::ios::trunc)
      .write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
}

// A fresh folder under the temporary directory, removed with all it holds
// when the object goes. Its name is unique, so programs running side by side
// never meet.
class ScratchFolder {
 public:
  ScratchFolder() {
    std::string pattern = std::filesystem::temp_directory_path() / "archway_XXXXXX";
    if (mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("mkdtemp failed");
    path_ = pattern;
  }
  ~ScratchFolder() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
  }
  ScratchFolder(const ScratchFolder&) = delete;
  ScratchFolder& operator=(const ScratchFolder&) = delete;

  // The folder with its trailing '/', and a path inside it.
  std::string Dir() const { return path_ + "/"; }
  std::string File(const std::string& name) const { return Dir() + name; }
  // The entry names, sorted, one per line.
  std::string Listing() const {
    std::set<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(path_)) {
      names.insert(entry.path().filename().string());
    }
    std::string listing;
    for (const std::string& name : names) listing += name + "\n";
    return listing;
  }
  void Put(const std::string& name, std::string_view bytes) const { WriteBytes(File(name), bytes); }
  void Put(const std::string& name, const Bytes& bytes) const {
    Put(name, std::string_view(reinterpret_cast<const char*>(bytes.data()), bytes.size()));
  }
  Bytes Get(const std::string& name) const {
    const std::string bytes = ReadBytes(File(name));
    return {bytes.begin(), bytes.end()};
  }

 private:
  std::string path_;
};

// Sets an environment variable (null: unsets it) for the object's life, then
// puts the old value back.
class ScopedEnvironment {
 public:
  ScopedEnvironment(const char* name, const char* value) : name_(name) {
    if (const char* old = std::getenv(name)) old_ = old;
    Set(value);
  }
  ~ScopedEnvironment() { Set(old_ ? old_->c_str() : nullptr); }
  ScopedEnvironment(const ScopedEnvironment&) = delete;
  ScopedEnvironment& operator=(const ScopedEnvironment&) = delete;

 private:
  void Set(const char* value) {
    if (value != nullptr) {
      setenv(name_, value, 1);
    } else {
      unsetenv(name_);
    }
  }
  const char* name_;
  std::optional<std::string> old_;
};

}  // namespace TestSupport
