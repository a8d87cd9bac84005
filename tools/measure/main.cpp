// archway-measure: finds the dark lines of an image and says how straight
// each is; or puts two images side by side.
#include <charconv>
#include <cstdio>
#include <exception>
#include <string>
#include <vector>

#include "host/io/ImageFile.h"
#include "tools/measure/lib/FindLines.h"
#include "tools/measure/lib/LineTable.h"
#include "tools/measure/lib/MeasureError.h"
#include "tools/measure/lib/SideBySide.h"

namespace {

constexpr const char* kUsage = R"(Usage: archway-measure [options] IMAGE
       archway-measure --side-by-side BEFORE AFTER -o OUTPUT

Finds every dark line of an image on a plain light ground (as archway-synth's
segments scene paints them), leaving out blobs that touch the image's border
or the black outside of a corrected picture, and prints per line its centre,
length, angle (degrees, 0 horizontal, 90 vertical), width and straightness:
the spread (largest less smallest distance of its centreline from the fitted
line, in pixels) and the root mean square of those distances.

  --tsv                 tab-separated values with a header row instead
  --min-pixels N        smaller blobs are specks (40)
  --min-length L        shorter blobs are specks, in pixels (20)
  --side-by-side A B    write A and B side by side, at the shorter one's
                        height with a thin light gap, to OUTPUT (-o)
  -h, --help            this text
)";

int Usage(const std::string& problem) {
  std::fprintf(stderr, "archway-measure: %s\nTry 'archway-measure --help'.\n", problem.c_str());
  return 2;
}

bool ParseNumber(const std::string& text, double* value) {
  const char* end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, *value);
  return !text.empty() && error == std::errc() && stop == end;
}

}  // namespace

int main(int argc, char** argv) {
  const std::vector<std::string> arguments(argv + 1, argv + argc);
  bool tsv = false;
  std::vector<std::string> sides;
  std::string output;
  std::vector<std::string> images;
  Measure::FindOptions options;
  for (std::size_t i = 0; i < arguments.size(); ++i) {
    const std::string& option = arguments[i];
    const auto value = [&]() -> const std::string* {
      return i + 1 < arguments.size() ? &arguments[++i] : nullptr;
    };
    if (option == "-h" || option == "--help") {
      std::fputs(kUsage, stdout);
      return 0;
    } else if (option == "--tsv") {
      tsv = true;
    } else if (option == "--min-pixels" || option == "--min-length") {
      const std::string* text = value();
      double number = 0.0;
      if (!text || !ParseNumber(*text, &number) || number < 0) {
        return Usage(option + " needs a number");
      }
      if (option == "--min-pixels") {
        options.minimumPixels = static_cast<int>(number);
      } else {
        options.minimumLength = number;
      }
    } else if (option == "--side-by-side") {
      for (int k = 0; k < 2; ++k) {
        const std::string* path = value();
        if (!path) return Usage("--side-by-side needs two images");
        sides.push_back(*path);
      }
    } else if (option == "-o" || option == "--output") {
      const std::string* path = value();
      if (!path) return Usage(option + " needs a file");
      output = *path;
    } else if (!option.empty() && option[0] == '-') {
      return Usage("unknown option '" + option + "'");
    } else {
      images.push_back(option);
    }
  }
  if (!sides.empty() ? (output.empty() || !images.empty()) : images.size() != 1) {
    return Usage(sides.empty() ? "give one image to measure"
                               : "--side-by-side takes two images and -o OUTPUT only");
  }

  try {
    if (!sides.empty()) {
      const auto before = Host::ImageFile::Read(sides[0]);
      const auto after = Host::ImageFile::Read(sides[1]);
      Host::ImageFile::Write(*Measure::SideBySide::Compose(*before, *after), output);
      return 0;
    }
    const auto image = Host::ImageFile::Read(images[0]);
    const std::vector<Measure::MeasuredLine> lines = Measure::FindLines(*image, options);
    const std::string table =
        tsv ? Measure::LineTable::Tsv(lines) : Measure::LineTable::Text(lines);
    std::fputs(table.c_str(), stdout);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "archway-measure: %s\n", error.what());
    return 1;
  }
  return 0;
}
