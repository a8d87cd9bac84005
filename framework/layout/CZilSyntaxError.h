#pragma once

#include <stdexcept>
#include <string>

namespace Tarsa {

// A fault of a layout file: what was wrong, and the line it was met on
// (counted from 1). Layout files are part of the program, so their faults
// are programming errors, and this is a logic_error like the generator's
// other checks.
class CZilSyntaxError : public std::logic_error {
 public:
  CZilSyntaxError(int line, const std::string& what)
      : std::logic_error("line " + std::to_string(line) + ": " + what), line_(line) {}

  int Line() const { return line_; }

 private:
  int line_;
};

}  // namespace Tarsa
