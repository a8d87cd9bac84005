#pragma once

#include <bitset>
#include <string>
#include <vector>

#include "host/io/ImageMode.h"

namespace Host {

// A filter's enable expression: the image modes the host may offer it for.
// The form filters use is a membership test of the document's mode,
//
//   in (QMARK_ImageMode, GrayScaleMode, Gray16Mode, RGBMode, ...)
//
// with the host's mode names. A name ending in "Mode" that the host does not
// know stands for a mode it never holds and allows nothing; any other text is
// an error. A value; holds the set of allowed mode numbers.
class EnableExpression {
 public:
  // Throws HostError saying where the text goes wrong.
  static EnableExpression Parse(const std::string& text);

  bool Allows(ImageMode mode) const;
  // The host's modes it allows, in mode number order.
  std::vector<ImageMode> AllowedModes() const;

  // The mode of a name in the expression; 0 when the host has no such name.
  static int ModeNamed(const std::string& name);

 private:
  std::bitset<32> modes_;
};

}  // namespace Host
