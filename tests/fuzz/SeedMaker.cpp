// Writes the seed corpora that the project's own writers make: descriptors
// and constraint blobs from actions, preferences as the filter saves them,
// photographs in every layout the host writes, and their XMP packets.
// scripts/fuzz-seeds.sh runs it over generated photographs and actions.
//
//   fuzz_seed_maker <corpus folder> <action>... -- <photograph>...
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <string>
#include <vector>

#include "framework/files/CMemoryContainer.h"
#include "host/actions/ActionFile.h"
#include "host/io/HostDocument.h"
#include "host/io/ImageFile.h"
#include "host/io/MetadataPacket.h"
#include "params/ConstraintBlob.h"
#include "params/Descriptor.h"
#include "params/PPreferences.h"

namespace {

namespace fs = std::filesystem;

fs::path corpus;

void Put(const std::string& target, const std::string& name, const void* bytes, size_t size) {
  fs::create_directories(corpus / target);
  std::ofstream out(corpus / target / name, std::ios::binary | std::ios::trunc);
  out.write(static_cast<const char*>(bytes), static_cast<std::streamsize>(size));
  if (!out) throw std::runtime_error("cannot write " + (corpus / target / name).string());
}

template <class Bytes>
void Put(const std::string& target, const std::string& name, const Bytes& bytes) {
  Put(target, name, bytes.data(), bytes.size());
}

void FromAction(const fs::path& path) {
  const std::string stem = path.stem().string();
  const Host::Descriptor descriptor = Host::ActionFile::Read(path.string());
  Put("action_file", stem + ".action", Host::ActionFile::Format(descriptor));
  Put("descriptor", stem + ".desc", descriptor.ToBytes());
  const auto* blob = descriptor.Find(Project::DescriptorKey::kConstraintData);
  if (blob != nullptr && !blob->data.empty()) {
    Put("constraint_blob", stem + ".cnsd", blob->data);
  }
}

void Preferences() {
  Project::PPreferences preferences(640);
  Tarsa::CMemoryContainer native;
  preferences.Write(native);
  std::vector<uint8_t> bytes(native.Size());
  native.SetPosition(0);
  native.Read(bytes.data(), static_cast<uint32_t>(bytes.size()));
  Put("preferences", "defaults.qmp", bytes);

  preferences.displayFlags = 1;
  preferences.windowLocation = {40, 60, 1240, 860};
  preferences.settings.lastLoadDirectory = Tarsa::CString(std::string("/home/photos/2024"));
  preferences.settings.focalLength = 14.5f;
  Tarsa::CMemoryContainer swapped;
  swapped.SetSwapBytes(true);
  preferences.Write(swapped);
  bytes.resize(swapped.Size());
  swapped.SetPosition(0);
  swapped.Read(bytes.data(), static_cast<uint32_t>(bytes.size()));
  Put("preferences", "placed-other-byte-order.qmp", bytes);
}

void Polygons() {
  Project::BlobPolygon polygon;
  polygon.points = {{10, 10}, {50, 12}, {48, 40}, {12, 38}};
  polygon.edgeKinds = {2, 3, 2, 3};
  Project::BlobLine arbitrary{5, 5, 60, 30, 4, 25.0f};
  Put("constraint_blob", "polygon-and-angled-line.cnsd",
      Project::ConstraintBlob::Encode({polygon, arbitrary}));
}

void FromPhotograph(const fs::path& path) {
  const std::string stem = path.stem().string();
  const std::string packet = Host::MetadataPacket::FromFile(path.string());
  if (!packet.empty()) Put("xmp", stem + ".xmp", packet);

  const auto document = Host::ImageFile::Read(path.string());
  const fs::path scratch = fs::temp_directory_path() / "archway-seed";
  fs::create_directories(scratch);
  const auto write = [&](const std::string& target, const std::string& name,
                         const Host::HostDocument& image, const Host::WriteOptions& options) {
    const fs::path file = scratch / name;
    if (!Host::ImageFile::WriteRefusal(image, Host::ImageFile::FormatFromName(name)).empty()) {
      return;
    }
    Host::ImageFile::Write(image, file.string(), options);
    std::ifstream in(file, std::ios::binary);
    const std::string bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    Put(target, name, bytes);
  };
  Host::WriteOptions options;
  options.tiffCompression = Host::TiffCompression::kNone;
  write("tiff", stem + ".tif", *document, options);
  options.tiffCompression = Host::TiffCompression::kLzw;
  write("tiff", stem + "-lzw.tif", *document, options);
  write("png", stem + ".png", *document, options);
  options.jpegQuality = 60;
  write("jpeg", stem + ".jpg", *document, options);
}

}  // namespace

int main(int argc, char** argv) {
  if (argc < 2) {
    std::cerr << "usage: fuzz_seed_maker <corpus folder> <action>... -- <photograph>...\n";
    return 2;
  }
  try {
    corpus = argv[1];
    bool photographs = false;
    for (int i = 2; i < argc; ++i) {
      const std::string argument = argv[i];
      if (argument == "--") {
        photographs = true;
      } else if (photographs) {
        FromPhotograph(argument);
      } else {
        FromAction(argument);
      }
    }
    Preferences();
    Polygons();
  } catch (const std::exception& error) {
    std::cerr << "fuzz_seed_maker: " << error.what() << "\n";
    return 1;
  }
  return 0;
}
