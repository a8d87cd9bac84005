#pragma once

#include <optional>
#include <string>
#include <string_view>

// Text rules of the OpenGL manager, kept apart from the context so that they
// can be checked without one.
namespace Project {

// The version in a GL_VERSION text: the text before the first '.' is the major
// number and the text up to the second '.' the minor one, each read as atoi
// reads (leading digits, else 0). The end of the text counts as a '.', so
// "3" is 3.0 and "" is 0.0.
void ParseOpenGLVersion(std::string_view text, int& major, int& minor);

// Where the fragment shader lies for a host executable at executablePath: the
// last 14 characters ('/' and the host's 13-character name) are cut and
// "/Required/ArchwayFragmentShader.fsh" appended. A plain cut, no search for
// the separator. Nothing when the path is too long for the host's 255-character
// buffer or too short to cut.
std::optional<std::string> ShaderPathFromExecutable(std::string_view executablePath);

}  // namespace Project
