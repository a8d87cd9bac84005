#pragma once

#include "framework/files/CDirectory.h"

namespace Project {

// Where the filter keeps its files between runs: three vendor and host
// levels below the user's configuration folder, each name a keyed string so
// that a host may rename it. Missing levels are made. Both forms answer false
// when the folder cannot be had, and never throw.

// Below base, which must exist.
bool GetPreferencesDirectory(const Tarsa::CDirectory& base, Tarsa::CDirectory& out);
// Below $XDG_CONFIG_HOME (else ~/.config), made when missing.
bool GetPreferencesDirectory(Tarsa::CDirectory& out);

}  // namespace Project
