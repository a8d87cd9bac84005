#pragma once

// The callback tables and suites a host serves to the filter, and the blocks
// of the record that point into the host's document. Like the record itself
// this is a wire format shared by the module and the host program: function
// tables are plain structures of C function pointers, in the host's order.
// Tables hung from the record begin with a version and a count of valid
// entries; suites acquired by name are bare tables.

#include <cstdint>

#include "framework/plugin/HostFilterRecord.h"

namespace Tarsa {

extern "C" {

using HostHandle = struct HostHandleOpaque*;
using HostBufferID = struct HostBufferOpaque*;
using HostDescriptor = struct HostDescriptorOpaque*;
using HostChannelPort = struct HostChannelPortOpaque*;
using HostError = std::int16_t;   // 0 is success
using HostStatus = std::int32_t;  // suite calls: 0 is success

// Four-character codes as 32-bit words, first character highest.
constexpr std::uint32_t FourCC(const char (&c)[5]) {
  return (std::uint32_t(std::uint8_t(c[0])) << 24) | (std::uint32_t(std::uint8_t(c[1])) << 16) |
         (std::uint32_t(std::uint8_t(c[2])) << 8) | std::uint32_t(std::uint8_t(c[3]));
}

// Host image modes that reach the filter.
enum HostImageMode : std::int16_t {
  kHostModeBitmap = 0,
  kHostModeGray = 1,
  kHostModeIndexed = 2,
  kHostModeRGB = 3,
  kHostModeCMYK = 4,
  kHostModeHSL = 5,
  kHostModeHSB = 6,
  kHostModeMultichannel = 7,
  kHostModeDuotone = 8,
  kHostModeLab = 9,
  kHostModeGray16 = 10,
  kHostModeRGB48 = 11,
  kHostModeLab48 = 12,
  kHostModeCMYK64 = 13,
  kHostModeDeepMultichannel = 14,
  kHostModeDuotone16 = 15,
  kHostModeRGB96 = 16,
  kHostModeGray32 = 17,
};

// --- Tables hung from the record ---------------------------------------------

// propertyProcs: entry 1 reads, entry 2 writes a host property.
struct HostPropertyProcs {
  HostProcTableHeader header;
  HostError (*getProperty)(std::uint32_t signature, std::uint32_t key, std::int32_t index,
                           std::intptr_t* simpleValue, HostHandle* complexValue);
  HostError (*setProperty)(std::uint32_t signature, std::uint32_t key, std::int32_t index,
                           std::intptr_t simpleValue, HostHandle complexValue);
};

// handleProcs: movable memory blocks owned by the host. From a count of 8 on,
// the filter disposes through entry 8.
struct HostHandleProcs {
  HostProcTableHeader header;
  HostHandle (*newHandle)(std::int32_t size);
  void (*disposeHandle)(HostHandle h);
  std::int32_t (*getSize)(HostHandle h);
  HostError (*setSize)(HostHandle h, std::int32_t size);
  char* (*lock)(HostHandle h, std::uint8_t moveHigh);
  void (*unlock)(HostHandle h);
  void (*recoverSpace)(std::int32_t size);
  void (*disposeRegularHandle)(HostHandle h);
};

// bufferProcs: large blocks the host lends by id.
struct HostBufferProcs {
  HostProcTableHeader header;
  HostError (*allocate)(std::int32_t size, HostBufferID* id);
  char* (*lock)(HostBufferID id, std::uint8_t moveHigh);
  void (*unlock)(HostBufferID id);
  void (*free)(HostBufferID id);
  std::int32_t (*space)();
};

// How a plane is laid out in memory for a pixel read: rowBits and colBits are
// strides in bits; depth is bits per sample.
struct HostPixelMemoryDesc {
  void* data;
  std::int32_t rowBits;
  std::int32_t colBits;
  std::int32_t bitOffset;
  std::int32_t depth;
};

struct HostScaling {
  HostRect32 sourceRect;
  HostRect32 destinationRect;
};

// channelProcs: entry 1 reads one plane of a channel port.
struct HostChannelProcs {
  HostProcTableHeader header;
  HostError (*readPixels)(HostChannelPort port, const HostScaling* scaling,
                          const HostRect32* writeRect, const HostPixelMemoryDesc* destination,
                          HostRect32* wroteRect);
};

// suiteAccess: entry 0 acquires a suite by name and version, entry 1 releases.
struct HostSuiteAccess {
  HostProcTableHeader header;
  HostStatus (*acquire)(const char* name, std::int32_t version, const void** suite);
  HostStatus (*release)(const char* name, std::int32_t version);
};

// --- Complex host properties ---------------------------------------------------

// Properties read through propertyProcs with a complex handle hand over a new
// handle of the host's that the filter disposes of. Their contents:
//   'unnm'  the document's title as UTF-16 code units in the host's byte
//           order, a trailing zero allowed;
//   'titl'  the same title as 8-bit text in the system's encoding;
//   'svls'  the scratch volumes: UTF-8 folder paths, each ending in a zero.
constexpr std::uint32_t kHostSignature = FourCC("QMRK");

// --- The document's channels (read only) -------------------------------------

// A plane of the document. On a 32-bit build: next at 8, port at 12, bounds
// at 16 to 28, readable at 52.
struct HostChannelNode {
  std::int32_t reserved0[2];
  HostChannelNode* next;
  HostChannelPort port;
  HostRect32 bounds;
  std::uint8_t reserved32[20];
  std::uint8_t readable;
  std::uint8_t reserved53[3];
};

// One alpha channel: next at 8, channel at 12, transparency at 16.
struct HostAlphaChannel {
  std::int32_t reserved0[2];
  HostAlphaChannel* next;
  HostChannelNode* channel;
  HostChannelNode* transparency;
};

// The record's documentInfo block; mergedMask exists from version 4 on.
struct HostDocumentInfo {
  std::int32_t reserved0;
  std::int32_t version;  // 4
  std::uint8_t reserved8[800];
  HostChannelNode* targetCompositeChannels;  // 808
  HostChannelNode* targetTransparency;       // 812
  HostChannelNode* targetMask;               // 816
  HostChannelNode* layerMaskChannels;        // 820
  HostChannelNode* layerTransparency;        // 824
  HostChannelNode* mergedCompositeChannels;  // 828
  std::uint8_t reserved832[8];
  HostAlphaChannel* alphaChannels;  // 840
  std::uint8_t reserved844[28];
  HostChannelNode* mergedMask;  // 872
};

// The record's scriptBlock: play mode at 2, the descriptor handle at 8. The
// host owns both the handle it puts there and the one the filter leaves
// there: the filter replaces the handle and disposes of neither.
struct HostScriptBlock {
  std::int16_t reserved0;
  std::int16_t playMode;
  std::int32_t reserved4;
  HostHandle descriptor;
  void* table12;
  void* table16;
};

// --- Suites acquired by name ---------------------------------------------------

constexpr const char kChannelPortsSuite[] = "Quillmark ChannelPorts Suite for Plug-ins";
constexpr const char kSwiftViewSuite[] = "OS Direct SwiftView Suite";
constexpr const char kUtilitiesSuite[] = "Quillmark Utilities Suite for Plug-ins";
constexpr const char kPaletteSuite[] = "Quillmark Palette Suite";
constexpr const char kZStringSuite[] = "OV ZString Suite";
constexpr const char kZStringDictionarySuite[] = "OV ZString Dictionary Suite";
constexpr const char kUIHooksSuite[] = "Quillmark UIHooks Suite for Plug-ins";
constexpr const char kMouseTrackingSuite[] = "Quillmark Mouse Tracking Suite for Plug-ins";
constexpr const char kHelpSuite[] = "Quillmark Help Suite for Plug-ins";
constexpr const char kBufferSuite[] = "Quillmark Buffer Suite for Plug-ins";
constexpr const char kLookoutSuite[] = "Orvane Lookout Suite";
constexpr const char kDescriptorSuite[] = "a3f1c015-4e27-11d0-9b31-00a0c9d4e6a1";
constexpr const char kLensProfilesSuite[] = "Orvane Lens Profiles Suite";

// The channel ports suite: entry 9 reads a plane at a level of detail.
struct HostChannelPortsSuite {
  void* reserved[9];
  HostError (*readPixelsFromLevel)(HostChannelPort port, std::int32_t level,
                                   const HostPixelMemoryDesc* destination, const HostRect32* rect);
};

// The palette suite: entry 0 hides (1) or shows (0) the host's floating palettes.
struct HostPaletteSuite {
  HostStatus (*showHide)(std::uint8_t hide);
};

// The localised string suites all answer one question: the text of a keyed
// string ("$$$/key=Default"). The host writes UTF-8 into the buffer and the
// full length into *length; 0 means it has a text for the key.
struct HostStringSuite {
  HostStatus (*lookup)(const char* keyed, char* buffer, std::int32_t bufferSize,
                       std::int32_t* length);
};

// The buffer suite for plug-ins: large blocks for the framework's allocator.
struct HostBufferSuite {
  void* (*allocate)(std::uint32_t size, std::uint32_t* actualSize);
  void (*release)(void** block);
};

// The lens profile service. Entry 1 answers a query block; entry 2 is called
// once, with no arguments, right after the suite is acquired.
struct HostLensProfilesSuite {
  void* reserved0;
  HostStatus (*query)(void* queryBlock);
  HostStatus (*prepare)();
};

// One candidate profile in the lens service's answer. Every pointer is a
// block of the buffer suite, freed by the filter. widePath holds the path as
// zero-terminated UTF-16 and counts only when pathIsWide is set. On a 32-bit
// build: path at 4, flagA at 28, pathIsWide at 30, cropFactor at 32, 36 bytes.
struct HostLensResult {
  char16_t* widePath;
  char* path;
  char* make;
  char* model;
  char* modelDisplay;
  char* lens;
  char* lensDisplay;
  std::uint8_t flagA;
  std::uint8_t flagB;
  std::uint8_t pathIsWide;
  std::uint8_t reserved31;
  float cropFactor;
};

// The query block of entry 1. The filter fills the strings (buffer suite
// blocks, its own) and the constants; the service fills the last two fields.
// On a 32-bit build: cropFactor at 24, model at 32, results at 48, 56 bytes.
struct HostLensQuery {
  char* make;
  char* reserved4;
  char* lens;
  char* reserved12;
  char* reserved16;
  std::int32_t reserved20;
  float cropFactor;
  std::int32_t reserved28;
  char* model;
  std::int32_t constant36;  // 1
  std::int32_t constant40;  // 1
  std::int32_t constant44;  // 0
  HostLensResult** results;
  std::uint32_t resultCount;
};

// The usage counters suite; the filter drops every call when it is absent.
struct HostLookoutSuite {
  HostStatus (*count)(const char* event, std::int32_t amount);
};

// The descriptor suite, entries by position. A descriptor is the host's
// keyed record of a filter's parameters for scripting.
struct HostDescriptorSuite {
  HostStatus (*make)(HostDescriptor* descriptor);                                           // 0
  HostStatus (*free)(HostDescriptor descriptor);                                            // 1
  void* reserved2;                                                                          // 2
  HostStatus (*keyAt)(HostDescriptor descriptor, std::uint32_t index, std::uint32_t* key);  // 3
  void* reserved4;                                                                          // 4
  HostStatus (*count)(HostDescriptor descriptor, std::uint32_t* count);                     // 5
  void* reserved6[3];                                                                       // 6-8
  HostStatus (*putInteger)(HostDescriptor descriptor, std::uint32_t key, std::int32_t value);  // 9
  HostStatus (*putFloat)(HostDescriptor descriptor, std::uint32_t key, double value);          // 10
  void* reserved11[6];  // 11-16
  HostStatus (*putEnumerated)(HostDescriptor descriptor, std::uint32_t key, std::uint32_t type,
                              std::uint32_t value);  // 17
  void* reserved18[4];                               // 18-21
  HostStatus (*getInteger)(HostDescriptor descriptor, std::uint32_t key,
                           std::int32_t* value);                                        // 22
  HostStatus (*getFloat)(HostDescriptor descriptor, std::uint32_t key, double* value);  // 23
  void* reserved24[7];                                                                  // 24-30
  HostStatus (*getEnumerated)(HostDescriptor descriptor, std::uint32_t key, std::uint32_t* type,
                              std::uint32_t* value);                        // 31
  void* reserved32[7];                                                      // 32-38
  HostStatus (*asHandle)(HostDescriptor descriptor, HostHandle* handle);    // 39
  HostStatus (*fromHandle)(HostHandle handle, HostDescriptor* descriptor);  // 40
  void* reserved41[2];                                                      // 41-42
  HostStatus (*putData)(HostDescriptor descriptor, std::uint32_t key, std::int32_t length,
                        const void* bytes);  // 43
  HostStatus (*getDataLength)(HostDescriptor descriptor, std::uint32_t key,
                              std::int32_t* length);                                 // 44
  HostStatus (*getData)(HostDescriptor descriptor, std::uint32_t key, void* bytes);  // 45
};

// The display colour suite: the host turns samples of a document's mode into
// colours for the screen, in sRGB so that the answer does not depend on the
// monitor. The module finds it like any suite, through the record's
// suiteAccess by name and version, and works without it (see
// CDisplayConversion).
constexpr const char kDisplayColourSuite[] = "Quillmark Display Colour Suite for Plug-ins";
constexpr std::int32_t kDisplayColourSuiteVersion = 1;
// The largest block, in either direction, that one call converts.
constexpr std::int32_t kDisplayBlockSide = 512;

// 8-bit samples in memory, one address per plane: sample (x, y) of plane k
// lies at planes[k] + y * rowBytes + x * columnBytes. Strides rather than a
// fixed layout, so each side passes as it lies: the module's tiles are
// planar (a buffer per plane, columnBytes 1) and its screen surfaces
// interleaved (columnBytes 4), and neither is repacked on the way.
struct HostSampleBlock {
  std::uint8_t* planes[4];
  std::int32_t rowBytes;
  std::int32_t columnBytes;
};

struct HostDisplayColourSuite {
  // Converts width x height pixels (each side 1 to kDisplayBlockSide) of
  // source's colour planes, in imageMode's order, into 8-bit sRGB in
  // destination's planes 0, 1 and 2. Samples are 8-bit whatever the mode's
  // depth: a 16-bit mode stands for its 8-bit twin. Only colour planes are
  // named; a transparency plane stays with the caller. 0 is success; any
  // other answer leaves the destination undefined.
  HostStatus (*convertToDisplay)(std::int16_t imageMode, std::int32_t width, std::int32_t height,
                                 const HostSampleBlock* source, const HostSampleBlock* destination);
};

// The exported entry of a filter module.
using HostEntryProc = void (*)(std::int16_t selector, HostFilterRecord* record,
                               std::intptr_t* dataSlot, std::int16_t* result);

enum HostSelector : std::int16_t {
  kSelectorAbout = 0,
  kSelectorParameters = 1,
  kSelectorPrepare = 2,
  kSelectorStart = 3,
  kSelectorContinue = 4,
  kSelectorFinish = 5,
};

}  // extern "C"

}  // namespace Tarsa
