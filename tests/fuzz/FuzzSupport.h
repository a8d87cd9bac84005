#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

// What the fuzz targets share. Each target is one LLVMFuzzerTestOneInput that
// hands its input to one reader: a clear refusal (the reader's own exception
// or answer) is a pass, anything else (a crash, a sanitizer report, an
// escaped exception, a failed check) is a finding.
namespace Fuzz {

// A path under which the input can be opened, for readers that take files:
// an in-memory file, rewritten for each input, so no disk is touched.
const std::string& FileHolding(const std::uint8_t* data, std::size_t size);

// Stops the run with a message when a reader breaks a promise of its own
// (a round trip that does not come back the same).
[[noreturn]] void Broken(const char* what);

}  // namespace Fuzz
