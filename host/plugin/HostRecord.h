#pragma once

#include <cstdint>
#include <memory>
#include <optional>

#include "framework/plugin/HostSuites.h"
#include "host/io/HostDocument.h"
#include "host/plugin/Descriptor.h"
#include "host/plugin/HostProperties.h"
#include "host/plugin/RunObserver.h"

namespace Host {

class BlockExchange;
class DisplayColour;
class DocumentChannels;

// The record served to the filter for one document, and everything hanging
// from it: the 32-bit coordinate block, the callback tables, the document's
// channels, the script block with its descriptor handle. The image is the
// whole document (the filter rectangle covers it, nothing floats). The
// record's callbacks carry no argument, so while a Scope lives they reach
// this record through the one pointer the host keeps for that; the filter
// may call them only inside a selector. Owns the record and all it points
// to, the descriptor handle it puts in the script block and the one the
// filter leaves there; borrows the document and the observer, which must
// outlive it. Its address must not change while the filter holds it.
class HostRecord {
 public:
  struct Settings {
    HostProperties::Settings properties;
    // The memory offered to the filter, in bytes.
    uint32_t memoryOffer = 0;
    // The script block's play mode: 1 silent, 2 with the filter's dialog.
    int16_t playMode = 1;
  };

  // The host's signature in the record.
  static constexpr uint32_t kSignature = Tarsa::FourCC("Arwy");

  HostRecord(HostDocument& document, Settings settings, RunObserver& observer);
  ~HostRecord();

  HostRecord(const HostRecord&) = delete;
  HostRecord& operator=(const HostRecord&) = delete;

  Tarsa::HostFilterRecord* Record() { return record_.get(); }
  BlockExchange& Blocks() { return *blocks_; }
  HostProperties& Properties() { return *properties_; }
  // The document's display conversion, served as the display colour suite.
  DisplayColour& Display() { return *display_; }
  // The record whose selector is running (inside a Scope), or null.
  static HostRecord* Active();

  // Puts a descriptor for the filter to read into the script block.
  void SetDescriptor(const Descriptor& descriptor);
  // The descriptor the filter left in the script block; nullopt when it left
  // none. Throws HostError when the handle's bytes are not a descriptor.
  std::optional<Descriptor> LeftDescriptor() const;

  // Half the machine's memory, at most 2 GiB: the filter takes a share of it
  // and pages the rest of its tiles to the scratch volume.
  static uint32_t DefaultMemoryOffer();

  // The record whose callbacks are live for the scope's life.
  class Scope {
   public:
    explicit Scope(HostRecord& record);
    ~Scope();
    Scope(const Scope&) = delete;
    Scope& operator=(const Scope&) = delete;

   private:
    HostRecord* previous_;
  };

 private:
  friend struct HostRecordCallbacks;

  RunObserver& observer_;
  std::unique_ptr<Tarsa::HostFilterRecord> record_;
  std::unique_ptr<Tarsa::HostCoordinates32> coordinates_;
  std::unique_ptr<Tarsa::HostScriptBlock> script_;
  std::unique_ptr<void*[]> platform_;
  // The document as the run found it, kept from the first block written
  // back: the filter reads its planes from here while the blocks change the
  // document itself, so that a tile drawn late never reads pixels an earlier
  // tile already replaced.
  std::unique_ptr<const HostDocument> original_;
  std::unique_ptr<DocumentChannels> channels_;
  std::unique_ptr<BlockExchange> blocks_;
  std::unique_ptr<HostProperties> properties_;
  std::unique_ptr<DisplayColour> display_;
  Tarsa::HostHandle descriptorIn_ = nullptr;
};

}  // namespace Host
