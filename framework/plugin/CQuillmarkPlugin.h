#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "framework/plugin/HostFilterRecord.h"
#include "framework/plugin/HostSuites.h"
#include "framework/process/CProcess.h"

namespace Tarsa {

// What any plug-in of the host needs, on top of the process: the host's
// suites, acquired by name on first use, cached, and released in the
// destructor in the order of the suite table; the host's properties read and
// written through the record's property callbacks; the host's handles; the
// host's localised strings; and the palette handling around a modal run.
//
// There is exactly one plug-in object per module; its constructor stores it
// in a module-wide pointer and its destructor clears it. It does not own the
// record (the host's, valid for one selector) nor the suites' tables (the
// host's); it only holds them.
class CQuillmarkPlugin : public CProcess {
 public:
  // Bits of the plug-in's state word.
  static constexpr std::uint32_t kPlugin_HostRecordValid = 1u << 0;
  static constexpr std::uint32_t kPlugin_InAbout = 1u << 1;
  // BeginProcess hides the host's floating palettes and EndProcess shows them.
  static constexpr std::uint32_t kPlugin_HidePalettes = 1u << 2;

  // The cached suites, in the order they are released.
  enum class ESuite : std::uint32_t {
    kChannelPorts,
    kSwiftView,
    kUtilities,
    kPalette,
    kZString,
    kZStringDictionary,
    kUIHooks1,
    kUIHooks2,
    kUIHooks3,
    kUIHooks4,
    kMouseTracking3,
    kMouseTracking4,
    kHelp1,
    kHelp2,
    kBuffer,
    kLookout,
    kAux5c92,
    kAuxA3f1c017,
    kDescriptor,
    kAuxA3f1c016,
    kCount
  };

  // Defaults of properties the host may not know.
  static constexpr std::int32_t kDefaultTileSize = 16384;
  static constexpr std::int32_t kDefaultUIBrightness = 2;

  CQuillmarkPlugin();
  ~CQuillmarkPlugin() override;

  // The module's plug-in, or null.
  static CQuillmarkPlugin* Current();

  std::uint32_t PluginState() const { return pluginState_; }
  void SetPluginState(std::uint32_t bit, bool on);

  // The record suites and properties are reached through: the about record
  // here; the filter's record while it is valid.
  virtual HostFilterRecord* HostRecord() const { return aboutRecord_; }
  HostFilterRecord* AboutRecord() const { return aboutRecord_; }

  // --- Suites ---------------------------------------------------------------
  // The suite's table, acquired on first use; null when the host has none.
  const void* Suite(ESuite suite);
  const HostChannelPortsSuite* ChannelPortsSuite();
  const HostPaletteSuite* PaletteSuite();
  const HostBufferSuite* BufferSuite();
  const HostDescriptorSuite* DescriptorSuite();
  // Adds to one of the host's usage counters; dropped when it has none.
  void CountUsage(const char* event, std::int32_t amount);

  // A suite outside the cache, acquired and released by the caller; null when
  // the host has none.
  const void* AcquireSuite(const char* name, std::int32_t version);
  void ReleaseSuite(const char* name, std::int32_t version);

  // --- Properties -------------------------------------------------------------
  // A simple property; false when the host has no property callbacks or the
  // call fails.
  bool GetProperty(std::uint32_t key, std::intptr_t& value,
                   std::uint32_t signature = kHostSignature) const;
  bool SetProperty(std::uint32_t key, std::intptr_t value,
                   std::uint32_t signature = kHostSignature) const;
  // The bytes of a complex property; the host's handle is disposed of.
  bool GetPropertyBytes(std::uint32_t key, std::string& bytes) const;

  // 'tltp': tooltips on; true when the host does not say.
  bool TooltipsOn() const;
  // 'TSiz': the host's tile size, 16384 when it does not say.
  std::int32_t HostTileSize() const;
  // 'HDPI', 'UIBR', 'HLCR', 'LGTB' from record, read once when the object is
  // first made; kept for the framework's display scaling and drawing.
  void ReadDisplayProperties(const HostFilterRecord* record);
  std::int32_t DisplayScale() const { return displayScale_; }
  std::int32_t UIBrightness() const { return uiBrightness_; }
  bool UIFlagHLCR() const { return uiFlagHLCR_; }
  bool UIFlagLGTB() const { return uiFlagLGTB_; }
  // 'zScW', read at each start: the host zooms with the scroll wheel.
  void ReadZoomWithScrollWheel();
  bool ZoomWithScrollWheel() const { return zoomWithScrollWheel_; }
  // 'wtch': true suspends the host's watch cursor, false resumes it.
  void SuspendWatchCursor(bool suspend) const;
  // 'svls': the host's scratch folders; empty when it has none.
  std::vector<std::string> ScratchVolumes() const;

  // --- Handles ----------------------------------------------------------------
  // Failures are CQuillmarkError with the host's code.
  HostHandle NewHandle(std::int32_t size) const;
  void DisposeHandle(HostHandle handle) const;
  std::int32_t HandleSize(HostHandle handle) const;
  char* LockHandle(HostHandle handle) const;
  void UnlockHandle(HostHandle handle) const;

  // --- Strings, memory, modal runs ----------------------------------------------
  // The host's text for a keyed string, from its string suites in turn.
  bool LookupString(const CString& keyed, CString& text) override;

  // Around a modal run: hide and show the host's floating palettes.
  virtual void BeginProcess();
  virtual void EndProcess();
  void HidePalettes();
  void ShowPalettes();

  // The memory service for a process without a filter record: half the
  // physical memory, within 32 MiB and 512 MiB.
  virtual void InitMemory();

  // The program's name as the user sees it, a keyed string.
  virtual CString ProcessName() const { return "$$$/Tarsa/QuillmarkPlugin/Name=Plug-in"; }

  // The modifier keys held now (Native modifier bits).
  virtual std::uint32_t HeldModifiers() const;

 protected:
  std::uint32_t pluginState_ = kPlugin_HidePalettes;
  HostFilterRecord* aboutRecord_ = nullptr;

 private:
  struct SuiteSlot {
    const void* table = nullptr;
    const HostSuiteAccess* access = nullptr;  // the table it came from, to release
  };

  const HostPropertyProcs* PropertyProcs(const HostFilterRecord* record, int entry) const;
  const HostHandleProcs* HandleProcs(int entry) const;
  bool GetPropertyOf(const HostFilterRecord* record, std::uint32_t signature, std::uint32_t key,
                     std::intptr_t& value) const;

  std::array<SuiteSlot, std::size_t(ESuite::kCount)> suites_{};
  std::int32_t displayScale_ = 0;
  std::int32_t uiBrightness_ = kDefaultUIBrightness;
  bool uiFlagHLCR_ = false;
  bool uiFlagLGTB_ = false;
  bool zoomWithScrollWheel_ = false;
  bool palettesHidden_ = false;
};

}  // namespace Tarsa
