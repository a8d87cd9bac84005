#pragma once

#include <cstdint>
#include <memory>
#include <string>

namespace Host {
class HostDocument;
}

namespace Host::testing {

// What a user sees of an X window, read from the server: the window's
// pixels as an 8-bit RGB document (null when the window cannot be read),
// for tests that drive another process's windows.
std::unique_ptr<Host::HostDocument> GrabWindow(unsigned long window);

// The same, written to a PNG file as well.
std::unique_ptr<Host::HostDocument> GrabWindowPng(unsigned long window, const std::string& path);

// Asks a window to close as a window manager's close button does.
bool RequestClose(unsigned long window);

}  // namespace Host::testing
