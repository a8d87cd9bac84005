#pragma once

#include <memory>

#include "framework/view/CPane.h"

namespace Tarsa {

class CTimer;

// A bar that fills from the left as work goes on, 0 to 1. Work whose end
// cannot be told shows the indeterminate look instead: a block that sweeps
// along the track, moved by a timer at 1/15 s while the bar is shown.
class CProgressBar : public CPane {
 public:
  CProgressBar(CObjID id, CView* parent, const CRect& frame, std::uint32_t binding = kBind_Fixed);
  ~CProgressBar() override;

  double Value() const { return value_; }
  // Kept in 0 to 1; redraws only when the filled width changes.
  void SetValue(double value);
  bool Indeterminate() const { return indeterminate_; }
  void SetIndeterminate(bool indeterminate);
  // The filled part's right edge, in the view's space.
  std::int32_t FillRight() const;

  void Draw(CPort& port) override;

 private:
  class Sweep;
  double value_ = 0.0;
  bool indeterminate_ = false;
  double phase_ = 0.0;  // 0 to 1, the sweeping block's place
  std::unique_ptr<Sweep> sweep_;
};

}  // namespace Tarsa
