// archway-synth: renders the project's synthetic test photographs.
#include <cstdio>
#include <exception>
#include <string>
#include <vector>

#include "tools/synth/lib/ActionWriter.h"
#include "tools/synth/lib/CommandLine.h"
#include "tools/synth/lib/PhotoWriter.h"
#include "tools/synth/lib/Render.h"
#include "tools/synth/lib/SynthError.h"
#include "tools/synth/lib/TruthFile.h"

int main(int argc, char** argv) {
  Synth::CommandLine line;
  try {
    line = Synth::CommandLine::Parse(std::vector<std::string>(argv + 1, argv + argc));
  } catch (const Synth::SynthError& error) {
    std::fprintf(stderr, "archway-synth: %s\nTry 'archway-synth --help'.\n", error.what());
    return 2;
  }
  if (line.help) {
    std::fputs(Synth::CommandLine::Usage(), stdout);
    return 0;
  }
  try {
    const Synth::RenderResult photo = Synth::Render(line.scene, line.camera);
    Synth::PhotoWriter::Write(photo, line.camera, line.output);
    if (!line.truth.empty()) Synth::TruthFile::Write(photo, line.truth);
    if (!line.action.empty()) {
      if (line.actionLines) {
        Synth::ActionWriter::Write(photo, line.camera, *line.actionLines, line.action);
      } else {
        Synth::ActionWriter::Write(photo, line.scene, line.camera, line.action);
      }
    }
  } catch (const std::exception& error) {
    std::fprintf(stderr, "archway-synth: %s\n", error.what());
    return 1;
  }
  return 0;
}
