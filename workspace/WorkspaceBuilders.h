#pragma once

namespace Project {

// Registers the builders of the workspace's own view classes with the
// layout language, once; later calls do nothing.
void RegisterWorkspaceBuilders();

}  // namespace Project
