#include "framework/plugin/CQuillmarkPlugin.h"

#include <algorithm>
#include <cstring>
#include <utility>

#include "framework/memory/CMemoryService.h"
#include "framework/native/NativeDisplay.h"
#include "framework/native/NativeSystem.h"
#include "framework/plugin/CQuillmarkError.h"

namespace Tarsa {

namespace {

CQuillmarkPlugin* gPlugin = nullptr;

struct SuiteName {
  const char* name;
  std::int32_t version;
};

// By ESuite; the order is the order of release.
constexpr SuiteName kSuiteNames[] = {
    {kChannelPortsSuite, 3},
    {kSwiftViewSuite, 3},
    {kUtilitiesSuite, 1},
    {kPaletteSuite, 1},
    {kZStringSuite, 1},
    {kZStringDictionarySuite, 1},
    {kUIHooksSuite, 1},
    {kUIHooksSuite, 2},
    {kUIHooksSuite, 3},
    {kUIHooksSuite, 4},
    {kMouseTrackingSuite, 3},
    {kMouseTrackingSuite, 4},
    {kHelpSuite, 1},
    {kHelpSuite, 2},
    {kBufferSuite, 1},
    {kLookoutSuite, 1},
    {"5c92e480-6a13-11d1-b7f2-00a0c9e1d7cc", 3},
    {"a3f1c017-4e27-11d0-9b31-00a0c9d4e6a1", 3},
    {kDescriptorSuite, 5},
    {"a3f1c016-4e27-11d0-9b31-00a0c9d4e6a1", 3},
};
static_assert(std::size(kSuiteNames) == std::size_t(CQuillmarkPlugin::ESuite::kCount));

// A table hung from the record is usable for entry n when it exists, says it
// has at least n entries, and the entry is set.
bool HasEntry(const void* table, int entry) {
  if (table == nullptr) return false;
  return static_cast<const HostProcTableHeader*>(table)->count >= entry;
}

const HostSuiteAccess* SuiteAccessOf(const HostFilterRecord* record) {
  if (record == nullptr) return nullptr;
  const auto* access = static_cast<const HostSuiteAccess*>(record->suiteAccess);
  if (!HasEntry(access, 1) || access->acquire == nullptr) return nullptr;
  return access;
}

constexpr std::uint32_t kPropTooltips = FourCC("tltp");
constexpr std::uint32_t kPropTileSize = FourCC("TSiz");
constexpr std::uint32_t kPropDisplayScale = FourCC("HDPI");
constexpr std::uint32_t kPropUIBrightness = FourCC("UIBR");
constexpr std::uint32_t kPropUIHLCR = FourCC("HLCR");
constexpr std::uint32_t kPropUILGTB = FourCC("LGTB");
constexpr std::uint32_t kPropZoomWheel = FourCC("zScW");
constexpr std::uint32_t kPropWatchCursor = FourCC("wtch");
constexpr std::uint32_t kPropScratchVolumes = FourCC("svls");

constexpr std::uint64_t kMinMemoryLimit = 0x2000000;
constexpr std::uint64_t kMaxPluginMemoryLimit = 0x20000000;

}  // namespace

CQuillmarkPlugin::CQuillmarkPlugin() { gPlugin = this; }

CQuillmarkPlugin::~CQuillmarkPlugin() {
  for (std::size_t i = 0; i < suites_.size(); ++i) {
    SuiteSlot& slot = suites_[i];
    if (slot.table == nullptr) continue;
    if (HasEntry(slot.access, 2) && slot.access->release != nullptr) {
      slot.access->release(kSuiteNames[i].name, kSuiteNames[i].version);
    }
    slot = SuiteSlot{};
  }
  if (gPlugin == this) gPlugin = nullptr;
}

CQuillmarkPlugin* CQuillmarkPlugin::Current() { return gPlugin; }

void CQuillmarkPlugin::SetPluginState(std::uint32_t bit, bool on) {
  pluginState_ = on ? (pluginState_ | bit) : (pluginState_ & ~bit);
}

// ---- Suites -----------------------------------------------------------------

const void* CQuillmarkPlugin::Suite(ESuite suite) {
  const auto index = std::size_t(suite);
  if (index >= suites_.size()) return nullptr;
  SuiteSlot& slot = suites_[index];
  if (slot.table != nullptr) return slot.table;
  // Only a success is cached: a suite asked for while no record is at hand
  // is asked for again once there is one.
  const HostSuiteAccess* access = SuiteAccessOf(HostRecord());
  if (access == nullptr) return nullptr;
  const void* table = nullptr;
  if (access->acquire(kSuiteNames[index].name, kSuiteNames[index].version, &table) != 0 ||
      table == nullptr) {
    return nullptr;
  }
  slot.table = table;
  slot.access = access;
  return table;
}

const HostChannelPortsSuite* CQuillmarkPlugin::ChannelPortsSuite() {
  return static_cast<const HostChannelPortsSuite*>(Suite(ESuite::kChannelPorts));
}

const HostPaletteSuite* CQuillmarkPlugin::PaletteSuite() {
  return static_cast<const HostPaletteSuite*>(Suite(ESuite::kPalette));
}

const HostBufferSuite* CQuillmarkPlugin::BufferSuite() {
  return static_cast<const HostBufferSuite*>(Suite(ESuite::kBuffer));
}

const HostDescriptorSuite* CQuillmarkPlugin::DescriptorSuite() {
  return static_cast<const HostDescriptorSuite*>(Suite(ESuite::kDescriptor));
}

void CQuillmarkPlugin::CountUsage(const char* event, std::int32_t amount) {
  const auto* lookout = static_cast<const HostLookoutSuite*>(Suite(ESuite::kLookout));
  if (lookout != nullptr && lookout->count != nullptr) lookout->count(event, amount);
}

const void* CQuillmarkPlugin::AcquireSuite(const char* name, std::int32_t version) {
  const HostSuiteAccess* access = SuiteAccessOf(HostRecord());
  if (access == nullptr) return nullptr;
  const void* table = nullptr;
  if (access->acquire(name, version, &table) != 0) return nullptr;
  return table;
}

void CQuillmarkPlugin::ReleaseSuite(const char* name, std::int32_t version) {
  const HostSuiteAccess* access = SuiteAccessOf(HostRecord());
  if (HasEntry(access, 2) && access->release != nullptr) access->release(name, version);
}

// ---- Properties -----------------------------------------------------------

const HostPropertyProcs* CQuillmarkPlugin::PropertyProcs(const HostFilterRecord* record,
                                                         int entry) const {
  if (record == nullptr) return nullptr;
  const auto* procs = static_cast<const HostPropertyProcs*>(record->propertyProcs);
  if (!HasEntry(procs, entry)) return nullptr;
  if (entry == 1 && procs->getProperty == nullptr) return nullptr;
  if (entry == 2 && procs->setProperty == nullptr) return nullptr;
  return procs;
}

bool CQuillmarkPlugin::GetPropertyOf(const HostFilterRecord* record, std::uint32_t signature,
                                     std::uint32_t key, std::intptr_t& value) const {
  const HostPropertyProcs* procs = PropertyProcs(record, 1);
  if (procs == nullptr) return false;
  std::intptr_t simple = 0;
  if (procs->getProperty(signature, key, 0, &simple, nullptr) != 0) return false;
  value = simple;
  return true;
}

bool CQuillmarkPlugin::GetProperty(std::uint32_t key, std::intptr_t& value,
                                   std::uint32_t signature) const {
  return GetPropertyOf(HostRecord(), signature, key, value);
}

bool CQuillmarkPlugin::SetProperty(std::uint32_t key, std::intptr_t value,
                                   std::uint32_t signature) const {
  const HostPropertyProcs* procs = PropertyProcs(HostRecord(), 2);
  if (procs == nullptr) return false;
  return procs->setProperty(signature, key, 0, value, nullptr) == 0;
}

bool CQuillmarkPlugin::GetPropertyBytes(std::uint32_t key, std::string& bytes) const {
  const HostPropertyProcs* procs = PropertyProcs(HostRecord(), 1);
  // Without a way to dispose of it, the host's handle would leak: not asked.
  if (procs == nullptr || HandleProcs(2) == nullptr) return false;
  std::intptr_t simple = 0;
  HostHandle handle = nullptr;
  if (procs->getProperty(kHostSignature, key, 0, &simple, &handle) != 0 || handle == nullptr) {
    return false;
  }
  struct Disposer {
    const CQuillmarkPlugin* plugin;
    HostHandle handle;
    ~Disposer() { plugin->DisposeHandle(handle); }
  } disposer{this, handle};
  const std::int32_t size = HandleSize(handle);
  if (size <= 0) {
    bytes.clear();
    return true;
  }
  const char* data = LockHandle(handle);
  bytes.assign(data, std::size_t(size));
  UnlockHandle(handle);
  return true;
}

bool CQuillmarkPlugin::TooltipsOn() const {
  std::intptr_t value = 0;
  return !GetProperty(kPropTooltips, value) || value != 0;
}

std::int32_t CQuillmarkPlugin::HostTileSize() const {
  std::intptr_t value = 0;
  if (!GetProperty(kPropTileSize, value) || value <= 0 || value > INT32_MAX) {
    return kDefaultTileSize;
  }
  return std::int32_t(value);
}

void CQuillmarkPlugin::ReadDisplayProperties(const HostFilterRecord* record) {
  std::intptr_t value = 0;
  if (GetPropertyOf(record, kHostSignature, kPropDisplayScale, value) && value >= 0 && value <= 2) {
    displayScale_ = std::int32_t(value);
  }
  uiBrightness_ = kDefaultUIBrightness;
  if (GetPropertyOf(record, kHostSignature, kPropUIBrightness, value) && value >= 0 && value <= 3) {
    uiBrightness_ = std::int32_t(value);
  }
  uiFlagHLCR_ = GetPropertyOf(record, kHostSignature, kPropUIHLCR, value) && value == 2;
  uiFlagLGTB_ = GetPropertyOf(record, kHostSignature, kPropUILGTB, value) && value == 1;
}

void CQuillmarkPlugin::ReadZoomWithScrollWheel() {
  std::intptr_t value = 0;
  zoomWithScrollWheel_ = GetProperty(kPropZoomWheel, value) && value != 0;
}

void CQuillmarkPlugin::SuspendWatchCursor(bool suspend) const {
  SetProperty(kPropWatchCursor, suspend ? 1 : 0);
}

std::vector<std::string> CQuillmarkPlugin::ScratchVolumes() const {
  std::vector<std::string> volumes;
  std::string bytes;
  if (!GetPropertyBytes(kPropScratchVolumes, bytes)) return volumes;
  std::size_t at = 0;
  while (at < bytes.size()) {
    std::size_t end = bytes.find('\0', at);
    if (end == std::string::npos) end = bytes.size();
    if (end > at) volumes.push_back(bytes.substr(at, end - at));
    at = end + 1;
  }
  return volumes;
}

// ---- Handles ----------------------------------------------------------------

const HostHandleProcs* CQuillmarkPlugin::HandleProcs(int entry) const {
  const HostFilterRecord* record = HostRecord();
  if (record == nullptr) return nullptr;
  const auto* procs = static_cast<const HostHandleProcs*>(record->handleProcs);
  return HasEntry(procs, entry) ? procs : nullptr;
}

HostHandle CQuillmarkPlugin::NewHandle(std::int32_t size) const {
  const HostHandleProcs* procs = HandleProcs(1);
  if (procs == nullptr || procs->newHandle == nullptr || size < 0) {
    throw CQuillmarkError(CQuillmarkError::kParameter);
  }
  HostHandle handle = procs->newHandle(size);
  if (handle == nullptr) throw CQuillmarkError(CQuillmarkError::kMemoryFull);
  return handle;
}

void CQuillmarkPlugin::DisposeHandle(HostHandle handle) const {
  if (handle == nullptr) return;
  // Hosts with the longer table dispose through its last entry.
  if (const HostHandleProcs* procs = HandleProcs(8);
      procs != nullptr && procs->disposeRegularHandle != nullptr) {
    procs->disposeRegularHandle(handle);
    return;
  }
  if (const HostHandleProcs* procs = HandleProcs(2);
      procs != nullptr && procs->disposeHandle != nullptr) {
    procs->disposeHandle(handle);
  }
}

std::int32_t CQuillmarkPlugin::HandleSize(HostHandle handle) const {
  if (handle == nullptr) throw CQuillmarkError(CQuillmarkError::kNilHandle);
  const HostHandleProcs* procs = HandleProcs(3);
  if (procs == nullptr || procs->getSize == nullptr) {
    throw CQuillmarkError(CQuillmarkError::kParameter);
  }
  return procs->getSize(handle);
}

char* CQuillmarkPlugin::LockHandle(HostHandle handle) const {
  if (handle == nullptr) throw CQuillmarkError(CQuillmarkError::kNilHandle);
  const HostHandleProcs* procs = HandleProcs(5);
  if (procs == nullptr || procs->lock == nullptr)
    throw CQuillmarkError(CQuillmarkError::kParameter);
  char* data = procs->lock(handle, 0);
  if (data == nullptr) throw CQuillmarkError(CQuillmarkError::kFreeBlock);
  return data;
}

void CQuillmarkPlugin::UnlockHandle(HostHandle handle) const {
  const HostHandleProcs* procs = HandleProcs(6);
  if (handle != nullptr && procs != nullptr && procs->unlock != nullptr) procs->unlock(handle);
}

// ---- Strings, memory, modal runs ------------------------------------------------

bool CQuillmarkPlugin::LookupString(const CString& keyed, CString& text) {
  // The host's string suites in the order of preference.
  for (ESuite which : {ESuite::kZString, ESuite::kUtilities, ESuite::kSwiftView}) {
    const auto* suite = static_cast<const HostStringSuite*>(Suite(which));
    if (suite == nullptr || suite->lookup == nullptr) continue;
    std::string buffer(256, '\0');
    std::int32_t length = 0;
    if (suite->lookup(keyed.c_str(), buffer.data(), std::int32_t(buffer.size()), &length) != 0 ||
        length < 0) {
      continue;
    }
    if (std::size_t(length) >= buffer.size()) {
      buffer.assign(std::size_t(length) + 1, '\0');
      if (suite->lookup(keyed.c_str(), buffer.data(), std::int32_t(buffer.size()), &length) != 0 ||
          length < 0 || std::size_t(length) >= buffer.size()) {
        continue;
      }
    }
    text = CString(buffer.substr(0, std::size_t(length)));
    return true;
  }
  return false;
}

void CQuillmarkPlugin::BeginProcess() {
  if ((pluginState_ & kPlugin_InAbout) == 0 && (pluginState_ & kPlugin_HidePalettes) != 0) {
    HidePalettes();
  }
}

void CQuillmarkPlugin::EndProcess() {
  if ((pluginState_ & kPlugin_InAbout) == 0 && (pluginState_ & kPlugin_HidePalettes) != 0) {
    ShowPalettes();
  }
}

void CQuillmarkPlugin::HidePalettes() {
  // Without the palette suite the host's palettes stay: its windows are not
  // the module's to walk on this system.
  const HostPaletteSuite* palette = PaletteSuite();
  if (palette == nullptr || palette->showHide == nullptr || palettesHidden_) return;
  palettesHidden_ = palette->showHide(1) == 0;
}

void CQuillmarkPlugin::ShowPalettes() {
  if (!palettesHidden_) return;
  const HostPaletteSuite* palette = PaletteSuite();
  if (palette != nullptr && palette->showHide != nullptr) palette->showHide(0);
  palettesHidden_ = false;
}

void CQuillmarkPlugin::InitMemory() {
  CMemoryService* service = CMemoryService::Get(true);
  const std::uint64_t half = Native::PhysicalMemoryBytes() / 2;
  service->SetMemoryLimit(std::clamp(half, kMinMemoryLimit, kMaxPluginMemoryLimit));
  if (!service->HasSwap()) service->StartSwap(ScratchVolumes());
}

std::uint32_t CQuillmarkPlugin::HeldModifiers() const { return Native::KeyboardModifiers(); }

}  // namespace Tarsa
