#pragma once

#include <cstdint>
#include <span>

#include "framework/core/CRect.h"
#include "framework/pixels/CMemoryPixmap.h"
#include "framework/plugin/CQuillmarkPlugin.h"
#include "framework/strings/CString.h"

namespace Tarsa {

// A filter plug-in: the plug-in plus the filter selectors, the host's record
// of the current selector, and the image operations built on it. The six
// Handle operations are what the module's entry calls, one per selector; each
// sets the record and runs the Do operation that a program overrides, and
// turns what it throws into the host's answer or passes it on (see
// CPluginEntry). The record accessors read the record as the host wrote it
// and answer 0 (empty) when there is no filter record, as during about.
//
// One filter object per module, stored in a module-wide pointer by its
// constructor and cleared by its destructor. It does not own the record.
class CQuillmarkFilter : public CQuillmarkPlugin {
 public:
  // Channel selectors of ReadPixmap.
  static constexpr std::int32_t kReadNothing = -5;
  static constexpr std::int32_t kReadTarget = -1;
  static constexpr std::int32_t kReadLayerMask = -2;
  // What ReadPixmap puts where the channel does not reach.
  static constexpr std::int32_t kMarginsFromFallback = 0;
  static constexpr std::int32_t kMarginsFill = 1;
  static constexpr std::int32_t kMarginsRepeat = 2;

  CQuillmarkFilter();
  ~CQuillmarkFilter() override;

  // The module's filter, or null: the entry asks this whether one exists.
  static CQuillmarkFilter* Current();

  // --- Overridable, in the order of the table of operations ---------------------
  // Splits total into what the filter keeps and what it leaves; false when
  // the offer is too small. Here: half and the rest.
  virtual bool SplitMemory(std::uint32_t total, std::uint32_t& first, std::uint32_t& second);
  // Configures the memory service once per object, from the record.
  void InitMemory() override;
  virtual void DoAbout();
  virtual void ShowAbout() {}
  virtual HostFilterRecord* CurrentRecord() const { return record_; }
  virtual std::int16_t CurrentSelector() const { return selector_; }
  virtual bool DoParameters() { return true; }
  // Splits the host's memory offer (see the .cpp).
  virtual bool DoPrepare();
  virtual bool DoPrepareFinish() { return true; }
  virtual bool DoStart() { return true; }
  virtual bool DoContinue() { return true; }
  virtual void DoFinish() {}
  virtual std::int16_t HandleAbout(HostFilterRecord* record, std::intptr_t* dataSlot);
  virtual std::int16_t HandleParameters(HostFilterRecord* record, std::intptr_t* dataSlot);
  virtual std::int16_t HandlePrepare(HostFilterRecord* record, std::intptr_t* dataSlot);
  virtual std::int16_t HandleStart(HostFilterRecord* record, std::intptr_t* dataSlot);
  virtual std::int16_t HandleContinue(HostFilterRecord* record, std::intptr_t* dataSlot);
  virtual std::int16_t HandleFinish(HostFilterRecord* record, std::intptr_t* dataSlot);

  // The filter record while it is valid, else the about record.
  HostFilterRecord* HostRecord() const override;
  // The filter record while it is valid, else null.
  HostFilterRecord* FilterRecord() const;
  std::intptr_t* DataSlot() const { return dataSlot_; }

  bool IsInteractive() const { return (flags_ & kFlag_Interactive) != 0; }
  void SetInteractive(bool on);
  bool UsesBufferSuite() const { return useBufferSuite_ != 0; }
  void SetUseBufferSuite(bool on) { useBufferSuite_ = on ? 1 : 0; }
  bool MemoryReady() const { return memoryReady_ != 0; }

  // --- The record --------------------------------------------------------------
  // Coordinates come from the 32-bit block once it is enabled, else from the
  // 16-bit fields; never from both.
  CRect FilterRect() const;
  CPoint FloatOrigin() const;
  CSize WholeSize() const;
  CSize ImageSize() const;
  bool FloatsOverImage() const;
  // Where the image's coordinates lie in the channels' coordinates.
  CPoint TileOffset() const;
  // The image in the filter's coordinates: at the origin, or around the
  // floating selection's origin.
  CRect ImageRect() const;
  CRect LayerRect() const;
  std::uint32_t Depth() const;
  std::uint32_t ColorPlanes() const;
  std::uint32_t PixelLayout() const;
  std::uint32_t BytesPerSample() const { return Depth() / 8; }
  bool HasTransparency() const;
  double ResolutionX() const;
  double ResolutionY() const;
  // The document's title, from the Unicode property or else the 8-bit one.
  CString DocumentTitle() const;
  void Use32BitCoordinates(bool on);
  // Empties the host's request rectangles, both forms.
  void ClearRequests();

  // By host image mode, for all 18 modes.
  static std::uint32_t DepthOfMode(std::int32_t mode);
  static std::uint32_t ColorPlanesOfMode(std::int32_t mode);
  static std::uint32_t PixelLayoutOfMode(std::int32_t mode);

  // --- Pixels --------------------------------------------------------------------
  // Reads the channel named by selector into pixmap's planes (colour planes,
  // then transparency), with fallback for what the channel does not cover.
  // fillValues, one per plane, replaces zeros where the text says so. A
  // host's failure to read is a silent CAbort.
  void ReadPixmap(CMemoryPixmap& pixmap, std::int32_t selector, std::int32_t fallback,
                  std::int32_t mode, std::span<const std::uint32_t> fillValues = {});
  // Hands rect of pixmap's first planeCount planes (all when below 1) back to
  // the host. The host's cancel is a silent CAbort, another failure a
  // CSystemError with its code.
  void WritePixmap(const CMemoryPixmap& pixmap, const CRect& rect, std::int32_t planeCount);
  // Turns area of source's colour planes, 8-bit samples in mode (a 16-bit
  // mode stands for its 8-bit twin), into 8-bit sRGB in destination's planes
  // 0, 1 and 2, area's top left going to `to`: through the host's display
  // colour suite, in blocks of at most 512 x 512, else by the module's own
  // formulas (CDisplayConversion). Transparency stays with the caller.
  // CError unless both pixmaps are 8-bit and cover their areas.
  void ConvertToDisplay(std::int32_t mode, const CBasicPixmap& source, const CRect& area,
                        CBasicPixmap& destination, CPoint to);

 protected:
  static constexpr std::uint32_t kFlag_Interactive = 1u << 0;

  // Sets the record, data slot and selector of a handler.
  void Enter(HostFilterRecord* record, std::intptr_t* dataSlot, std::int16_t selector);

 private:
  struct ChannelChoice;
  bool FindChannel(std::int32_t selector, ChannelChoice& choice) const;
  bool HasChannelAccess();
  void ReadPlane(const HostChannelNode* node, CMemoryPixmap& pixmap, std::uint32_t plane,
                 const CRect& channelArea, const CRect& pixmapArea);
  std::int16_t Advance() const;

  HostFilterRecord* record_ = nullptr;
  std::intptr_t* dataSlot_ = nullptr;
  std::int16_t selector_ = -1;
  std::uint32_t flags_ = 0;
  std::uint8_t useBufferSuite_ = 1;
  std::uint8_t memoryReady_ = 0;
};

}  // namespace Tarsa
