#pragma once

#include <gtest/gtest.h>

#include <string>

#include "lens/metadata/PXmpMeta.h"
#include "lens/metadata/PhotoInfo.h"

namespace Project::testing {

// Keeps the XMP toolkit open for the whole test program, as a run does.
class ToolkitEnvironment : public ::testing::Environment {
 public:
  void SetUp() override { ASSERT_TRUE(PXmpMeta::Initialize()); }
  void TearDown() override { PXmpMeta::Terminate(); }
};

// A packet written by hand: one description with the camera namespaces and
// the panorama namespace bound to their usual prefixes; attributes go on
// the description, body inside it.
inline std::string Packet(const std::string& attributes, const std::string& body = "") {
  return std::string("<?xpacket begin=\"\"?>\n") +
         "<rdf:RDF xmlns:rdf=\"http://www.w3.org/1999/02/22-rdf-syntax-ns#\">\n" +
         " <rdf:Description rdf:about=\"\"\n" + "  xmlns:tiff=\"" + PXmpMeta::TiffNamespace() +
         "\"\n" + "  xmlns:exif=\"" + PXmpMeta::ExifNamespace() + "\"\n" + "  xmlns:aux=\"" +
         PXmpMeta::ExifAuxNamespace() + "\"\n" + "  xmlns:panorama=\"" +
         PXmpMeta::kPanoramaNamespace + "\"\n  " + attributes + ">\n" + body +
         " </rdf:Description>\n</rdf:RDF>\n<?xpacket end=\"w\"?>";
}

// A photo of the given size read from a packet.
inline PhotoInfo Read(const std::string& packet, std::uint32_t width = 3000,
                      std::uint32_t height = 2000) {
  PhotoInfo info;
  info.SetImageSize(width, height);
  info.Parse(packet.data(), packet.size());
  return info;
}

}  // namespace Project::testing
