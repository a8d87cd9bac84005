// JPEG files as the host reads them into a document.
#include <cstddef>
#include <cstdint>

#include "host/io/HostDocument.h"
#include "host/io/HostError.h"
#include "host/io/JpegFile.h"
#include "tests/fuzz/FuzzSupport.h"

// A damaged header can state any size up to the host's largest; the runs
// hold documents to 32 MiB so that a stated size is refused at once rather
// than decoded for seconds, and a reader that allocates past the limit is
// caught by the fuzzer's own allocation limit.
extern "C" int LLVMFuzzerInitialize(int*, char***) {
  Host::HostDocument::SetMemoryLimit(std::uint64_t{32} << 20);
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  try {
    Host::JpegFile::Read(Fuzz::FileHolding(data, size));
  } catch (const Host::HostError&) {
  }
  return 0;
}
