#pragma once

#include <string>
#include <vector>

#include "framework/controls/CControl.h"

namespace Tarsa {

class CEditNumber;

// A number field with a list of usual values beside it, as a zoom box has:
// the user types any number in the range, or opens the list with a click on
// the arrow and picks one. Either way the row sends
// the new value under its own id. The field is the tab stop.
class CComboBox : public CControl {
 public:
  CComboBox(CObjID id, CView* parent, const CRect& frame, double value, double minimum,
            double maximum, int digits, const std::vector<double>& choices,
            const std::string& unit = "", std::uint32_t binding = kBind_Fixed);
  ~CComboBox() override;

  double Value() const;
  void SetValue(double value);
  const std::vector<double>& Choices() const { return choices_; }
  CEditNumber& Field() const { return *field_; }
  // The arrow's button, in the view's space.
  CRect ArrowRect() const;
  void OpenList();

  void Click(CMouseMessage& message) override;
  void HandleMessage(CMessage& message) override;
  void Draw(CPort& port) override;

  static constexpr std::int32_t kArrowWidth = 20;

 private:
  std::string ChoiceText(double value) const;

  CEditNumber* field_ = nullptr;
  std::vector<double> choices_;
  std::string unit_;
  std::int32_t unitWidth_ = 0;
  int digits_;
};

}  // namespace Tarsa
