#include "framework/strings/CStringTable.h"

#include <utility>

namespace Tarsa {

namespace {
// The framework's string table service.
std::unique_ptr<CStringTable>& Service() {
  static std::unique_ptr<CStringTable> service;
  return service;
}
}  // namespace

CStringTable::CStringTable() = default;

CStringTable::~CStringTable() {
  // Unlink the chains one node at a time: a long chain freed through nested
  // unique_ptr destructors would recurse once per node.
  for (auto& head : buckets_) {
    while (head) head = std::move(head->next);
  }
}

CStringTable* CStringTable::Get(bool create) {
  auto& service = Service();
  if (!service && create) service = std::make_unique<CStringTable>();
  return service.get();
}

void CStringTable::Drop() { Service().reset(); }

std::uint32_t CStringTable::Hash(std::string_view key) {
  std::uint32_t h = 0;
  for (unsigned char byte : key) h = ((h << 8) | byte) % kBucketCount;
  return h;
}

CStringTable::Node* CStringTable::FindNode(std::string_view key) const {
  for (Node* node = buckets_[Hash(key)].get(); node != nullptr; node = node->next.get()) {
    if (node->key == key) return node;
  }
  return nullptr;
}

bool CStringTable::Insert(std::string_view key, const CString& value, bool replace) {
  if (Node* node = FindNode(key)) {
    if (!replace) return false;
    node->value = value;
    return true;
  }
  auto node = std::make_unique<Node>();
  node->key = std::string(key);
  node->value = value;
  auto& head = buckets_[Hash(key)];
  node->next = std::move(head);
  head = std::move(node);
  ++count_;
  return true;
}

const CString* CStringTable::Find(std::string_view key) const {
  const Node* node = FindNode(key);
  return node != nullptr ? &node->value : nullptr;
}

void CStringTable::ForEach(
    const std::function<void(std::string_view key, const CString& value)>& visit) const {
  for (const auto& head : buckets_) {
    for (const Node* node = head.get(); node != nullptr; node = node->next.get()) {
      visit(node->key, node->value);
    }
  }
}

}  // namespace Tarsa
