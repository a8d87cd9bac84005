#include "solver/iterative/IterativeWarpSolver.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <functional>
#include <utility>

namespace Project {

namespace {

constexpr float kLimitedSpan = 2.617994f;  // 150 degrees
constexpr float kSeamStart = 2.792527f;    // 160 degrees
constexpr float kTaperLat = 1.1623893f;    // 66.6 degrees

using Clock = std::chrono::steady_clock;

double SecondsSince(Clock::time_point start) {
  return std::chrono::duration<double>(Clock::now() - start).count();
}

// Which systems are solved on a kept factor, and how closely. Only one whose
// entries moved by a millionth at most: a system of the Gauss-Newton road
// changes with every step in its line rows, and those changes couple to the
// nearly free similarity motions of the whole mesh (its anchors weigh
// 0.001), so conjugate gradients on the last iteration's factor stalled at
// a residual near 1e-3 after twelve steps, each some 5 ms. A residual 1e-8
// of the right side's leaves the step exact to far below a pixel.
constexpr PreconditionedLimits kNearFactor{1e-6, 1e-8, 4};

void AddStats(SolveProfile& profile, const SparseSolveStats& stats) {
  profile.analyseSeconds += stats.analyseSeconds;
  profile.factorSeconds += stats.factorSeconds;
  profile.solveSeconds += stats.solveSeconds;
  profile.peakBytes = std::max(profile.peakBytes, stats.peakBytes);
  // A solve on a kept factor reports none of its own.
  if (stats.factorNonzeros > 0.0) {
    profile.factorNonzeros = stats.factorNonzeros;
    profile.factorFlops = stats.factorFlops;
  }
}

}  // namespace

IterativeWarpSolver::IterativeWarpSolver(std::shared_ptr<const OctaMap> octaMap,
                                         std::shared_ptr<const PhotoToSphere> imageModel,
                                         const IterativeWarpSettings& settings)
    : octaMap_(std::move(octaMap)),
      imageModel_(std::move(imageModel)),
      settings_(settings),
      regularizer_(MakeClosedFormWarp(settings.warpModel, octaMap_, imageModel_)),
      gridSize_(octaMap_->Width()),
      vertexCount_(gridSize_ * gridSize_),
      halfGrid_(gridSize_ / 2),
      unknownCount_(2 * vertexCount_),
      constantBuilder_(unknownCount_),
      iterationBuilder_(unknownCount_),
      solution_(unknownCount_, 0.0),
      constantRhs_(unknownCount_, 0.0),
      iterationRhs_(unknownCount_, 0.0),
      vertexState_(static_cast<std::size_t>(vertexCount_)),
      pictureState_(static_cast<std::size_t>(vertexCount_)) {
  order_.cachePermutation = settings.cachePermutation;
  order_.permutation.assign(unknownCount_, 0);
}

void IterativeWarpSolver::FoldVertex(std::int32_t& i, std::int32_t& j) const {
  const std::int32_t last = gridSize_ - 1, h = halfGrid_;
  if (i == last && j > h) j = 2 * h - j;
  if (j == last && i > h) i = 2 * h - i;
  if (j == 0 && i > h) i = 2 * h - i;
  if (i == 0 && j > h) j = 2 * h - j;
}

void IterativeWarpSolver::StepVertex(std::int32_t& i, std::int32_t& j, std::int32_t di,
                                     std::int32_t dj) const {
  const std::int32_t n = gridSize_, h = halfGrid_;
  i += di;
  j += dj;
  if (i > n - 1) {
    if (j == h) {
      i = n - 1;
      j = h - 1;
    } else {
      i = n - 2;
      j = n - j - 1;
    }
  }
  if (i < 0) {
    if (j == h) {
      i = 0;
      j = h - 1;
    } else {
      i = 1;
      j = n - j - 1;
    }
  }
  if (j < 0) {
    if (i == h) {
      i = h - 1;
      j = 0;
    } else {
      i = n - i - 1;
      j = 1;
    }
  }
  if (j > n - 1) {
    i = i == h ? h - 1 : n - i - 1;
    j = n - 1;
  }
  FoldVertex(i, j);
}

std::int32_t IterativeWarpSolver::UnknownOf(std::int32_t i, std::int32_t j) const {
  FoldVertex(i, j);
  return 2 * (j * gridSize_ + i);
}

bool IterativeWarpSolver::IsFoldedHalf(std::int32_t i, std::int32_t j) const {
  const std::int32_t last = gridSize_ - 1, h = halfGrid_;
  return (i == last && j > h) || (j == last && i > h) || (j == 0 && i > h) || (i == 0 && j > h);
}

bool IterativeWarpSolver::InsideLimits(float lat, float lon) const {
  const IterativeWarpSettings& s = settings_;
  return !(s.latMin > lat || lat > s.latMax || s.lonMin > lon || lon > s.lonMax);
}

bool IterativeWarpSolver::TexCoordInPicture(std::int32_t i, std::int32_t j) const {
  std::atomic<std::uint8_t>& state = pictureState_[static_cast<std::size_t>(i) * gridSize_ + j];
  const std::uint8_t known = state.load(std::memory_order_relaxed);
  if (known != 0) return known == 1;
  float lat, lon, uv[2];
  octaMap_->GetDirection(i, j, lat, lon);
  imageModel_->GetTexCoord(lon, lat, uv);
  const bool inside = uv[0] >= 0.0f && uv[0] <= 1.0f && uv[1] >= 0.0f && uv[1] <= 1.0f;
  state.store(inside ? 1 : 2, std::memory_order_relaxed);
  return inside;
}

bool IterativeWarpSolver::IsVertexInside(std::int32_t i, std::int32_t j) const {
  if (i < 0 || j < 0 || i > gridSize_ - 1 || j > gridSize_ - 1) return false;
  std::atomic<std::uint8_t>& state = vertexState_[static_cast<std::size_t>(i) * gridSize_ + j];
  const std::uint8_t known = state.load(std::memory_order_relaxed);
  if (known != 0) return known == 1;
  bool cache = true;
  const bool inside = ComputeVertexInside(i, j, cache);
  if (cache) state.store(inside ? 1 : 2, std::memory_order_relaxed);
  return inside;
}

bool IterativeWarpSolver::ComputeVertexInside(std::int32_t i, std::int32_t j, bool& cache) const {
  float lat, lon;
  octaMap_->GetDirection(i, j, lat, lon);
  const IterativeWarpSettings& s = settings_;
  if (s.isLimited) {
    if (s.lonMin > -kLimitedSpan && kLimitedSpan > s.lonMax) {
      if (!InsideLimits(lat, lon)) return false;
    } else {
      // A picture all the way round: the latitude limits taper towards the
      // seam behind the view, so the mesh closes there.
      if (!(lon > s.lonMin && s.lonMax > lon)) return false;
      if (std::fabs(lon) < kSeamStart) return lat > s.latMin && s.latMax > lat;
      const float t = lon > 0 ? (lon - kSeamStart) / (s.lonMax - kSeamStart)
                              : (lon + kSeamStart) / (s.lonMin + kSeamStart);
      const float a = std::max(0.0f, -kTaperLat - s.latMin);
      const float b = std::max(0.0f, s.latMax - kTaperLat);
      return lat > s.latMin + a * t && s.latMax - b * t > lat;
    }
  }
  const bool contained = imageModel_->Contains(lon, lat);
  if (imageModel_->WalksToCentre()) {
    if (contained) return WalksInside(i, j);
    // One ring past the cover, where the model still places the direction,
    // so that the cover's edge runs through drawn cells.
    if (!imageModel_->Reaches(lon, lat)) return false;
    return AnyNeighbour(i, j, [this](std::int32_t ni, std::int32_t nj, float nLat, float nLon) {
      return imageModel_->Contains(nLon, nLat) && WalksInside(ni, nj);
    });
  }
  if (contained) {
    // Panoramic models leave a contained vertex uncached.
    cache = false;
    return true;
  }
  return AnyNeighbour(i, j, [this](std::int32_t, std::int32_t, float nLat, float nLon) {
    return imageModel_->Contains(nLon, nLat);
  });
}

bool IterativeWarpSolver::AnyNeighbour(
    std::int32_t i, std::int32_t j,
    const std::function<bool(std::int32_t, std::int32_t, float, float)>& test) const {
  for (std::int32_t dj = -1; dj <= 1; ++dj) {
    for (std::int32_t di = -1; di <= 1; ++di) {
      const std::int32_t ni = i + di, nj = j + dj;
      if ((di == 0 && dj == 0) || ni < 0 || nj < 0 || ni >= gridSize_ || nj >= gridSize_) {
        continue;
      }
      float nLat, nLon;
      octaMap_->GetDirection(ni, nj, nLat, nLon);
      if (test(ni, nj, nLat, nLon)) return true;
    }
  }
  return false;
}

bool IterativeWarpSolver::WalksInside(std::int32_t i, std::int32_t j) const {
  // Walk straight to the map's centre: a vertex whose path leaves the
  // picture and comes back (the far side of a fisheye) is not mesh, and
  // the mesh reaches borderExpand steps past the picture's edge.
  const bool start = TexCoordInPicture(i, j);
  const std::int32_t centre = (gridSize_ - 1) / 2;
  bool last = start;
  std::int32_t changes = 0, steps = 0, taken = 0;
  std::int32_t wi = i, wj = j;
  while (wi != centre || wj != centre) {
    if (wi != centre) wi += wi < centre ? 1 : -1;
    if (wj != centre) wj += wj < centre ? 1 : -1;
    ++taken;
    const bool here = TexCoordInPicture(wi, wj);
    if (here != last) {
      if (changes == 0) steps = taken;
      ++changes;
      last = here;
    }
  }
  return (start && changes == 0) || (!start && changes == 1 && steps <= settings_.borderExpand);
}

bool IterativeWarpSolver::IsQuadInside(std::int32_t i, std::int32_t j) const {
  return AllCornersInside(i, j);
}

void IterativeWarpSolver::GetVertexPosition(std::int32_t i, std::int32_t j, float& outU,
                                            float& outV) const {
  const std::int32_t k = UnknownOf(i, j);
  outU = static_cast<float>(solution_[k]);
  outV = static_cast<float>(solution_[k + 1]);
}

void IterativeWarpSolver::AddRow(SparseBuilder& builder, const std::int32_t* q, const double* c,
                                 std::int32_t n, double r, std::vector<double>* rhs) {
  for (std::int32_t a = 0; a < n; ++a) {
    builder.Add(q[a], q[a], static_cast<float>(c[a] * c[a]));
    for (std::int32_t b = a + 1; b < n; ++b) {
      const double product = static_cast<float>(c[a] * c[b]);
      if (q[a] == q[b]) {
        builder.Add(q[a], q[a], 2.0 * product);
      } else {
        builder.Add(std::min(q[a], q[b]), std::max(q[a], q[b]), product);
      }
    }
    if (rhs != nullptr) (*rhs)[q[a]] += -r * c[a];
  }
}

void IterativeWarpSolver::AssembleConstantPart() {
  const Clock::time_point start = Clock::now();
  constantBuilder_.Clear();
  std::fill(constantRhs_.begin(), constantRhs_.end(), 0.0);
  const std::int32_t n = gridSize_, c = n / 2;
  for (std::int32_t j = 0; j < n; ++j) {
    for (std::int32_t i = 0; i < n; ++i) {
      double w = settings_.regularWeight;
      if (settings_.anchorBorderOnly) {
        if (!IsVertexInside(i, j)) continue;
        bool border = false;
        for (std::int32_t dj = -1; dj <= 1 && !border; ++dj) {
          for (std::int32_t di = -1; di <= 1 && !border; ++di) {
            if ((di != 0 || dj != 0) && !IsVertexInside(i + di, j + dj)) border = true;
          }
        }
        if (!border) continue;
      } else if (settings_.highCenterWeight && i == c && j == c) {
        w = static_cast<float>(settings_.regularWeight + 1.0f);
      }
      const std::int32_t k = 2 * (j * n + i);
      float tu, tv;
      regularizer_->GetVertexPosition(i, j, tu, tv);
      constantBuilder_.Set(k, k, w);
      constantBuilder_.Set(k + 1, k + 1, w);
      constantRhs_[k] = static_cast<float>(w * tu);
      constantRhs_[k + 1] = static_cast<float>(w * tv);
    }
  }
  for (std::int32_t j = 0; j < n - 1; ++j) {
    for (std::int32_t i = 0; i < n - 1; ++i) {
      if (IsQuadInside(i, j)) AddConformalQuad(i, j);
    }
  }
  for (std::int32_t j = 0; j < n; ++j) {
    for (std::int32_t i = 0; i < n; ++i) {
      if (IsVertexInside(i, j) && !IsFoldedHalf(i, j)) AddSmoothnessVertex(i, j);
    }
  }
  // Unused unknowns solve to b / 1, which keeps the matrix positive definite.
  for (std::int32_t r = 0; r < 2 * vertexCount_; ++r) {
    if (constantBuilder_.RowEntryCount(r) == 0) constantBuilder_.Set(r, r, 1.0);
  }
  constantMatrix_ = std::make_unique<CompressedMatrix>(constantBuilder_);
  constantAssembled_ = true;
  profile_.constantSeconds += SecondsSince(start);
}

void IterativeWarpSolver::Reset() {
  constantAssembled_ = false;
  // The constant part follows the grid's rotation: a factor of the old one
  // is a poor start for the new.
  if (sparse_ != nullptr) sparse_->DropFactor();
}

void IterativeWarpSolver::SetSolveChoices(const SolveChoices& choices) {
  choices_ = choices;
  if (!choices.keepFactor) sparse_.reset();
}

EliminationOrder& IterativeWarpSolver::SolveOrder(EliminationOrder& vertexFirst) {
  if (settings_.cachePermutation || !choices_.vertexBlockOrder || !IterationRowsStayInCells()) {
    return order_;
  }
  if (!vertexOrderTried_) {
    vertexOrderTried_ = true;
    if (!OrderLeadingBlock(*constantMatrix_, 2 * vertexCount_, vertexOrder_)) vertexOrder_.clear();
    vertexOrder_.resize(vertexOrder_.empty() ? 0 : 2 * vertexCount_);
  }
  if (vertexOrder_.empty()) return order_;
  vertexFirst.cachePermutation = true;
  vertexFirst.hasPermutation = true;
  vertexFirst.permutation = vertexOrder_;
  RelabelPermutationTail(vertexFirst, 2 * vertexCount_, unknownCount_);
  return vertexFirst;
}

void IterativeWarpSolver::ResizeUnknowns(std::int32_t unknowns) {
  EnsureConstantPart();
  unknownCount_ = unknowns;
  solution_.resize(unknowns, 0.0);
  constantRhs_.resize(unknowns, 0.0);
  iterationRhs_.assign(unknowns, 0.0);
  constantBuilder_.Resize(unknowns);
  constantMatrix_ = std::make_unique<CompressedMatrix>(constantBuilder_);
  iterationBuilder_.Resize(unknowns);
  iterationBuilder_.Clear();
  RelabelPermutationTail(order_, 2 * vertexCount_, unknowns);
}

bool IterativeWarpSolver::SolveSystem(SparseSession& sparse, bool tryKeptFactor,
                                      const CompressedMatrix& system, std::span<const double> rhs,
                                      std::span<double> answer, EliminationOrder& order) {
  SparseSolveStats stats;
  if (tryKeptFactor) {
    const bool solved = sparse.SolvePreconditioned(system, rhs, answer, kNearFactor, &stats);
    profile_.gradientSteps += stats.gradientSteps;
    AddStats(profile_, stats);
    if (solved) return true;
    stats = SparseSolveStats{};
  }
  const bool solved = sparse.Solve(system, rhs, answer, order, &stats);
  ++profile_.factorizations;
  AddStats(profile_, stats);
  return solved;
}

void IterativeWarpSolver::Solve() {
  EnsureConstantPart();
  Clock::time_point start = Clock::now();
  if (settings_.useGaussNewton) PrepareGaussNewton();
  profile_.prepareSeconds += SecondsSince(start);
  succeeded_ = true;
  iterationsRun_ = 0;
  std::vector<double> rhs(unknownCount_), step(unknownCount_);
  // On the Gauss-Newton road the system keeps its pattern from one
  // iteration to the next, so it is ordered and analysed once; the other
  // road's two forms of line rows differ in pattern, and each change is
  // analysed anew. That road replaces the solution rather than stepping
  // from it, and factors every system.
  const SparseRoad road =
      settings_.useGaussNewton && settings_.usePardiso ? SparseRoad::kPardiso : SparseRoad::kDss;
  const bool keep = settings_.useGaussNewton && choices_.keepFactor;
  if (keep && sparse_ == nullptr) sparse_ = std::make_unique<SparseSession>(road);
  std::unique_ptr<SparseSession> local = keep ? nullptr : std::make_unique<SparseSession>(road);
  SparseSession& sparse = keep ? *sparse_ : *local;
  sparse.SetSerialLibraryLoops(choices_.serialLibraryLoops);
  EliminationOrder vertexFirst;
  EliminationOrder& order = SolveOrder(vertexFirst);
  for (std::int32_t iteration = 0; iteration < settings_.iterationCount; ++iteration) {
    start = Clock::now();
    const SolveProfile before = profile_;
    iterationBuilder_.Clear();
    std::fill(iterationRhs_.begin(), iterationRhs_.end(), 0.0);
    AddIterationTerms(iteration);
    // An extra unknown that no row reaches (a polygon that sampled nothing)
    // keeps its value: a unit diagonal and no right side.
    for (std::int32_t r = 2 * vertexCount_; r < unknownCount_; ++r) {
      if (iterationBuilder_.RowEntryCount(r) == 0 && constantBuilder_.RowEntryCount(r) == 0) {
        iterationBuilder_.Set(r, r, 1.0);
      }
    }
    const CompressedMatrix system =
        CompressedMatrix::Sum(*constantMatrix_, CompressedMatrix(iterationBuilder_));
    bool solved;
    if (!settings_.useGaussNewton) {
      for (std::int32_t r = 0; r < unknownCount_; ++r) {
        rhs[r] = constantRhs_[r] + iterationRhs_[r];
      }
      solved = SolveSystem(sparse, false, system, rhs, step, order);
      if (solved) solution_ = step;
    } else {
      constantMatrix_->MultiplySymmetric(solution_, rhs);
      for (std::int32_t r = 0; r < unknownCount_; ++r) {
        rhs[r] = constantRhs_[r] + iterationRhs_[r] - rhs[r];
      }
      solved = SolveSystem(sparse, keep && sparse.HasFactor(), system, rhs, step, order);
      if (solved) {
        for (std::int32_t r = 0; r < unknownCount_; ++r) solution_[r] += step[r];
      }
    }
    if (!solved) {
      succeeded_ = false;
      return;
    }
    ++iterationsRun_;
    ++profile_.iterations;
    const double measure = ConvergenceMeasure();
    profile_.assemblySeconds += SecondsSince(start) -
                                (profile_.analyseSeconds - before.analyseSeconds) -
                                (profile_.factorSeconds - before.factorSeconds) -
                                (profile_.solveSeconds - before.solveSeconds);
    if (measure >= 0.0 && measure < settings_.convergedMeasure) break;
  }
}

double IterativeWarpSolver::TotalEnergy() {
  EnsureConstantPart();
  std::vector<double> product(unknownCount_);
  constantMatrix_->MultiplySymmetric(solution_, product);
  double energy = 0.0;
  for (std::int32_t r = 0; r < unknownCount_; ++r) {
    energy += 0.5 * solution_[r] * product[r] - constantRhs_[r] * solution_[r];
  }
  for (std::int32_t j = 0; j < gridSize_; ++j) {
    for (std::int32_t i = 0; i < gridSize_; ++i) {
      if (!IsVertexInside(i, j)) continue;
      if (IsVertexInside(i - 1, j) && IsVertexInside(i + 1, j) && IsVertexInside(i, j - 1) &&
          IsVertexInside(i, j + 1)) {
        continue;
      }
      float tu, tv;
      regularizer_->GetVertexPosition(i, j, tu, tv);
      energy += (double(tu) * tu + double(tv) * tv) * 0.5 * settings_.regularWeight;
    }
  }
  return energy;
}

}  // namespace Project
