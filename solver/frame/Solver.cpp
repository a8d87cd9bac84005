#include "solver/frame/Solver.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>

#include "lens/sphere/FisheyeImage.h"
#include "solver/iterative/LineSolve.h"
#include "solver/warp/MercatorClosedForm.h"

namespace Project {

namespace {

constexpr float kWideRange = 2.0943952f;          // 120 degrees
constexpr float kLimitedRange = 5.2359881f;       // 300 degrees
constexpr float kNearlyAround = 6.1435595f;       // 352 degrees
constexpr float kLonLimit = 3.0717797f;           // 176 degrees
constexpr float kSphericalLatLimit = 1.2915437f;  // 74 degrees

constexpr float kLargest = std::numeric_limits<float>::max();

// A box of points, empty until the first point widens it.
struct Extent {
  float minX = kLargest, minY = kLargest, maxX = -kLargest, maxY = -kLargest;
  void Add(float x, float y) {
    minX = std::min(minX, x);
    maxX = std::max(maxX, x);
    minY = std::min(minY, y);
    maxY = std::max(maxY, y);
  }
};

}  // namespace

Solver::Solver(SolverContext& context) : context_(context) {}

Solver::~Solver() = default;

void Solver::Initialize() {
  const PSettings& settings = context_.Settings();
  octaMap_ = std::make_shared<OctaMap>(settings.meshResolution, settings.useDebugSolve != 0);
  gridSize_ = octaMap_->Width();
  cellCount_ = gridSize_ - 1;
  const std::size_t vertices = static_cast<std::size_t>(gridSize_) * gridSize_;
  positions_.assign(vertices * 2, 0.0f);
  texCoords_.assign(vertices * 2, 0.0f);
  cellMask_.assign(static_cast<std::size_t>(cellCount_) * cellCount_, 0);
  const std::int32_t width = context_.SourceWidth(), height = context_.SourceHeight();
  auto image = std::make_shared<Image>(width, height);
  imageModel_ =
      std::make_shared<FisheyeImage>(image, settings.focalLength, 0.5f * width, 0.5f * height);
  lines_ = std::make_shared<GeodesicLines>(octaMap_, imageModel_, settings.meshUseTriangle != 0);
  warp_ = std::make_shared<MercatorClosedForm>(octaMap_, imageModel_);
  lines_->SetWarp(warp_.get());
}

void Solver::RebuildGrid(bool userChanged) {
  const PSettings& settings = context_.Settings();
  octaMap_ = std::make_shared<OctaMap>(settings.meshResolution, settings.useDebugSolve != 0);
  gridSize_ = octaMap_->Width();
  cellCount_ = gridSize_ - 1;
  const std::size_t vertices = static_cast<std::size_t>(gridSize_) * gridSize_;
  positions_.assign(vertices * 2, 0.0f);
  texCoords_.assign(vertices * 2, 0.0f);
  cellMask_.assign(static_cast<std::size_t>(cellCount_) * cellCount_, 0);
  isWide_ = false;
  BuildWarp(userChanged);
}

void Solver::ChooseWarpModel() {
  const std::int32_t model = context_.Settings().regularizerModel;
  if (model != PSettings::kRegularizerAuto) {
    warpModel_ = model;
    return;
  }
  const PhotoInfo* photo = context_.Photo();
  const bool panorama = photo != nullptr && photo->HasPanorama();
  warpModel_ = panorama || context_.Settings().projectionModel == PSettings::kModelFullSpherical
                   ? PSettings::kRegularizerMercator
                   : PSettings::kRegularizerPanini;
}

bool Solver::BuildImageModel() {
  auto image = std::make_shared<Image>(context_.SourceWidth(), context_.SourceHeight());
  std::shared_ptr<PhotoToSphere> model;
  if (context_.BuildImageModel(image, model)) {
    imageModel_ = std::move(model);
    return true;
  }
  // A profile whose camera model cannot be projected leaves the photo with
  // no model of its own: it is taken as a fisheye of the focal setting,
  // which is where the projection's resolution falls back too.
  const PSettings& settings = context_.Settings();
  imageModel_ = std::make_shared<FisheyeImage>(image, settings.focalLength, 0.5f * image->width,
                                               0.5f * image->height);
  return false;
}

std::shared_ptr<SphereWarp> Solver::MakeWarp() {
  const PSettings& p = context_.Settings();
  IterativeWarpSettings settings;
  settings.regularWeight = p.regularWeight;
  settings.iterationCount = p.iterationNumber;
  settings.cachePermutation = p.cacheDssPermutation != 0;
  settings.highCenterWeight = p.highCenterWeight != 0;
  settings.warpModel = warpModel_;
  settings.borderExpand = p.borderExpand;
  settings.anchorBorderOnly = p.regWeightApplyTo != 0;
  settings.useGaussNewton = p.gaussNewtonSolver != 0;
  settings.usePardiso = p.pardisoSolver != 0;
  settings.isLimited = isLimited_;
  settings.latMin = latMin_;
  settings.latMax = latMax_;
  settings.lonMin = lonMin_;
  settings.lonMax = lonMax_;
  settings.convergedMeasure = p.convergedMeasure;
  const LineSolveWeights weights{p.lineWeight, p.conformalWeight, p.smoothnessWeight};
  return std::make_shared<LineSolve>(octaMap_, imageModel_, lines_, settings, weights);
}

void Solver::PrepareWarp(bool userChanged, bool keepLines) {
  userChanged_ = userChanged;
  isLimited_ = false;
  BuildImageModel();
  ChooseWarpModel();
  if (keepLines && lines_ != nullptr) {
    lines_->SetImageModel(imageModel_);
  } else {
    lines_ = std::make_shared<GeodesicLines>(octaMap_, imageModel_,
                                             context_.Settings().meshUseTriangle != 0);
  }
  // The first build of a limited warp only measures: the extents need the
  // vertex test, which needs a warp.
  bool again = false;
  for (;;) {
    warp_ = MakeWarp();
    const bool useStereographic = MeasureExtents();
    if (warpModel_ != PSettings::kRegularizerStereographic && useStereographic) {
      warpModel_ = PSettings::kRegularizerStereographic;
      again = true;
      continue;
    }
    if (!isLimited_ || again) break;
    again = true;
  }
  lines_->SetWarp(warp_.get());
}

void Solver::BuildWarp(bool userChanged) {
  PrepareWarp(userChanged, false);
  LoadTexCoords();
  if (HasConstraints()) constraints_->RegisterAll(*this);
  UpdateConstraintDisplays(-1);
}

void Solver::RefreshWarp(bool userChanged) {
  const bool constrained = HasConstraints();
  PrepareWarp(userChanged, !constrained);
  LoadTexCoords();
  if (!constrained) {
    if (warp_->Succeeded()) Solve(true, false);
    return;
  }
  // The mesh must exist before constraints can be traced on it.
  clampCenter_ = false;
  Solve(true, false);
  clampCenter_ = true;
  constraints_->RegisterAll(*this);
  UpdateConstraintDisplays(-1);
  if (warp_->Succeeded()) Solve(true, false);
}

void Solver::Update(bool full, bool notify) {
  if (warp_ != nullptr && warp_->Succeeded()) {
    Solve(full, notify);
  } else {
    RefreshWarp(false);
  }
}

void Solver::UpdateConstraintDisplays(std::int32_t constraintId) {
  if (constraints_ != nullptr) constraints_->UpdateDisplays(*this, constraintId);
}

void Solver::LoadTexCoords() {
  covered_.assign(static_cast<std::size_t>(gridSize_) * gridSize_, 0);
  for (std::int32_t j = 0; j < gridSize_; ++j) {
    for (std::int32_t i = 0; i < gridSize_; ++i) {
      if (!warp_->IsVertexInside(i, j)) continue;
      const std::size_t at = static_cast<std::size_t>(j) * gridSize_ + i;
      lines_->TexCoord(i, j, &texCoords_[at * 2]);
      // The ring past the model's cover is drawn only up to the cover's
      // edge: it does not widen the view.
      float lat, lon;
      octaMap_->GetDirection(i, j, lat, lon);
      covered_[at] = !imageModel_->WalksToCentre() || imageModel_->Contains(lon, lat) ? 1 : 0;
    }
  }
  for (std::int32_t j = 0; j < cellCount_; ++j) {
    for (std::int32_t i = 0; i < cellCount_; ++i) {
      cellMask_[static_cast<std::size_t>(j) * cellCount_ + i] = warp_->IsQuadInside(i, j) ? 1 : 0;
    }
  }
}

bool Solver::MeasureExtents() {
  float latLow = kLargest, latHigh = -kLargest, lonLow = kLargest, lonHigh = -kLargest;
  for (std::int32_t j = 0; j < gridSize_; ++j) {
    for (std::int32_t i = 0; i < gridSize_; ++i) {
      if (!warp_->IsVertexInside(i, j)) continue;
      float lat, lon;
      octaMap_->GetDirection(i, j, lat, lon);
      latLow = std::min(latLow, lat);
      latHigh = std::max(latHigh, lat);
      lonLow = std::min(lonLow, lon);
      lonHigh = std::max(lonHigh, lon);
    }
  }
  const float latRange = latHigh - latLow;
  const float lonRange = lonHigh - lonLow;
  PSettings& settings = context_.Settings();
  const PhotoInfo* photo = context_.Photo();
  const bool panorama = photo != nullptr && photo->HasPanorama();
  const bool spherical = settings.projectionModel == PSettings::kModelFullSpherical;
  isWide_ = !panorama && !spherical && (latRange > kWideRange || lonRange > kWideRange);
  latMin_ = latLow;
  latMax_ = latHigh;
  lonMin_ = lonLow;
  lonMax_ = lonHigh;
  if (spherical) {
    isLimited_ = true;
    latMin_ = -kSphericalLatLimit;
    latMax_ = kSphericalLatLimit;
    lonMin_ = -kLonLimit;
    lonMax_ = kLonLimit;
  } else {
    if (latRange > kLimitedRange || lonRange > kLimitedRange) isLimited_ = true;
    if (lonRange >= kNearlyAround) {
      isLimited_ = true;
      lonMin_ = -kLonLimit;
      lonMax_ = kLonLimit;
    }
    // Latitude spans at most half a turn, so this never fires; it mirrors
    // the longitude rule.
    if (latRange >= kNearlyAround) {
      isLimited_ = true;
      latMin_ = -kLonLimit;
      latMax_ = kLonLimit;
    }
  }
  // A wide picture falls back to the stereographic model. A model the user
  // has just picked is respected; a stored one is overruled and rewritten.
  bool useStereographic = false;
  if (isWide_ && warpModel_ != PSettings::kRegularizerStereographic) {
    const bool autoModel = settings.regularizerModel == PSettings::kRegularizerAuto;
    if (!userChanged_) {
      if (!autoModel) settings.regularizerModel = PSettings::kRegularizerStereographic;
      useStereographic = true;
    } else {
      useStereographic = autoModel;
    }
  }
  return useStereographic;
}

void Solver::Solve(bool full, bool notify) {
  const PSettings& settings = context_.Settings();
  if (settings.autoRotate != 0) {
    float rotation[9];
    lines_->ComputeAutoRotation(rotation);
    // The warp's constant part follows the grid's rotation; when the
    // rotation stands as it was, reassembling it would rebuild the same
    // system, so it is kept.
    const bool unchanged = octaMap_->HasRotation() &&
                           std::memcmp(rotation, octaMap_->Rotation(), sizeof rotation) == 0;
    if (!unchanged) {
      octaMap_->SetRotation(rotation);
      warp_->Reset();
    }
  }
  // While the source is shown, edits solve nothing.
  if (!full && settings.previewResult == 0) {
    UpdateConstraintDisplays(-1);
    if (notify) context_.RedrawResults();
    return;
  }
  warp_->Solve();
  context_.ReportSolve(!warp_->Succeeded());
  CollectMesh();
  context_.RebuildResults();
  solved_ = true;
}

void Solver::CollectMesh() {
  for (std::int32_t j = 0; j < gridSize_; ++j) {
    for (std::int32_t i = 0; i < gridSize_; ++i) {
      if (!warp_->IsVertexInside(i, j)) continue;
      const std::size_t at = (static_cast<std::size_t>(j) * gridSize_ + i) * 2;
      warp_->GetVertexPosition(i, j, positions_[at], positions_[at + 1]);
      lines_->TexCoord(i, j, &texCoords_[at]);
    }
  }
  Extent plane, texture;
  const std::int32_t cornerI[4] = {0, 1, 0, 1}, cornerJ[4] = {0, 0, 1, 1};
  for (std::int32_t j = 0; j < cellCount_; ++j) {
    for (std::int32_t i = 0; i < cellCount_; ++i) {
      if (!IsCellVisible(i, j)) continue;
      for (int k = 0; k < 4; ++k) {
        const std::size_t vertex =
            static_cast<std::size_t>(j + cornerJ[k]) * gridSize_ + i + cornerI[k];
        if (covered_[vertex] == 0) continue;
        const std::size_t at = vertex * 2;
        plane.Add(positions_[at], positions_[at + 1]);
        texture.Add(texCoords_[at], texCoords_[at + 1]);
      }
    }
  }
  ViewBox box;
  box.width = plane.maxX - plane.minX;
  box.height = plane.maxY - plane.minY;
  box.texWidth = std::clamp(texture.maxX - texture.minX, 0.0f, 1.0f);
  box.texHeight = std::clamp(texture.maxY - texture.minY, 0.0f, 1.0f);
  box.centerX = 0.5f * (plane.minX + plane.maxX);
  box.centerY = 0.5f * (plane.minY + plane.maxY);
  box.left = plane.minX;
  box.right = plane.maxX;
  box.bottom = plane.minY;
  box.top = plane.maxY;
  fullBox_ = box;
  activeBox_ = box;
  for (std::int32_t j = 0; j < cellCount_; ++j) {
    for (std::int32_t i = 0; i < cellCount_; ++i) {
      cellMask_[static_cast<std::size_t>(j) * cellCount_ + i] = warp_->IsQuadInside(i, j) ? 1 : 0;
    }
  }
  ApplyView(false);
}

float Solver::ViewHalfSize() const {
  return 0.5f / (static_cast<float>(context_.Settings().imageScale) / 100.0f);
}

void Solver::ApplyView(bool keepLimits) {
  activeBox_ = fullBox_;
  if (!keepLimits) ComputeCenterLimits();
  PSettings& settings = context_.Settings();
  if (clampCenter_) {
    // The upper bound is tested first, so a collapsed range ends at it.
    float& cx = settings.imageCenterX;
    cx = cx > centerLimits_[2] ? centerLimits_[2] : (cx < centerLimits_[0] ? centerLimits_[0] : cx);
    float& cy = settings.imageCenterY;
    cy = cy > centerLimits_[3] ? centerLimits_[3] : (cy < centerLimits_[1] ? centerLimits_[1] : cy);
  }
  const float s = ViewHalfSize();
  const float w = static_cast<float>(context_.PreviewWidth());
  const float h = static_cast<float>(context_.PreviewHeight());
  const float topLeft[2] = {(settings.imageCenterX - s) * w, (settings.imageCenterY - s) * h};
  const float bottomRight[2] = {(settings.imageCenterX + s) * w, (settings.imageCenterY + s) * h};
  float a[2], b[2];
  ViewToPlane(topLeft, a, 1);
  ViewToPlane(bottomRight, b, 1);
  activeBox_.left = a[0];
  activeBox_.top = a[1];
  activeBox_.right = b[0];
  activeBox_.bottom = b[1];
  activeBox_.width = b[0] - a[0];
  activeBox_.height = a[1] - b[1];
  activeBox_.centerX = 0.5f * (a[0] + b[0]);
  activeBox_.centerY = 0.5f * (a[1] + b[1]);
  activeBox_.texWidth = 1.0f;
  activeBox_.texHeight = 1.0f;
  UpdateConstraintDisplays(-1);
}

BoxFit Solver::FitBox(std::int32_t mode) const {
  const ViewBox& box = mode == 0 ? activeBox_ : fullBox_;
  BoxFit fit;
  const float bw = box.width / box.texWidth;
  const float bh = box.height / box.texHeight;
  fit.fitLeft = box.centerX - 0.5f * bw;
  fit.fitRight = box.centerX + 0.5f * bw;
  fit.fitBottom = box.centerY - 0.5f * bh;
  fit.fitTop = box.centerY + 0.5f * bh;
  fit.fitWidth = bw;
  fit.fitHeight = bh;
  const float aspect =
      static_cast<float>(context_.PreviewWidth()) / static_cast<float>(context_.PreviewHeight());
  fit.isWideFit = bw / bh >= aspect;
  fit.viewWidth = fit.isWideFit ? bw : bh * aspect;
  fit.viewHeight = fit.isWideFit ? bw / aspect : bh;
  return fit;
}

void Solver::ComputeCenterLimits() {
  const float s = ViewHalfSize();
  const BoxFit fit = FitBox(0);
  const float aspect =
      static_cast<float>(context_.PreviewWidth()) / static_cast<float>(context_.PreviewHeight());
  // The fit widened about its centre to the preview's aspect.
  float left = fit.fitLeft, right = fit.fitRight, bottom = fit.fitBottom, top = fit.fitTop;
  if (fit.fitWidth / fit.fitHeight >= aspect) {
    const float grow = 0.5f * (fit.fitWidth / aspect - fit.fitHeight);
    bottom -= grow;
    top += grow;
  } else {
    const float grow = 0.5f * (fit.fitHeight * aspect - fit.fitWidth);
    left -= grow;
    right += grow;
  }
  // The mesh's edges in preview fractions, y growing downwards.
  const float leftFraction = (activeBox_.left - left) / (right - left);
  const float rightFraction = (activeBox_.right - left) / (right - left);
  const float topFraction = (top - activeBox_.top) / (top - bottom);
  const float bottomFraction = (top - activeBox_.bottom) / (top - bottom);
  float& minX = centerLimits_[0];
  float& minY = centerLimits_[1];
  float& maxX = centerLimits_[2];
  float& maxY = centerLimits_[3];
  minX = std::clamp(leftFraction + s, 0.0f, 1.0f);
  maxX = std::clamp(rightFraction - s, 0.0f, 1.0f);
  minY = std::clamp(topFraction + s, 0.0f, 1.0f);
  maxY = std::clamp(bottomFraction - s, 0.0f, 1.0f);
  if (minX > maxX) minX = maxX = 0.5f;
  if (minY > maxY) minY = maxY = 0.5f;
}

void Solver::ViewToPlane(const float point[2], float out[2], std::int32_t mode) const {
  const float w = static_cast<float>(context_.PreviewWidth());
  const float h = static_cast<float>(context_.PreviewHeight());
  if (mode == 0) {
    out[0] = point[0] / w;
    out[1] = 1.0f - point[1] / h;
  } else if (mode == 1) {
    const BoxFit fit = FitBox(0);
    out[0] = (point[0] - 0.5f * w) * fit.viewWidth / w + activeBox_.centerX;
    out[1] = (0.5f * h - point[1]) * fit.viewHeight / h + activeBox_.centerY;
  }
}

void Solver::PlaneToView(const float point[2], float out[2], std::int32_t mode) const {
  const float w = static_cast<float>(context_.PreviewWidth());
  const float h = static_cast<float>(context_.PreviewHeight());
  if (mode == 0) {
    out[0] = point[0] * w;
    out[1] = (1.0f - point[1]) * h;
  } else if (mode == 1) {
    const BoxFit fit = FitBox(0);
    out[0] = (point[0] - activeBox_.centerX) * w / fit.viewWidth + 0.5f * w;
    out[1] = 0.5f * h - (point[1] - activeBox_.centerY) * h / fit.viewHeight;
  } else {
    out[0] = 0.0f;
    out[1] = 0.0f;
  }
}

void Solver::PreviewToResult(const float point[2], float out[2], std::int32_t mode) const {
  const PSettings& settings = context_.Settings();
  const float w = static_cast<float>(context_.PreviewWidth());
  const float h = static_cast<float>(context_.PreviewHeight());
  const float s = ViewHalfSize();
  const float cx = settings.imageCenterX, cy = settings.imageCenterY;
  const float spanX = 2.0f * s * w;  // b - a
  const float spanY = 2.0f * s * h;  // d - c
  if (mode == 0) {
    out[0] = (point[0] - cx * w) / spanX * w + 0.5f * w;
    out[1] = (point[1] - cy * h) / spanY * h + 0.5f * h;
  } else if (mode == 1) {
    out[0] = spanX * (point[0] - 0.5f * w) / w + cx * w;
    out[1] = spanY * (point[1] - 0.5f * h) / h + cy * h;
  } else {
    out[0] = point[0];
    out[1] = point[1];
  }
}

bool Solver::PreviewToSource(float point[2]) const {
  const float w = static_cast<float>(context_.PreviewWidth());
  const float h = static_cast<float>(context_.PreviewHeight());
  float plane[2], fraction[2];
  ViewToPlane(point, plane, 1);
  if (lines_->FindSourcePoint(plane, fraction)) {
    point[0] = fraction[0] * w;
    point[1] = (1.0f - fraction[1]) * h;
    return true;
  }
  // Off the mesh: the point is taken as a place of the zoomed source view.
  float mapped[2];
  PreviewToResult(point, mapped, 1);
  const float probe[2] = {mapped[0] / w, 1.0f - mapped[1] / h};
  OctaMap::Cell cell;
  if (lines_->FindCell(probe, cell, 0)) return false;
  point[0] = mapped[0];
  point[1] = mapped[1];
  return true;
}

bool Solver::SourceToPreview(const float point[2], float out[2]) const {
  const float w = static_cast<float>(context_.PreviewWidth());
  const float h = static_cast<float>(context_.PreviewHeight());
  const float fraction[2] = {point[0] / w, 1.0f - point[1] / h};
  float plane[2];
  if (lines_->FindResultPoint(fraction, plane)) {
    PlaneToView(plane, out, 1);
    return true;
  }
  PreviewToResult(point, out, 0);
  return false;
}

bool Solver::IsCellVisible(std::int32_t i, std::int32_t j) const {
  return lines_->IsCellVisible(i, j);
}

bool Solver::IsCellInMask(std::int32_t i, std::int32_t j) const {
  return cellMask_[static_cast<std::size_t>(j) * cellCount_ + i] != 0;
}

void Solver::GetLimits(float& latMin, float& latMax, float& lonMin, float& lonMax) const {
  latMin = latMin_;
  latMax = latMax_;
  lonMin = lonMin_;
  lonMax = lonMax_;
}

}  // namespace Project
