#include "solver/sparse/EliminationOrder.h"

#include <algorithm>
#include <utility>

namespace Project {

void RelabelPermutationTail(EliminationOrder& order, std::int32_t vertexUnknowns,
                            std::int32_t unknownCount) {
  const std::int32_t head = std::clamp(vertexUnknowns, 0, unknownCount);
  std::vector<std::int32_t> relabelled;
  relabelled.reserve(static_cast<std::size_t>(unknownCount));
  // The vertex unknowns in the order they had. An order that never was (or
  // was cut short) leaves some of them unplaced; those follow in natural
  // order, so the result is a permutation whatever came in.
  std::vector<bool> placed(static_cast<std::size_t>(head), false);
  for (const std::int32_t entry : order.permutation) {
    if (entry >= 1 && entry <= head && !placed[entry - 1]) {
      placed[entry - 1] = true;
      relabelled.push_back(entry);
    }
  }
  for (std::int32_t i = 0; i < head; ++i) {
    if (!placed[i]) relabelled.push_back(i + 1);
  }
  for (std::int32_t i = head; i < unknownCount; ++i) relabelled.push_back(i + 1);
  order.permutation = std::move(relabelled);
}

}  // namespace Project
