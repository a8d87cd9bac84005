#include "host/plugin/HostRecord.h"

#include <algorithm>
#include <cmath>

#include "host/io/HostError.h"
#include "host/platform/SystemInfo.h"
#include "host/plugin/BlockExchange.h"
#include "host/plugin/DescriptorSuite.h"
#include "host/plugin/DisplayColour.h"
#include "host/plugin/DocumentChannels.h"
#include "host/plugin/HostBuffers.h"
#include "host/plugin/HostCodes.h"
#include "host/plugin/MemoryHandles.h"
#include "host/plugin/SuiteAccess.h"

namespace Host {

namespace {

// The record whose selector is running. The record's callbacks take no
// argument, so this is the only way they can find it.
thread_local HostRecord* active = nullptr;

int16_t Clamp16(int32_t value) { return static_cast<int16_t>(std::min<int32_t>(value, 32767)); }

int32_t Fixed16(double value) {
  return static_cast<int32_t>(std::lround(std::clamp(value, 0.0, 32767.0) * 65536.0));
}

}  // namespace

struct HostRecordCallbacks {
  static uint8_t Abort() { return active != nullptr && active->observer_.AbortRequested() ? 1 : 0; }

  static void Progress(int32_t done, int32_t total) {
    if (active != nullptr) active->observer_.Progress(done, total);
  }

  static int16_t Advance() {
    if (active == nullptr) return HostCodes::kParamErr;
    if (active->observer_.AbortRequested()) {
      active->blocks_->Commit();
      active->record_->outData = nullptr;
      return HostCodes::kUserCanceled;
    }
    return active->blocks_->Advance();
  }

  static Tarsa::HostError GetProperty(uint32_t signature, uint32_t key, int32_t index,
                                      intptr_t* simpleValue, Tarsa::HostHandle* complexValue) {
    if (active == nullptr) return HostCodes::kParamErr;
    return active->properties_->Get(signature, key, index, simpleValue, complexValue);
  }

  static Tarsa::HostError SetProperty(uint32_t signature, uint32_t key, int32_t index,
                                      intptr_t simpleValue, Tarsa::HostHandle complexValue) {
    if (active == nullptr) return HostCodes::kParamErr;
    return active->properties_->Set(signature, key, index, simpleValue, complexValue);
  }
};

namespace {

constexpr Tarsa::HostPropertyProcs kPropertyProcs = {
    {1, 2}, HostRecordCallbacks::GetProperty, HostRecordCallbacks::SetProperty};

}  // namespace

HostRecord::HostRecord(HostDocument& document, Settings settings, RunObserver& observer)
    : observer_(observer),
      record_(std::make_unique<Tarsa::HostFilterRecord>()),
      coordinates_(std::make_unique<Tarsa::HostCoordinates32>()),
      script_(std::make_unique<Tarsa::HostScriptBlock>()),
      platform_(std::make_unique<void*[]>(4)),
      channels_(std::make_unique<DocumentChannels>(document)),
      blocks_(std::make_unique<BlockExchange>(document, *record_)),
      properties_(std::make_unique<HostProperties>(std::move(settings.properties))),
      display_(std::make_unique<DisplayColour>(document.ColourProfile())) {
  properties_->SetDocumentPath(document.SourcePath());
  blocks_->SetBeforeFirstWrite([this, &document] {
    original_ = document.Duplicate();
    channels_->ReadFrom(*original_);
  });
  const int32_t width = document.Width();
  const int32_t height = document.Height();
  Tarsa::HostFilterRecord& r = *record_;
  r = {};
  r.abortCallback = HostRecordCallbacks::Abort;
  r.progressCallback = HostRecordCallbacks::Progress;
  r.advanceCallback = HostRecordCallbacks::Advance;
  r.imageHeight16 = Clamp16(height);
  r.imageWidth16 = Clamp16(width);
  r.filterRect16 = {0, 0, r.imageHeight16, r.imageWidth16};
  r.memoryOffer = settings.memoryOffer;
  r.hostSignature = kSignature;
  r.imageMode = static_cast<int16_t>(document.Mode());
  r.resolutionX = Fixed16(document.ResolutionX());
  r.resolutionY = Fixed16(document.ResolutionY());
  r.wholeSize16 = {r.imageHeight16, r.imageWidth16};
  r.planeCount = static_cast<int16_t>(document.PlaneCount());
  r.hasAlpha262 = document.HasTransparency() ? 1 : 0;
  r.hasAlpha272 = r.hasAlpha262;
  // No window: the host runs on a terminal.
  r.platformData = platform_.get();
  r.bufferProcs = const_cast<Tarsa::HostBufferProcs*>(HostBuffers::Procs());
  r.handleProcs = const_cast<Tarsa::HostHandleProcs*>(MemoryHandles::Procs());
  r.propertyProcs = const_cast<Tarsa::HostPropertyProcs*>(&kPropertyProcs);
  r.channelProcs = const_cast<Tarsa::HostChannelProcs*>(DocumentChannels::Procs());
  r.documentInfo = channels_->Info();
  r.suiteAccess = const_cast<Tarsa::HostSuiteAccess*>(SuiteAccess::Table());
  r.scriptBlock = script_.get();
  r.coordinates32 = coordinates_.get();

  Tarsa::HostCoordinates32& c = *coordinates_;
  c = {};
  c.imageHeight = height;
  c.imageWidth = width;
  c.filterRect = {0, 0, height, width};
  c.wholeSize = {height, width};

  *script_ = {};
  script_->playMode = settings.playMode;
  // The filter only asks whether these exist.
  script_->table12 = const_cast<Tarsa::HostDescriptorSuite*>(DescriptorSuite::Table());
  script_->table16 = script_->table12;
}

HostRecord::~HostRecord() {
  if (script_->descriptor != descriptorIn_) MemoryHandles::Dispose(script_->descriptor);
  MemoryHandles::Dispose(descriptorIn_);
}

void HostRecord::SetDescriptor(const Descriptor& descriptor) {
  Tarsa::HostHandle handle = MemoryHandles::FromBytes(descriptor.ToBytes());
  if (handle == nullptr) throw HostError("there is not enough memory for the action");
  if (script_->descriptor != descriptorIn_) MemoryHandles::Dispose(script_->descriptor);
  MemoryHandles::Dispose(descriptorIn_);
  descriptorIn_ = handle;
  script_->descriptor = handle;
}

std::optional<Descriptor> HostRecord::LeftDescriptor() const {
  if (script_->descriptor == nullptr) return std::nullopt;
  if (!MemoryHandles::IsHandle(script_->descriptor)) {
    throw HostError("the module left something other than a handle as its action");
  }
  try {
    return Descriptor::FromBytes(MemoryHandles::Bytes(script_->descriptor));
  } catch (const HostError& error) {
    throw HostError("the module left a damaged action: " + error.Problem());
  }
}

uint32_t HostRecord::DefaultMemoryOffer() {
  const uint64_t half = SystemInfo::PhysicalMemory() / 2;
  if (half == 0) return 256u << 20;
  return static_cast<uint32_t>(std::min<uint64_t>(half, 2ull << 30));
}

HostRecord* HostRecord::Active() { return active; }

HostRecord::Scope::Scope(HostRecord& record) : previous_(active) { active = &record; }

HostRecord::Scope::~Scope() { active = previous_; }

}  // namespace Host
