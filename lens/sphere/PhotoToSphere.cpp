#include "lens/sphere/PhotoToSphere.h"

#include <algorithm>
#include <utility>

namespace Project {

PhotoToSphere::PhotoToSphere(std::shared_ptr<const Image> image) : image_(std::move(image)) {}

bool PhotoToSphere::ContainsPixel(float x, float y) const {
  // Truncation in floating point: the same answer as an integer cast, without
  // the cast's overflow for the far-off positions of a steep tangent.
  const float ix = std::trunc(image_->halfWidth + x);
  const float iy = std::trunc(image_->halfHeight + y);
  return ix >= 0.0f && ix < image_->width && iy >= 0.0f && iy < image_->height;
}

bool PhotoToSphere::WithinQuarterTurn(float lon, float lat) {
  return std::fabs(static_cast<double>(lon)) < 1.57 && std::fabs(static_cast<double>(lat)) < 1.57;
}

void PhotoToSphere::GetTexCoord(float lon, float lat, float outUv[2]) const {
  float x = 0.0f;
  float y = 0.0f;
  GetPosition(lon, lat, x, y);
  outUv[0] = x / image_->width + 0.5f;
  outUv[1] = y / image_->height + 0.5f;
}

void PhotoToSphere::GetColor(float lon, float lat, float outRgb[3]) const {
  outRgb[0] = outRgb[1] = outRgb[2] = 0.0f;
  float x = 0.0f;
  float y = 0.0f;
  GetPosition(lon, lat, x, y);
  const Image& image = *image_;
  if (!image.pixels || !ContainsPixel(x, y)) return;
  const float px = image.halfWidth + x;
  const float py = image.halfHeight + y;
  const std::int32_t ix = static_cast<std::int32_t>(px);
  const std::int32_t iy = static_cast<std::int32_t>(py);
  // On the last column or row there is no right or lower neighbour to blend.
  const bool lastColumn = ix == image.width - 1;
  const bool lastRow = iy == image.height - 1;
  const float fx = lastColumn ? 0.0f : px - ix;
  const float fy = lastRow ? 0.0f : py - iy;
  auto add = [&](std::int32_t column, std::int32_t row, float weight) {
    const std::uint8_t* p =
        image.pixels + (static_cast<std::size_t>(image.width) * row + column) * 3;
    for (int c = 0; c < 3; ++c) outRgb[c] += weight * p[c];
  };
  add(ix, iy, (1.0f - fx) * (1.0f - fy));
  if (!lastColumn) add(ix + 1, iy, fx * (1.0f - fy));
  if (!lastColumn && !lastRow) add(ix + 1, iy + 1, fx * fy);
  if (!lastRow) add(ix, iy + 1, (1.0f - fx) * fy);
  for (int c = 0; c < 3; ++c) outRgb[c] = std::clamp(outRgb[c] / 255.0f, 0.0f, 1.0f);
}

}  // namespace Project
