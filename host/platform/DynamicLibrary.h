#pragma once

#include <memory>
#include <string>

namespace Host {

// A shared library loaded into the host's process: resolved at once
// (RTLD_NOW), its symbols kept to itself (RTLD_LOCAL). Owns the loaded
// library and unloads it on destruction, so nothing taken from Symbol() may
// be used after that. The only place the host calls the dynamic loader.
class DynamicLibrary {
 public:
  // Throws HostError naming the file with the loader's reason.
  static std::unique_ptr<DynamicLibrary> Open(const std::string& path);
  ~DynamicLibrary();

  DynamicLibrary(const DynamicLibrary&) = delete;
  DynamicLibrary& operator=(const DynamicLibrary&) = delete;

  // The address of an exported symbol; null when the library has none.
  void* Symbol(const std::string& name) const;
  const std::string& Path() const { return path_; }

 private:
  DynamicLibrary(std::string path, void* handle) : path_(std::move(path)), handle_(handle) {}

  std::string path_;
  void* handle_;
};

}  // namespace Host
