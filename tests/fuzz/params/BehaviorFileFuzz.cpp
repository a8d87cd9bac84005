// The behavioural parameters file: "key=value" lines that tune the solver.
#include <cstddef>
#include <cstdint>

#include "params/BehaviorFile.h"
#include "params/PSettings.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Project::PSettings settings(640);
  Project::ApplyBehaviorText(settings, data, size);
  // Whatever the text, the values it sets stay in their ranges.
  if (settings.meshResolution < 1 || settings.meshResolution > 19 ||
      !(settings.lineWeight > 0.0f && settings.lineWeight <= 1000.0f) ||
      !(settings.convergedMeasure > 0.0f && settings.convergedMeasure <= 1.0f)) {
    Fuzz::Broken("a behavioural value outside its range was taken");
  }
  return 0;
}
