#pragma once

#include <cstdint>

#include "framework/view/CPane.h"

namespace Tarsa {

// A plain pane with a one-pixel border and a fill, for an area that holds
// other views and must stand apart from the window's face (a preview, a
// list of settings). With a fill of 0 the face shows through.
class CFramePane : public CPane {
 public:
  CFramePane(CObjID id, CView* parent, const CRect& frame, std::uint32_t fill = 0xFFFFFFFF,
             std::uint32_t binding = kBind_Fixed);
};

}  // namespace Tarsa
