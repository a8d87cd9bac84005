#include "tools/measure/lib/LineTable.h"

#include <algorithm>
#include <cstdio>

namespace Measure {

std::string LineTable::Text(const std::vector<MeasuredLine>& lines) {
  std::string text = "line  centre x  centre y   length   angle  width  spread     rms\n";
  char row[128];
  double worst = 0.0;
  for (std::size_t i = 0; i < lines.size(); ++i) {
    const MeasuredLine& l = lines[i];
    std::snprintf(row, sizeof row, "%4zu %9.1f %9.1f %8.1f %7.2f %6.1f %7.2f %7.3f\n", i + 1,
                  l.centre.x, l.centre.y, l.length, l.angle, l.width, l.spread, l.rms);
    text += row;
    worst = std::max(worst, l.spread);
  }
  std::snprintf(row, sizeof row, "%zu lines, largest spread %.2f px\n", lines.size(), worst);
  return text + row;
}

std::string LineTable::Tsv(const std::vector<MeasuredLine>& lines) {
  std::string text = "centre_x\tcentre_y\tlength\tangle\twidth\tspread\trms\n";
  char row[160];
  for (const MeasuredLine& l : lines) {
    std::snprintf(row, sizeof row, "%.3f\t%.3f\t%.3f\t%.4f\t%.3f\t%.4f\t%.4f\n", l.centre.x,
                  l.centre.y, l.length, l.angle, l.width, l.spread, l.rms);
    text += row;
  }
  return text;
}

}  // namespace Measure
