// A filter module for the host's tests: shaped like the real one (the same
// property list in its resource section, one exported EntryFI) but with a
// run that is fully known. Its start refuses the host version and a missing
// graphics processor as the real module does, then inverts the colour
// planes through the channel ports and the advance protocol, and leaves a
// descriptor that counts its runs. Keys in the descriptor it is given steer
// it: 'fail' makes start fail, 'intr' raises SIGINT and waits for the abort.

#include <csignal>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <vector>

#include "framework/plugin/HostSuites.h"

using namespace Tarsa;

namespace {

struct Image {
  int32_t width = 0;
  int32_t height = 0;
  int planes = 0;
  int bytes = 1;
  std::vector<uint8_t> samples;  // planar
};

const void* Suite(HostFilterRecord* record, const char* name, int32_t version) {
  const void* suite = nullptr;
  auto* access = static_cast<HostSuiteAccess*>(record->suiteAccess);
  return access->acquire(name, version, &suite) == 0 ? suite : nullptr;
}

intptr_t Property(HostFilterRecord* record, const char (&key)[5]) {
  auto* procs = static_cast<HostPropertyProcs*>(record->propertyProcs);
  intptr_t value = 0;
  if (procs->getProperty(kHostSignature, FourCC(key), 0, &value, nullptr) != 0) return -1;
  return value;
}

bool ReadImage(HostFilterRecord* record, Image& image) {
  const auto* ports =
      static_cast<const HostChannelPortsSuite*>(Suite(record, kChannelPortsSuite, 3));
  if (ports == nullptr) return false;
  auto* info = static_cast<HostDocumentInfo*>(record->documentInfo);
  const HostRect32 all = {0, 0, image.height, image.width};
  const size_t planeSize = size_t(image.width) * image.height * image.bytes;
  image.samples.resize(planeSize * image.planes);
  int plane = 0;
  for (HostChannelNode* node = info->targetCompositeChannels; node != nullptr; node = node->next) {
    HostPixelMemoryDesc desc = {image.samples.data() + plane * planeSize,
                                image.width * image.bytes * 8, image.bytes * 8, 0, image.bytes * 8};
    if (ports->readPixelsFromLevel(node->port, 0, &desc, &all) != 0) return false;
    ++plane;
  }
  return plane == image.planes;
}

// Writes rows [top, bottom) through one advance; the host takes the block
// back at the next advance.
bool WriteRows(HostFilterRecord* record, const Image& image, int32_t top, int32_t bottom) {
  record->coordinates32->outRect = {top, 0, bottom, image.width};
  record->outFirstPlane = 0;
  record->outLastPlane = static_cast<int16_t>(image.planes - 1);
  if (record->advanceCallback() != 0 || record->outData == nullptr) return false;
  const size_t planeSize = size_t(image.width) * image.height * image.bytes;
  for (int32_t y = top; y < bottom; ++y) {
    auto* row = static_cast<uint8_t*>(record->outData) + size_t(y - top) * record->outRowBytes;
    for (int32_t x = 0; x < image.width; ++x) {
      for (int p = 0; p < image.planes; ++p) {
        std::memcpy(
            row + (size_t(x) * image.planes + p) * image.bytes,
            image.samples.data() + p * planeSize + (size_t(y) * image.width + x) * image.bytes,
            image.bytes);
      }
    }
  }
  return true;
}

int16_t Start(HostFilterRecord* record) {
  if ((Property(record, "vers") >> 16) != 18) {
    std::fputs("This feature is not supported by the current version of Quillmark.\n", stderr);
    return 1;
  }
  const intptr_t gpu = Property(record, "GPUF");
  if (gpu < 0 || (gpu & 0x80) == 0) {
    std::fputs("This feature requires graphics processor acceleration.\n", stderr);
    return 1;
  }
  const auto* descriptors =
      static_cast<const HostDescriptorSuite*>(Suite(record, kDescriptorSuite, 5));
  if (descriptors == nullptr) return 1;
  auto* script = static_cast<HostScriptBlock*>(record->scriptBlock);
  const intptr_t replay = Property(record, "plip");
  int32_t runs = 0;
  if (replay == 1) {
    HostDescriptor in = nullptr;
    if (descriptors->fromHandle(script->descriptor, &in) != 0) return 1;
    descriptors->getInteger(in, FourCC("runs"), &runs);
    int32_t flag = 0;
    const bool fail = descriptors->getInteger(in, FourCC("fail"), &flag) == 0;
    const bool interrupt = descriptors->getInteger(in, FourCC("intr"), &flag) == 0;
    descriptors->free(in);
    if (fail) {
      std::fputs("fake module: told to fail\n", stderr);
      return 1;
    }
    if (interrupt) {
      std::raise(SIGINT);
      return record->abortCallback() != 0 ? 1 : 0;
    }
  }

  record->coordinates32->enabled = 1;
  Image image;
  image.width = record->coordinates32->imageWidth;
  image.height = record->coordinates32->imageHeight;
  const int16_t mode = record->imageMode;
  image.bytes = mode >= 10 ? 2 : 1;
  image.planes = (mode == 4 || mode == 13) ? 4 : (mode == 1 || mode == 10) ? 1 : 3;
  if (!ReadImage(record, image)) return 1;
  const size_t count = image.samples.size() / image.bytes;
  for (size_t i = 0; i < count; ++i) {
    if (image.bytes == 1) {
      image.samples[i] = static_cast<uint8_t>(255 - image.samples[i]);
    } else {
      uint16_t v;
      std::memcpy(&v, &image.samples[i * 2], 2);
      v = static_cast<uint16_t>(32768 - v);
      std::memcpy(&image.samples[i * 2], &v, 2);
    }
  }
  // Two blocks back to back: the first is taken back by the second advance.
  const int32_t middle = image.height / 2;
  if (middle > 0 && !WriteRows(record, image, 0, middle)) return 1;
  if (!WriteRows(record, image, middle, image.height)) return 1;
  record->coordinates32->outRect = {};
  if (record->advanceCallback() != 0 || record->outData != nullptr) return 1;
  record->progressCallback(1, 1);

  // The title, to show the test what the host called the document.
  auto* handles = static_cast<HostHandleProcs*>(record->handleProcs);
  auto* properties = static_cast<HostPropertyProcs*>(record->propertyProcs);
  HostHandle title = nullptr;
  if (properties->getProperty(kHostSignature, FourCC("unnm"), 0, nullptr, &title) != 0) return 1;

  HostDescriptor out = nullptr;
  descriptors->make(&out);
  descriptors->putInteger(out, FourCC("runs"), runs + 1);
  descriptors->putInteger(out, FourCC("plip"), static_cast<int32_t>(replay));
  descriptors->putFloat(out, FourCC("focL"), 0.1);
  descriptors->putEnumerated(out, FourCC("prjM"), FourCC("prjM"), FourCC("fisP"));
  descriptors->putData(out, FourCC("titl"), handles->getSize(title), handles->lock(title, 0));
  handles->unlock(title);
  handles->disposeRegularHandle(title);
  HostHandle written = nullptr;
  const bool ok = descriptors->asHandle(out, &written) == 0;
  descriptors->free(out);
  script->descriptor = written;
  return ok ? 0 : 1;
}

}  // namespace

extern "C" __attribute__((visibility("default"))) void EntryFI(int16_t selector,
                                                               HostFilterRecord* record,
                                                               intptr_t* dataSlot,
                                                               int16_t* result) {
  *result = 0;
  if (selector == kSelectorPrepare) {
    *dataSlot = 1;
    if (record->memoryOffer == 0) *result = 1;
  } else if (selector == kSelectorStart) {
    *result = *dataSlot == 1 ? Start(record) : 1;
  } else if (selector == kSelectorParameters) {
    // The interactive run opens the workspace, which this module has not.
    std::fputs("fake module: no workspace\n", stderr);
    *result = 1;
  }
}
