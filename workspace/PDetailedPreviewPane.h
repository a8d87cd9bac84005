#pragma once

#include <cstdint>
#include <vector>

#include "framework/process/CTimer.h"
#include "framework/view/CPane.h"

namespace Project {

class PFilter;

// The fixed loupe of the option column: the picture at 100 % about the
// image point the mouse last crossed in the preview, with a cross at its
// centre. It repaints at most 15 times a second: a move starts a one-shot
// timer, and the timer's firing repaints. The filter outlives it; the
// pixels come from the hub's preview stage.
class PDetailedPreviewPane : public Tarsa::CPane {
 public:
  PDetailedPreviewPane(Tarsa::CObjID id, Tarsa::CView* parent, const Tarsa::CRect& frame);

  void Attach(PFilter& filter);
  // An image point; the loupe shows it once the timer fires.
  void SetCenter(Tarsa::CPoint imagePoint);
  Tarsa::CPoint Center() const { return center_; }
  void SetShowSource(bool on);

  void Draw(Tarsa::CPort& port) override;

 private:
  class RefreshTimer : public Tarsa::CTimer {
   public:
    explicit RefreshTimer(PDetailedPreviewPane& pane) : Tarsa::CTimer(1.0 / 15.0), pane_(pane) {}
    void Fire(double time, double elapsed) override;

   private:
    PDetailedPreviewPane& pane_;
  };

  PFilter* filter_ = nullptr;
  Tarsa::CPoint center_{-1, 0};
  bool showSource_ = false;
  RefreshTimer refreshTimer_;
  std::vector<std::uint8_t> buffer_;
};

}  // namespace Project
