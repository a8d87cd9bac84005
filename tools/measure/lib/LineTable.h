#pragma once

#include <string>
#include <vector>

#include "tools/measure/lib/MeasuredLine.h"

namespace Measure {

// Measured lines as text: a table for people, with a summary line, or tab
// separated values with a header row for programs. Stateless.
class LineTable {
 public:
  LineTable() = delete;

  static std::string Text(const std::vector<MeasuredLine>& lines);
  // Columns: centre_x centre_y length angle width spread rms.
  static std::string Tsv(const std::vector<MeasuredLine>& lines);
};

}  // namespace Measure
