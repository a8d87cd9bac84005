#include "framework/process/CObjID.h"

#include <deque>
#include <unordered_map>

namespace Tarsa {

namespace {

// Texts are kept in a deque so that the views used as keys stay valid as it
// grows. Made on first use and never destroyed, so that ids stay usable while
// static objects are torn down.
struct AtomTable {
  std::deque<std::string> texts;  // texts[i] is the text of atom i + 1
  std::unordered_map<std::string_view, std::uint32_t> atoms;
};

AtomTable& Table() {
  static AtomTable* table = new AtomTable;
  return *table;
}

}  // namespace

CObjID CObjID::Intern(std::string_view text) {
  if (text.empty()) return CObjID();
  AtomTable& table = Table();
  if (auto found = table.atoms.find(text); found != table.atoms.end()) {
    return CObjID(found->second);
  }
  table.texts.emplace_back(text);
  const auto atom = static_cast<std::uint32_t>(table.texts.size());
  table.atoms.emplace(table.texts.back(), atom);
  return CObjID(atom);
}

CObjID CObjID::Find(std::string_view text) {
  const AtomTable& table = Table();
  auto found = table.atoms.find(text);
  return found == table.atoms.end() ? CObjID() : CObjID(found->second);
}

const std::string& CObjID::Text() const {
  static const std::string empty;
  const AtomTable& table = Table();
  if (atom_ == 0 || atom_ > table.texts.size()) return empty;
  return table.texts[atom_ - 1];
}

}  // namespace Tarsa
