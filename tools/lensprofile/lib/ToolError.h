#pragma once

#include <stdexcept>
#include <string>

namespace LensTool {

// The profile writer's failure, worded for the user: a calibration text it
// cannot take, or a file it could not write.
class ToolError : public std::runtime_error {
 public:
  explicit ToolError(const std::string& problem) : std::runtime_error(problem) {}
};

}  // namespace LensTool
