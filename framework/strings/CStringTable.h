#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>

#include "framework/strings/CString.h"

namespace Tarsa {

// The table of localised texts: key (8-bit text, without the "$$$" but with
// its first "/") to resolved text. A fixed array of 1021 chains, new keys at
// the head of their chain. The framework keeps one as a service, created on
// first use by Get(true) and owned by this class until Drop(); the nodes are
// owned by their table. Main thread only.
class CStringTable {
 public:
  static constexpr std::uint32_t kBucketCount = 1021;

  CStringTable();
  ~CStringTable();
  CStringTable(const CStringTable&) = delete;
  CStringTable& operator=(const CStringTable&) = delete;

  // The service; with create false, null until someone has created it.
  static CStringTable* Get(bool create);
  // Ends the service (framework shutdown, tests); the next Get(true) starts
  // an empty table.
  static void Drop();

  // h := ((h << 8) | byte) mod 1021, over the key's bytes.
  static std::uint32_t Hash(std::string_view key);

  // An existing key takes the value only when replace is set, and then the
  // answer is true; an existing key left alone answers false. A new key is
  // added and answers true.
  bool Insert(std::string_view key, const CString& value, bool replace);
  // The key's text, or null; valid until the key is replaced or the table goes.
  const CString* Find(std::string_view key) const;

  std::size_t Count() const { return count_; }
  // Every entry, chain by chain (diagnostics and tests).
  void ForEach(const std::function<void(std::string_view key, const CString& value)>& visit) const;

 private:
  struct Node {
    std::string key;
    CString value;
    std::unique_ptr<Node> next;
  };

  Node* FindNode(std::string_view key) const;

  std::array<std::unique_ptr<Node>, kBucketCount> buckets_;
  std::size_t count_ = 0;
};

}  // namespace Tarsa
