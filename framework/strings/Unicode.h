#pragma once

#include <string>
#include <string_view>

namespace Tarsa {

// Small UTF helpers for the string code. Texts inside the framework are
// UTF-8; string files arrive as UTF-16. Anything that cannot be encoded
// (a lone surrogate, a value past U+10FFFF) becomes U+FFFD, so the output
// is always well-formed UTF-8.

// Appends the UTF-8 bytes of one code point.
void AppendUtf8(std::string& out, char32_t codePoint);

// The UTF-8 form of a UTF-16 text; pairs of surrogates are joined.
std::string Utf16ToUtf8(std::u16string_view utf16);

}  // namespace Tarsa
