#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>

#include "framework/files/CContainer.h"
#include "framework/files/CFilePort.h"

namespace Tarsa {

class CFile;

// A container over an existing file. It owns the port it opens and closes it
// when it dies. Every transfer names its place in the file, so the port's
// own mark needs no care between calls.
class CFileContainer : public CContainer {
 public:
  // Opens file through a port made with these arguments (a port never makes
  // a file: a missing one is the system's error), at position 0.
  explicit CFileContainer(const CFile& file, int mode = CFilePort::kMode_Read,
                          std::uint32_t reserved = 0, std::uint32_t flags = 0);

  CFilePort& Port() { return *port_; }
  void Flush() override { port_->Flush(); }

 protected:
  void DoSetSize(std::uint64_t size) override { port_->SetSize(size); }
  void DoSetPosition(std::uint64_t position) override { port_->SetReadPosition(position); }
  void DoRead(void* buffer, std::size_t count) override;
  void DoWrite(const void* buffer, std::size_t count) override {
    port_->WriteAt(buffer, count, Position());
  }

 private:
  std::unique_ptr<CFilePort> port_;
};

}  // namespace Tarsa
