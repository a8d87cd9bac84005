#include "framework/icons/CResourceDataProvider.h"

#include <mutex>

#include "framework/core/CException.h"
#include "framework/resource/ModuleResources.h"

namespace Tarsa {
namespace {

constexpr const char* kNoIndex =
    "$$$/Tarsa/Icons/Error/NoIndex=The module's icon resources are missing.";
constexpr const char* kDamagedIndex =
    "$$$/Tarsa/Icons/Error/DamagedIndex=The module's icon index is damaged.";

}  // namespace

CResourceDataProvider::CResourceDataProvider(CResourceTable table)
    : table_(std::make_unique<const CResourceTable>(std::move(table))) {
  const CResourceTable::Entry* index = table_->Find(kIndexType, kIndexName);
  if (index == nullptr) throw CError(kNoIndex);
  if (!ParseIndex(index->data.data(), index->data.size())) throw CError(kDamagedIndex);
}

CResourceDataProvider::~CResourceDataProvider() = default;

const CResourceDataProvider& CResourceDataProvider::Module() {
  // Built under the lock so that two threads asking at once share one; a
  // failure leaves nothing behind, and the next call tries again.
  static std::mutex lock;
  static std::unique_ptr<const CResourceDataProvider> module;
  const std::lock_guard<std::mutex> hold(lock);
  if (!module) module = std::make_unique<const CResourceDataProvider>(ModuleResourceTable());
  return *module;
}

std::span<const std::uint8_t> CResourceDataProvider::LoadBlock(const std::string& name) const {
  const CResourceTable::Entry* block = table_->Find(kDataType, name);
  if (block == nullptr) return {};
  return block->data;
}

}  // namespace Tarsa
