#pragma once

// The record a host hands to the filter with every selector, and the tables
// hanging from it. This is a wire format shared by the module and the host
// program: plain fields only, in the host's order. On a 32-bit build the
// offsets are the host's own (a test compiles this header with -m32 and checks
// them); on a 64-bit build the same fields follow with pointers widened.
// Reserved runs stand where the host keeps fields the filter never touches.

#include <cstdint>

namespace Tarsa {

extern "C" {

using HostAbortProc = std::uint8_t (*)();
using HostProgressProc = void (*)(std::int32_t done, std::int32_t total);
using HostAdvanceProc = std::int16_t (*)();

// Four host rectangles are stored top, left, bottom, right.
struct HostRect16 {
  std::int16_t top, left, bottom, right;
};
struct HostRect32 {
  std::int32_t top, left, bottom, right;
};
struct HostPoint16 {
  std::int16_t v, h;
};
struct HostPoint32 {
  std::int32_t v, h;
};

// The 32-bit coordinate block. The filter writes `enabled` = 1 and from then on
// reads every coordinate here instead of in the 16-bit fields.
struct HostCoordinates32 {
  std::uint32_t enabled;
  std::int32_t imageHeight;
  std::int32_t imageWidth;
  HostRect32 filterRect;
  HostRect32 inRect;
  HostRect32 outRect;
  HostRect32 maskRect;
  HostPoint32 floatOrigin;
  HostPoint32 wholeSize;  // v = height, h = width
};

// Every callback table starts with a version and the number of valid entries;
// an entry is usable when its index is below the count and it is not null.
struct HostProcTableHeader {
  std::int16_t version;
  std::int16_t count;
};

struct HostFilterRecord {
  std::int32_t reserved0;
  HostAbortProc abortCallback;        // 4
  HostProgressProc progressCallback;  // 8
  void* reserved12;
  std::int16_t imageHeight16;  // 16
  std::int16_t imageWidth16;   // 18
  std::int16_t reserved20;
  HostRect16 filterRect16;  // 22
  std::uint8_t reserved30[14];
  std::uint32_t memoryOffer;   // 44
  std::uint32_t bufferShare;   // 48
  HostRect16 inRect16;         // 52
  std::int16_t inPlanes[2];    // 60
  HostRect16 outRect16;        // 64
  std::int16_t outFirstPlane;  // 72
  std::int16_t outLastPlane;   // 74
  void* reserved76;
  std::int32_t reserved80;
  void* outData;                 // 84
  std::int32_t outRowBytes;      // 88
  std::uint8_t floatsOverImage;  // 92
  std::uint8_t reserved93;
  std::uint8_t flagByte94;  // 94
  std::uint8_t reserved95;
  HostRect16 maskRect16;  // 96
  std::uint8_t reserved104[16];
  std::uint32_t hostSignature;  // 120
  std::uint32_t hostOption;     // 124
  std::int16_t imageMode;       // 128
  std::int16_t reserved130;
  std::int32_t resolutionX;   // 132, 16.16 fixed point
  std::int32_t resolutionY;   // 136
  HostPoint16 floatOrigin16;  // 140
  HostPoint16 wholeSize16;    // 144, v = height, h = width
  std::uint8_t block148[40];  // passed on by address only
  void* platformData;         // 188
  void* bufferProcs;          // 192
  void* procs196;             // 196
  void* aux200;               // 200
  void* aux204;               // 204
  void* handleProcs;          // 208
  void* reserved212;
  std::int16_t planeCount;  // 216
  std::int16_t reserved218[3];
  HostAdvanceProc advanceCallback;  // 224
  std::uint8_t reserved228[28];
  std::uint32_t aux256;  // 256
  std::int16_t reserved260;
  std::int16_t hasAlpha262;  // 262
  std::uint8_t reserved264[8];
  std::int16_t hasAlpha272;  // 272
  std::uint8_t reserved274[42];
  void* aux316;         // 316
  void* propertyProcs;  // 320
  std::uint8_t reserved324[32];
  void* scriptBlock;  // 356
  void* reserved360;
  void* channelProcs;  // 364
  void* documentInfo;  // 368
  void* suiteAccess;   // 372
  void* aux376;        // 376
  std::uint8_t reserved380[20];
  HostCoordinates32* coordinates32;  // 400
  std::uint8_t reserved404[60];
};

}  // extern "C"

}  // namespace Tarsa
