#pragma once

#include <cstddef>

namespace Tarsa {

class CStringTable;

// Reads a UTF-16 string file into table, replacing existing keys, so that a
// later file overrides an earlier one. One entry per line:
//
//   "$$$/Archway/Some/Key=Text with \"file\" escapes and ^n caret sequences"
//
// A leading FF FE marks little-endian and FE FF big-endian; without a mark
// the text is big-endian. Quotes and dollar signs before the key are skipped
// so the key always starts with its "/"; a trailing quote in the value is
// dropped; a backslash in the value takes the next character literally; the
// value then goes through CString::ParseEscapes. The last entry needs no line
// end. Key characters are kept as single bytes (keys are ASCII); values are
// stored as UTF-8. Any bytes at all are accepted; null or under two UTF-16
// units reads nothing.
void LoadStringFile(CStringTable& table, const void* bytes, std::size_t size);

}  // namespace Tarsa
