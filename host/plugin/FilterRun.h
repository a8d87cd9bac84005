#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "framework/plugin/HostSuites.h"
#include "host/io/HostDocument.h"
#include "host/plugin/Descriptor.h"
#include "host/plugin/HostProperties.h"
#include "host/plugin/RunObserver.h"

namespace Host {

// One run of a filter over one document, the way the host drives it. A
// silent run sends prepare, start, continue while the filter asks for
// blocks, and finish; an interactive run sends parameters first. A selector
// that answers non-zero ends the run there: the filter has already torn
// itself down, so only a failed continue is still followed by finish. What
// the filter wrote is in the document; the caller decides whether to keep it.
// Operations only; the record lives for the run.
class FilterRun {
 public:
  enum class Kind { kSilent, kInteractive };

  struct Options {
    Kind kind = Kind::kSilent;
    HostProperties::Settings host;
    // The descriptor to replay; the filter is told there is one (`plip`).
    std::optional<Descriptor> action;
    uint32_t memoryOffer = 0;
  };

  struct Outcome {
    // kClosed: the user closed the workspace without correcting the image.
    enum class Status { kDone, kFailed, kCancelled, kClosed };
    Status status = Status::kDone;
    // For kFailed: what went wrong, in words for the user.
    std::string failure;
    // For kDone: the descriptor the filter left, if any.
    std::optional<Descriptor> descriptor;
  };

  FilterRun() = delete;

  static Outcome Run(Tarsa::HostEntryProc entry, HostDocument& document, const Options& options,
                     RunObserver& observer);

  // "parameters", "start", ...
  static const char* SelectorName(int16_t selector);
};

}  // namespace Host
