#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace Tarsa::testing {

using Bytes = std::vector<std::uint8_t>;

// A whole file's bytes, and a file made of bytes, through the standard
// library: independent of the code under test.
std::string ReadBytes(const std::string& path);
void WriteBytes(const std::string& path, std::string_view bytes);

// A fresh folder under the temporary directory, removed with all it holds
// when the object goes. Its name is unique, so programs running side by side
// never meet.
class ScratchFolder {
 public:
  ScratchFolder();
  ~ScratchFolder();
  ScratchFolder(const ScratchFolder&) = delete;
  ScratchFolder& operator=(const ScratchFolder&) = delete;

  // The folder with its trailing '/', and a path inside it.
  std::string Dir() const { return path_ + "/"; }
  std::string File(const std::string& name) const { return Dir() + name; }
  // The entry names, sorted, one per line.
  std::string Listing() const;
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
  ScopedEnvironment(const char* name, const char* value);
  ~ScopedEnvironment();
  ScopedEnvironment(const ScopedEnvironment&) = delete;
  ScopedEnvironment& operator=(const ScopedEnvironment&) = delete;

 private:
  void Set(const char* value);
  const char* name_;
  std::optional<std::string> old_;
};

}  // namespace Tarsa::testing
