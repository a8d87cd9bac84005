#include "lens/metadata/PXmpMeta.h"

#include <exempi/xmp.h>
#include <exempi/xmpconsts.h>

#include <cstring>
#include <string_view>

namespace Project {

namespace {

// The toolkit's string, freed with its scope.
class ToolkitString {
 public:
  ToolkitString() : string_(xmp_string_new()) {}
  ~ToolkitString() {
    if (string_ != nullptr) xmp_string_free(string_);
  }
  ToolkitString(const ToolkitString&) = delete;
  ToolkitString& operator=(const ToolkitString&) = delete;

  XmpStringPtr Get() const { return string_; }
  std::string Text() const {
    const char* text = xmp_string_cstr(string_);
    return text != nullptr ? std::string(text, xmp_string_len(string_)) : std::string();
  }

 private:
  XmpStringPtr string_;
};

XmpPtr Meta(void* meta) { return static_cast<XmpPtr>(meta); }

// The offset just past the first `end` at or after `from`; npos when there
// is none.
std::size_t SkipPast(std::string_view text, std::size_t from, std::string_view end) {
  const std::size_t found = text.find(end, from);
  return found == std::string_view::npos ? found : found + end.size();
}

}  // namespace

bool PXmpMeta::Initialize() {
  try {
    return xmp_init();
  } catch (...) {
    return false;
  }
}

void PXmpMeta::Terminate() {
  try {
    xmp_terminate();
  } catch (...) {
  }
}

const char* PXmpMeta::TiffNamespace() { return NS_TIFF; }
const char* PXmpMeta::ExifNamespace() { return NS_EXIF; }
const char* PXmpMeta::ExifAuxNamespace() { return NS_EXIF_AUX; }

bool PXmpMeta::RegisterNamespace(const char* uri, const char* prefix) {
  try {
    ToolkitString registered;
    return registered.Get() != nullptr && xmp_register_namespace(uri, prefix, registered.Get());
  } catch (...) {
    return false;
  }
}

bool PXmpMeta::NestsWithin(const char* bytes, std::size_t size, int maxDepth) {
  const std::string_view text(bytes, size);
  constexpr auto npos = std::string_view::npos;
  int depth = 0;
  std::size_t at = 0;
  while ((at = text.find('<', at)) != npos) {
    const std::string_view rest = text.substr(at);
    if (rest.starts_with("<!--")) {
      at = SkipPast(text, at + 4, "-->");
    } else if (rest.starts_with("<![CDATA[")) {
      at = SkipPast(text, at + 9, "]]>");
    } else if (rest.starts_with("<!")) {
      // Document types and entities, whose expansion could hide elements
      // from this scan, have no place in XMP.
      return false;
    } else if (rest.starts_with("<?")) {
      at = SkipPast(text, at + 2, "?>");
    } else if (rest.starts_with("</")) {
      if (depth > 0) --depth;
      at = SkipPast(text, at + 2, ">");
    } else {
      // An opening tag: to its '>', past quoted attribute values.
      std::size_t end = at + 1;
      while (end < text.size() && text[end] != '>') {
        if (text[end] == '"' || text[end] == '\'') {
          end = text.find(text[end], end + 1);
          if (end == npos) return true;  // the rest is one unterminated value
        }
        ++end;
      }
      if (end >= text.size()) return true;
      if (text[end - 1] != '/' && ++depth > maxDepth) return false;
      at = end + 1;
    }
    if (at == npos) return true;
  }
  return true;
}

PXmpMeta::PXmpMeta(const char* bytes, std::size_t size) {
  if (bytes == nullptr) return;
  while (size > 0 && bytes[size - 1] == '\0') --size;
  // A NUL inside is no UTF-8 text (UTF-16 and UTF-32 packets among them),
  // which the depth scan could not read.
  if (size == 0 || size > kMaxSize || std::memchr(bytes, '\0', size) != nullptr) return;
  if (!NestsWithin(bytes, size, kMaxDepth)) return;
  try {
    meta_ = xmp_new(bytes, size);
  } catch (...) {
    meta_ = nullptr;
  }
}

PXmpMeta::~PXmpMeta() {
  if (meta_ == nullptr) return;
  try {
    xmp_free(Meta(meta_));
  } catch (...) {
  }
}

std::int32_t PXmpMeta::CountArrayItems(const char* ns, const char* name) const {
  if (meta_ == nullptr) return 0;
  try {
    ToolkitString item;
    if (item.Get() == nullptr) return 0;
    std::int32_t count = 0;
    while (count < INT32_MAX &&
           xmp_get_array_item(Meta(meta_), ns, name, count + 1, item.Get(), nullptr)) {
      ++count;
    }
    return count;
  } catch (...) {
    return 0;
  }
}

std::string PXmpMeta::ComposeArrayItemPath(const char*, const char* arrayName, std::int32_t index) {
  if (arrayName == nullptr || index < 1) return {};
  return std::string(arrayName) + "[" + std::to_string(index) + "]";
}

std::string PXmpMeta::ComposeStructFieldPath(const char*, const char* structName,
                                             const char* fieldNs, const char* fieldName) {
  if (structName == nullptr || fieldNs == nullptr || fieldName == nullptr) return {};
  try {
    ToolkitString prefix;
    // The toolkit answers the prefix with its colon.
    if (prefix.Get() == nullptr || !xmp_namespace_prefix(fieldNs, prefix.Get())) return {};
    return std::string(structName) + "/" + prefix.Text() + fieldName;
  } catch (...) {
    return {};
  }
}

bool PXmpMeta::GetArrayItem(const char* ns, const char* name, std::int32_t index,
                            std::string& out) const {
  if (meta_ == nullptr || index < 1) return false;
  try {
    ToolkitString value;
    if (value.Get() == nullptr ||
        !xmp_get_array_item(Meta(meta_), ns, name, index, value.Get(), nullptr)) {
      return false;
    }
    out = value.Text();
    return true;
  } catch (...) {
    return false;
  }
}

bool PXmpMeta::GetProperty(const char* ns, const char* name, std::string& out) const {
  if (meta_ == nullptr) return false;
  try {
    ToolkitString value;
    if (value.Get() == nullptr || !xmp_get_property(Meta(meta_), ns, name, value.Get(), nullptr)) {
      return false;
    }
    out = value.Text();
    return true;
  } catch (...) {
    return false;
  }
}

bool PXmpMeta::GetProperty_Bool(const char* ns, const char* name, bool& out) const {
  if (meta_ == nullptr) return false;
  try {
    bool value = false;
    if (!xmp_get_property_bool(Meta(meta_), ns, name, &value, nullptr)) return false;
    out = value;
    return true;
  } catch (...) {
    return false;
  }
}

bool PXmpMeta::GetProperty_Float(const char* ns, const char* name, double& out) const {
  if (meta_ == nullptr) return false;
  try {
    double value = 0;
    if (!xmp_get_property_float(Meta(meta_), ns, name, &value, nullptr)) return false;
    out = value;
    return true;
  } catch (...) {
    return false;
  }
}

bool PXmpMeta::GetProperty_Int(const char* ns, const char* name, std::int32_t& out) const {
  if (meta_ == nullptr) return false;
  try {
    std::int32_t value = 0;
    if (!xmp_get_property_int32(Meta(meta_), ns, name, &value, nullptr)) return false;
    out = value;
    return true;
  } catch (...) {
    return false;
  }
}

}  // namespace Project
