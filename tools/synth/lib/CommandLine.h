#pragma once

#include <optional>
#include <string>
#include <vector>

#include "tools/synth/lib/RenderSpec.h"

namespace Synth {

// What the user asked archway-synth for, parsed from its arguments. A value.
class CommandLine {
 public:
  bool help = false;
  SceneSpec scene;
  CameraSpec camera;
  std::string output;
  std::string truth;   // empty: no ground truth file
  std::string action;  // empty: no action file
  // Absent: the lines the scene's own choice holds (see ActionWriter).
  std::optional<int> actionLines;

  // Options take their value as the next argument or after '='. Throws
  // SynthError naming the fault.
  static CommandLine Parse(const std::vector<std::string>& arguments);
  static const char* Usage();
};

}  // namespace Synth
