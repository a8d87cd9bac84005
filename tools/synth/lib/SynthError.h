#pragma once

#include <stdexcept>
#include <string>

namespace Synth {

// The generator's failure, worded for the user: a bad request or a file that
// could not be written.
class SynthError : public std::runtime_error {
 public:
  explicit SynthError(const std::string& problem) : std::runtime_error(problem) {}
};

}  // namespace Synth
