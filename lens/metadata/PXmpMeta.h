#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace Project {

// One parsed XMP packet, read through the XMP toolkit: plain, typed, array
// and struct properties by namespace URI and name. The only place that
// talks to the toolkit. Nothing here throws or fails loudly: a packet that
// cannot be parsed reads as empty, and a property whose reading fails in the
// toolkit (absent, wrong type, bad text) is absent. Packets that could
// exhaust the toolkit's recursive parser (too deep) or memory (too large)
// are refused before it sees them. The toolkit must be open (Initialize)
// for the object's whole life.
class PXmpMeta {
 public:
  // The project's own namespaces, named by their paths under its URI host.
  static constexpr const char* kQuillmarkNamespace = "http://ns.archway.invalid/quillmark/1.0/";
  static constexpr const char* kCameraProfileNamespace =
      "http://ns.archway.invalid/quillmark/1.0/camera-profile/";
  static constexpr const char* kPanoramaNamespace =
      "http://ns.archway.invalid/quillmark/1.0/panorama-profile/";

  // Real XMP nests about ten elements deep and fits in a few megabytes.
  static constexpr int kMaxDepth = 256;
  static constexpr std::size_t kMaxSize = std::size_t(16) << 20;

  // The toolkit's life, counted: every successful Initialize is paired with
  // one Terminate.
  static bool Initialize();
  static void Terminate();

  // The standard camera namespaces, as the toolkit names them.
  static const char* TiffNamespace();
  static const char* ExifNamespace();
  static const char* ExifAuxNamespace();

  // Registers uri under the suggested prefix (the toolkit may choose
  // another when that one is taken); true when the uri is registered after.
  static bool RegisterNamespace(const char* uri, const char* prefix);

  // Parses size bytes of a packet; trailing NUL bytes are ignored.
  PXmpMeta(const char* bytes, std::size_t size);
  ~PXmpMeta();
  PXmpMeta(const PXmpMeta&) = delete;
  PXmpMeta& operator=(const PXmpMeta&) = delete;

  bool IsParsed() const { return meta_ != nullptr; }

  // Items of an array property; 0 when absent or not an array.
  std::int32_t CountArrayItems(const char* ns, const char* name) const;
  // "name[index]" for index from 1; empty for a smaller index.
  static std::string ComposeArrayItemPath(const char* ns, const char* arrayName,
                                          std::int32_t index);
  // "structName/prefix:fieldName"; empty when fieldNs is not registered.
  static std::string ComposeStructFieldPath(const char* ns, const char* structName,
                                            const char* fieldNs, const char* fieldName);

  // Each answers true when the property is present and readable as asked;
  // out is untouched otherwise. Items count from 1.
  bool GetArrayItem(const char* ns, const char* name, std::int32_t index, std::string& out) const;
  bool GetProperty(const char* ns, const char* name, std::string& out) const;
  bool GetProperty_Bool(const char* ns, const char* name, bool& out) const;
  bool GetProperty_Float(const char* ns, const char* name, double& out) const;
  bool GetProperty_Int(const char* ns, const char* name, std::int32_t& out) const;

  // Whether the packet's elements nest at most maxDepth deep, by a scan of
  // its tags (comments, CDATA, processing instructions and quoted attribute
  // values skipped). Malformed text may be overestimated, never under.
  static bool NestsWithin(const char* bytes, std::size_t size, int maxDepth);

 private:
  void* meta_ = nullptr;  // the toolkit's packet object
};

}  // namespace Project
