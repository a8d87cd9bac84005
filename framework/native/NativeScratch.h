#pragma once

#include <string>

// Scratch files: files of the program's own that nobody else may meet.
namespace Tarsa::Native {

// Makes a new empty file (mode 0600) in directory, named prefix, six
// characters chosen to be unique there, and suffix; returns its path. Never
// opens an existing file. Failures are CSystemError with errno.
std::string CreateUniqueFile(const std::string& directory, const std::string& prefix,
                             const std::string& suffix);

}  // namespace Tarsa::Native
