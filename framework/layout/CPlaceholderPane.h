#pragma once

#include <string>

#include "framework/view/CPane.h"

namespace Tarsa {

// Stands in for a view class that a layout file names but that has no
// builder yet (a pane the workspace will add): it takes the place and the
// id the file gives, holds the children, and draws a light frame with the
// class's name, so a window built early shows where the pane will go.
class CPlaceholderPane : public CPane {
 public:
  CPlaceholderPane(CObjID id, CView* parent, const CRect& frame, std::string className,
                   std::uint32_t binding = kBind_Fixed);

  const std::string& ClassName() const { return className_; }
  void Draw(CPort& port) override;

 private:
  std::string className_;
};

}  // namespace Tarsa
