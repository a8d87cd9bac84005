#pragma once

#include <cstdint>
#include <vector>

namespace Project {

// The fill-reducing order of the sparse solve, kept between solves when
// caching is on: permutation[k] is the one-based unknown eliminated k-th.
// The warp solver owns one and hands it to every solve; the first solve
// with cachePermutation set fills it and sets hasPermutation, later ones
// reuse it and skip the ordering stage.
struct EliminationOrder {
  std::vector<std::int32_t> permutation;
  bool hasPermutation = false;
  bool cachePermutation = false;
};

// Resizes the order to unknownCount after the unknowns beyond the first
// vertexUnknowns changed in number: the vertex part keeps its order and the
// rest follow in their natural order (entry i holds i + 1). An order that
// was computed with extra unknowns interleaved has those dropped from its
// head first, so the result is always a permutation of 1 .. unknownCount.
void RelabelPermutationTail(EliminationOrder& order, std::int32_t vertexUnknowns,
                            std::int32_t unknownCount);

}  // namespace Project
