#pragma once

#include <cstddef>
#include <cstdint>

#include "framework/files/CDirectory.h"
#include "params/PSettings.h"

namespace Project {

// The behavioural parameters file, a text file of "key=value" lines that
// tunes the solver for one run. It must be present in each run it is to act
// on; nothing writes it.
inline constexpr const char kBehaviorFileName[] = "Orvane Archway Behavioral Parameters";

// Lays the file in directory over settings. A missing or unreadable file,
// unknown keys and values out of range change nothing; nothing is reported.
void LoadBehaviorFile(PSettings& settings, const Tarsa::CDirectory& directory);

// The same over the file's bytes, which is where the line rules live: lines
// end at CR or LF; a line reaching 255 characters is dropped and what
// follows it is read as a new line.
void ApplyBehaviorText(PSettings& settings, const std::uint8_t* bytes, std::size_t size);

}  // namespace Project
