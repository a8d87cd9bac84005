#pragma once

#include <stdexcept>
#include <string>

namespace Measure {

// The meter's failure, worded for the user: an image it cannot read or
// judge, or a bad request.
class MeasureError : public std::runtime_error {
 public:
  explicit MeasureError(const std::string& problem) : std::runtime_error(problem) {}
};

}  // namespace Measure
