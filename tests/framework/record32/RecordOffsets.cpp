// Compiled with -m32 -fsyntax-only by CTest: on a 32-bit build the record's
// fields must sit at the host's offsets, since the host and the module meet
// only through this layout.
#include <cstddef>

#include "framework/plugin/HostFilterRecord.h"
#include "framework/plugin/HostSuites.h"

namespace {

using R = Tarsa::HostFilterRecord;
static_assert(sizeof(void*) == 4, "compile this file with -m32");

#define ARCHWAY_AT(field, offset) \
  static_assert(offsetof(R, field) == (offset), #field " is not at " #offset)

ARCHWAY_AT(abortCallback, 4);
ARCHWAY_AT(progressCallback, 8);
ARCHWAY_AT(imageHeight16, 16);
ARCHWAY_AT(imageWidth16, 18);
ARCHWAY_AT(filterRect16, 22);
ARCHWAY_AT(memoryOffer, 44);
ARCHWAY_AT(bufferShare, 48);
ARCHWAY_AT(inRect16, 52);
ARCHWAY_AT(inPlanes, 60);
ARCHWAY_AT(outRect16, 64);
ARCHWAY_AT(outFirstPlane, 72);
ARCHWAY_AT(outLastPlane, 74);
ARCHWAY_AT(outData, 84);
ARCHWAY_AT(outRowBytes, 88);
ARCHWAY_AT(floatsOverImage, 92);
ARCHWAY_AT(flagByte94, 94);
ARCHWAY_AT(maskRect16, 96);
ARCHWAY_AT(hostSignature, 120);
ARCHWAY_AT(hostOption, 124);
ARCHWAY_AT(imageMode, 128);
ARCHWAY_AT(resolutionX, 132);
ARCHWAY_AT(resolutionY, 136);
ARCHWAY_AT(floatOrigin16, 140);
ARCHWAY_AT(wholeSize16, 144);
ARCHWAY_AT(block148, 148);
ARCHWAY_AT(platformData, 188);
ARCHWAY_AT(bufferProcs, 192);
ARCHWAY_AT(procs196, 196);
ARCHWAY_AT(aux200, 200);
ARCHWAY_AT(aux204, 204);
ARCHWAY_AT(handleProcs, 208);
ARCHWAY_AT(planeCount, 216);
ARCHWAY_AT(advanceCallback, 224);
ARCHWAY_AT(aux256, 256);
ARCHWAY_AT(hasAlpha262, 262);
ARCHWAY_AT(hasAlpha272, 272);
ARCHWAY_AT(aux316, 316);
ARCHWAY_AT(propertyProcs, 320);
ARCHWAY_AT(scriptBlock, 356);
ARCHWAY_AT(channelProcs, 364);
ARCHWAY_AT(documentInfo, 368);
ARCHWAY_AT(suiteAccess, 372);
ARCHWAY_AT(aux376, 376);
ARCHWAY_AT(coordinates32, 400);

using C = Tarsa::HostCoordinates32;
static_assert(offsetof(C, imageHeight) == 4 && offsetof(C, imageWidth) == 8);
static_assert(offsetof(C, filterRect) == 12 && offsetof(C, inRect) == 28);
static_assert(offsetof(C, outRect) == 44 && offsetof(C, maskRect) == 60);
static_assert(offsetof(C, floatOrigin) == 76 && offsetof(C, wholeSize) == 84);

using Tarsa::HostAlphaChannel;
using Tarsa::HostChannelNode;
using Tarsa::HostDocumentInfo;
using Tarsa::HostScriptBlock;
static_assert(offsetof(HostDocumentInfo, version) == 4);
static_assert(offsetof(HostDocumentInfo, targetCompositeChannels) == 808);
static_assert(offsetof(HostDocumentInfo, targetTransparency) == 812);
static_assert(offsetof(HostDocumentInfo, targetMask) == 816);
static_assert(offsetof(HostDocumentInfo, layerMaskChannels) == 820);
static_assert(offsetof(HostDocumentInfo, layerTransparency) == 824);
static_assert(offsetof(HostDocumentInfo, mergedCompositeChannels) == 828);
static_assert(offsetof(HostDocumentInfo, alphaChannels) == 840);
static_assert(offsetof(HostDocumentInfo, mergedMask) == 872);
static_assert(offsetof(HostChannelNode, next) == 8 && offsetof(HostChannelNode, port) == 12);
static_assert(offsetof(HostChannelNode, bounds) == 16 && offsetof(HostChannelNode, readable) == 52);
static_assert(offsetof(HostAlphaChannel, next) == 8 && offsetof(HostAlphaChannel, channel) == 12);
static_assert(offsetof(HostAlphaChannel, transparency) == 16);
static_assert(offsetof(HostScriptBlock, playMode) == 2 &&
              offsetof(HostScriptBlock, descriptor) == 8);
static_assert(offsetof(Tarsa::HostPropertyProcs, getProperty) == 4);
static_assert(offsetof(Tarsa::HostChannelPortsSuite, readPixelsFromLevel) == 36);
static_assert(offsetof(Tarsa::HostDescriptorSuite, putEnumerated) == 17 * 4);
static_assert(offsetof(Tarsa::HostDescriptorSuite, getData) == 45 * 4);
static_assert(offsetof(Tarsa::HostLensQuery, cropFactor) == 24 &&
              offsetof(Tarsa::HostLensQuery, model) == 32 &&
              offsetof(Tarsa::HostLensQuery, results) == 48 && sizeof(Tarsa::HostLensQuery) == 56);
static_assert(offsetof(Tarsa::HostLensResult, path) == 4 &&
              offsetof(Tarsa::HostLensResult, flagA) == 28 &&
              offsetof(Tarsa::HostLensResult, pathIsWide) == 30 &&
              offsetof(Tarsa::HostLensResult, cropFactor) == 32 &&
              sizeof(Tarsa::HostLensResult) == 36);

}  // namespace
