#pragma once

#include <string>

#include "framework/view/CPane.h"

namespace Tarsa {

// A titled frame around related controls: a thin rounded line with the
// title set into its top edge. The controls are its children, placed in its
// space; Interior() says where the frame leaves room for them.
class CGroupBox : public CPane {
 public:
  CGroupBox(CObjID id, CView* parent, const CRect& frame, const std::string& title = "",
            std::uint32_t binding = kBind_Fixed);

  const std::string& Title() const { return title_; }
  void SetTitle(const std::string& title);
  // The area inside the frame, under the title, in the view's space.
  CRect Interior() const;

  void Draw(CPort& port) override;

 private:
  std::string title_;
};

}  // namespace Tarsa
