#include "host/platform/DynamicLibrary.h"

#include <dlfcn.h>

#include "host/io/HostError.h"

namespace Host {

std::unique_ptr<DynamicLibrary> DynamicLibrary::Open(const std::string& path) {
  // A bare name would send dlopen searching the library path; the user means
  // a file, so make it a path.
  const std::string file = path.find('/') == std::string::npos ? "./" + path : path;
  void* handle = ::dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (handle == nullptr) {
    const char* why = ::dlerror();
    throw HostError(
        path, std::string("cannot load the module: ") + (why != nullptr ? why : "unknown reason"));
  }
  return std::unique_ptr<DynamicLibrary>(new DynamicLibrary(path, handle));
}

DynamicLibrary::~DynamicLibrary() { ::dlclose(handle_); }

void* DynamicLibrary::Symbol(const std::string& name) const {
  return ::dlsym(handle_, name.c_str());
}

}  // namespace Host
