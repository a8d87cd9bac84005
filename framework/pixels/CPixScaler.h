#pragma once

#include <cstdint>
#include <vector>

#include "framework/pixels/CPixProcess.h"

namespace Tarsa {

class CPixmap;

// The stage that resamples another: it maps a destination rectangle onto a
// source rectangle, axis by axis, and fills destination areas from source
// pixmaps. Shrinking averages each destination position's box over the
// source, with partial weights at both ends; enlarging interpolates linearly
// from corner to corner; the same size copies, shifted. Each axis keeps a
// table with one entry per destination position, made when the rectangles
// change. The stage that derives from this one owns its pixmaps and its
// grid, and decides which area a step fills.
class CPixScaler : public CPixProcess {
 public:
  enum Mode : std::int32_t { kSame = 0, kShrink = 1, kEnlarge = 2 };

  // A destination position: the source samples from firstSample to
  // lastSample, the ends with their weights and those between with weight
  // 1. One sample alone counts with firstWeight.
  struct AxisEntry {
    float firstWeight = 1;
    float lastWeight = 1;
    std::int32_t firstSample = 0;
    std::int32_t lastSample = 0;
  };

  explicit CPixScaler(bool keepRects = false) : CPixProcess(keepRects) {}

  // Stores the rectangles and makes the tables; false, with nothing done,
  // when neither changed. An empty one clears the stage: rectangles, tables
  // and grid.
  bool SetRects(const CRect& destination, const CRect& source);
  const CRect& Destination() const { return destination_; }
  const CRect& Source() const { return source_; }
  std::int32_t ModeX() const { return modeX_; }
  std::int32_t ModeY() const { return modeY_; }
  // Destination over source size when shrinking, else 1.
  float NormX() const { return normX_; }
  float NormY() const { return normY_; }
  const std::vector<AxisEntry>& TableX() const { return tableX_; }
  const std::vector<AxisEntry>& TableY() const { return tableY_; }

  // The source samples that an area of the destination reads; false, with
  // out untouched, when the area misses the destination.
  bool SourceRectFor(const CRect& destinationRect, CRect& out) const;
  // Fills area (clipped to Destination()) of destination from source,
  // which must hold SourceRectFor(area), for the planes both have. Integer
  // samples are rounded to the nearest; 32-bit samples are floats. CError
  // when the depths differ or are not 8, 16 or 32.
  void Scale(const CPixmap& source, CPixmap& destination, const CRect& area) const;

  // The tables of one axis, for size destination positions over count
  // source positions beginning at start.
  static std::vector<AxisEntry> ShrinkTable(std::int32_t start, std::uint32_t count,
                                            std::uint32_t size);
  static std::vector<AxisEntry> EnlargeTable(std::int32_t start, std::uint32_t count,
                                             std::uint32_t size);
  static std::vector<AxisEntry> SameTable(std::int32_t start, std::uint32_t size);

 private:
  template <typename T>
  void ScaleAs(const CPixmap& source, CPixmap& destination, const CRect& area,
               const CRect& sourceArea) const;

  CRect destination_;
  CRect source_;
  std::vector<AxisEntry> tableX_;
  std::vector<AxisEntry> tableY_;
  std::int32_t modeX_ = kSame;
  std::int32_t modeY_ = kSame;
  float normX_ = 1;
  float normY_ = 1;
};

}  // namespace Tarsa
