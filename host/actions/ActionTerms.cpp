#include "host/actions/ActionTerms.h"

#include <cmath>
#include <utility>

#include "framework/resource/FourCharCode.h"

namespace Host {

namespace {

using Type = Descriptor::Type;

// The default text of a keyed framework string ("$$$/key=Default").
std::string Plain(const std::string& keyed) {
  if (!keyed.starts_with("$$$/")) return keyed;
  const size_t equals = keyed.find('=');
  return equals == std::string::npos ? keyed : keyed.substr(equals + 1);
}

// Appended in place: g++ 12 at -O3 warns of overlapping copies (falsely)
// when a quote is put in front of a temporary string.
std::string Quoted(uint32_t code) {
  std::string text(1, '\'');
  text.append(Tarsa::FourCharText(code)).append(1, '\'');
  return text;
}

}  // namespace

ActionTerms::ActionTerms(Tarsa::CTerminology terminology) : terminology_(std::move(terminology)) {}

std::string ActionTerms::Refusal(const Descriptor::Item& item) const {
  const Tarsa::CTerminology::Parameter* parameter = terminology_.FindParameter(item.key);
  if (parameter == nullptr) return {};
  const std::string what = Quoted(item.key) + " (" + Plain(parameter->name) + ")";
  const Tarsa::CTerminology::Enumeration* enumeration =
      terminology_.FindEnumeration(parameter->type);
  if (enumeration != nullptr) {
    if (item.type != Type::kEnumerated || item.enumType != parameter->type) {
      return what + " takes an enumerated value of type " + Quoted(parameter->type);
    }
    // Which values the module reads is its own affair: a stored action may
    // carry one the terminology does not offer.
    return {};
  }
  const auto declared = static_cast<Type>(parameter->type);
  switch (declared) {
    case Type::kInteger:
    case Type::kFloat:
    case Type::kData:
      if (item.type != declared) {
        return what + " takes " + (declared == Type::kData ? "" : "a ") +
               Descriptor::TypeName(declared) + ", not " + Descriptor::TypeName(item.type);
      }
      break;
    case Type::kEnumerated:
      break;
  }
  if (item.type == Type::kFloat && !std::isfinite(item.number)) {
    return what + " must be a finite number";
  }
  return {};
}

}  // namespace Host
