#pragma once

#include <cstddef>
#include <cstdint>

namespace Tarsa {

class CFile;

// The thin layer over an open file of the system. A port opens only files
// that exist: it never makes one. It keeps one file mark, which serves as
// both the read and the write mark. The port owns its handle and closes it
// when it dies; it is not copyable.
class CFilePort {
 public:
  enum Mode : int {
    kMode_Read = 0,
    kMode_ReadWrite = 1,
  };

  CFilePort() = default;
  // Opens file; on failure the port is closed and the error passes on.
  CFilePort(const CFile& file, int mode, std::uint32_t reserved = 0, std::uint32_t flags = 0);
  virtual ~CFilePort();

  CFilePort(const CFilePort&) = delete;
  CFilePort& operator=(const CFilePort&) = delete;

  virtual bool IsOpen() const;
  // Closes first; kMode_ReadWrite opens for reading and writing, any other
  // mode for reading.
  virtual void Open(const CFile& file, int mode, std::uint32_t reserved = 0);
  // Idempotent.
  virtual void Close();
  virtual std::uint64_t GetSize() const;
  // Cuts or extends the file; the mark moves to the new end.
  virtual void SetSize(std::uint64_t size);
  virtual std::uint64_t GetPosition() const;
  virtual void SetReadPosition(std::uint64_t position);
  virtual void SetWritePosition(std::uint64_t position) { SetReadPosition(position); }
  virtual void MoveReadPosition(std::int64_t delta);
  virtual void MoveWritePosition(std::int64_t delta) { MoveReadPosition(delta); }
  virtual void Write(const void* buffer, std::size_t count);
  virtual void WriteAt(const void* buffer, std::size_t count, std::uint64_t position);
  virtual void WriteBy(const void* buffer, std::size_t count, std::int64_t delta);
  // A count of 0 does nothing; a read that finds no byte at all is the
  // end-of-file error; a short read is no error, and the count read returns.
  virtual std::size_t Read(void* buffer, std::size_t count);
  virtual std::size_t ReadAt(void* buffer, std::size_t count, std::uint64_t position);
  virtual std::size_t ReadBy(void* buffer, std::size_t count, std::int64_t delta);
  virtual void Flush();

  std::uint32_t Flags() const { return flags_; }

 private:
  int handle_ = -1;          // -1: closed
  std::uint32_t flags_ = 0;  // kept as given
  std::uint64_t position_ = 0;
};

}  // namespace Tarsa
