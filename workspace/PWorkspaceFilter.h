#pragma once

#include "filter/PFilter.h"

namespace Project {

// The filter of the module as the host loads it: the filter's run with the
// workspace for its interactive branch. The module's entry makes it.
class PWorkspaceFilter : public PFilter {
 protected:
  // Opens the workspace on the run's photo and keeps it open until the user
  // closes it; true after OK, once the final image went to the host.
  bool RunDialog() override;
};

}  // namespace Project
