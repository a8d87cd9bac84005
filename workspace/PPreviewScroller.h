#pragma once

#include "framework/controls/CScroller.h"

namespace Project {

// The scroller around the workspace's preview: a scroller under the name
// the layout file gives it, with nothing added.
class PPreviewScroller : public Tarsa::CScroller {
 public:
  using Tarsa::CScroller::CScroller;
};

}  // namespace Project
