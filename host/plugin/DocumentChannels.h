#pragma once

#include <memory>
#include <vector>

#include "framework/plugin/HostSuites.h"
#include "host/io/HostDocument.h"

namespace Host {

// The document's planes as the filter reads them: the record's documentInfo
// block with one channel node and one port per plane, and the two ways of
// reading a port (channelProcs' ReadPixels and the channel ports suite). A
// flat document is its own merged composite: the target and merged composite
// lists are the colour planes in order, the target transparency is the
// transparency plane when there is one; there are no masks and no alpha
// channels. Owns the block, nodes and ports; borrows the document, which must
// outlive it.
class DocumentChannels {
 public:
  // A plane's port; opaque to the filter.
  struct Port;

  explicit DocumentChannels(const HostDocument& document);
  ~DocumentChannels();

  DocumentChannels(const DocumentChannels&) = delete;
  DocumentChannels& operator=(const DocumentChannels&) = delete;

  Tarsa::HostDocumentInfo* Info() { return info_.get(); }
  // Reads from now on come from document, which has the same size, mode and
  // planes and must outlive this.
  void ReadFrom(const HostDocument& document);
  // The node of a plane, colour planes first; for tests.
  const Tarsa::HostChannelNode* Node(int plane) const { return nodes_[plane].get(); }

  static const Tarsa::HostChannelProcs* Procs();
  static const Tarsa::HostChannelPortsSuite* PortsSuite();

 private:
  std::unique_ptr<Tarsa::HostDocumentInfo> info_;
  std::vector<std::unique_ptr<Port>> ports_;
  std::vector<std::unique_ptr<Tarsa::HostChannelNode>> nodes_;
};

}  // namespace Host
