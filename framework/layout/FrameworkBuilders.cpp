// The builders of the framework's own view classes, and the two that stand
// in for classes with none yet: a placeholder pane, and a plain window.
#include <algorithm>
#include <sstream>
#include <string>
#include <vector>

#include "framework/controls/CCheckButton.h"
#include "framework/controls/CEditNumber.h"
#include "framework/controls/CEditSlider.h"
#include "framework/controls/CFramePane.h"
#include "framework/controls/CGroupBox.h"
#include "framework/controls/CProgressBar.h"
#include "framework/controls/CPushButton.h"
#include "framework/controls/CRadioPopup.h"
#include "framework/controls/CSlider.h"
#include "framework/controls/CStaticImage.h"
#include "framework/controls/CStaticText.h"
#include "framework/layout/CPaneBuilder.h"
#include "framework/layout/CPlaceholderPane.h"
#include "framework/layout/CWindowBuilder.h"
#include "framework/layout/ZoomBuilders.h"

namespace Tarsa {
namespace {

// Text widths are estimated, not measured: the layout runs before any
// window, and so any port, exists.
constexpr std::int32_t kCharWidth = 7;

std::int32_t TextWidth(const std::string& keyed) {
  return static_cast<std::int32_t>(ShownText(keyed).size()) * kCharWidth;
}

std::string String(const CZilPropertyList& properties, std::string_view name) {
  std::string value;
  properties.GetString(name, value);
  return value;
}

double Number(const CZilPropertyList& properties, std::string_view name, double fallback) {
  properties.GetDouble(name, fallback);
  return fallback;
}

std::int32_t Int(const CZilPropertyList& properties, std::string_view name, std::int32_t fallback) {
  properties.GetInt(name, fallback);
  return fallback;
}

// The items of a popup, written 'One|Two|Three'.
std::vector<std::string> Items(const CZilPropertyList& properties) {
  std::vector<std::string> items;
  std::stringstream list(String(properties, "radio_items"));
  for (std::string item; std::getline(list, item, '|');) items.push_back(ShownText(item));
  return items;
}

// kFont_ values, in their order: System, Application, then UI, UILarge,
// UIMedium, UISmall and UIMicro, each plain, bold, italic, bold italic.
EFont FontOf(std::int32_t font) {
  if (font < 2) return EFont::kUIMedium;
  const std::int32_t family = (font - 2) / 4;
  const std::int32_t style = (font - 2) % 4;
  if (style == 1 || style == 3) return EFont::kUIBold;
  if (family == 1) return EFont::kUILarge;
  if (family >= 3) return EFont::kUISmall;
  return EFont::kUIMedium;
}

std::int32_t LabelWidth(const CZilGenerator& generator, std::int32_t fallback) {
  const CViewProxy& proxy = generator.Proxy();
  return proxy.hasLabelWidth ? proxy.finalLabelWidth : fallback;
}

void RegisterControls() {
  CViewBuilder::Register(
      "CPushButton",
      std::make_unique<CPaneBuilder<CPushButton>>(
          [](CView* parent, CZilGenerator& g) {
            return new CPushButton(g.ViewId(), parent, g.Frame(),
                                   String(g.Properties(), "button_label"), g.Options(kView_TabStop),
                                   g.Binding());
          },
          [](CPushButton& button, CZilGenerator& g) {
            bool isDefault = false;
            bool isCancel = false;
            g.Properties().GetBool("ok_button", isDefault);
            g.Properties().GetBool("default_button", isDefault);
            g.Properties().GetBool("cancel_button", isCancel);
            if ((isDefault || isCancel) && g.Window() != nullptr) {
              button.SetEndsModal(true);
              if (isDefault) g.Window()->SetDefaultView(button.GetId());
              if (isCancel) g.Window()->SetCancelView(button.GetId());
            }
          },
          [](const CViewProxy& proxy) {
            return CSize{std::max(80, TextWidth(String(proxy.properties, "button_label")) + 24),
                         24};
          }));
  CViewBuilder::Register(
      "CCheckButton",
      std::make_unique<CPaneBuilder<CCheckButton>>(
          [](CView* parent, CZilGenerator& g) {
            return new CCheckButton(
                g.ViewId(), parent, g.Frame(), String(g.Properties(), "button_label"),
                Int(g.Properties(), "button_value", 0) != 0, g.Options(kView_TabStop), g.Binding());
          },
          nullptr,
          [](const CViewProxy& proxy) {
            return CSize{TextWidth(String(proxy.properties, "button_label")) + 28, 22};
          }));
  CViewBuilder::Register(
      "CStaticText",
      std::make_unique<CPaneBuilder<CStaticText>>(
          [](CView* parent, CZilGenerator& g) {
            return new CStaticText(g.ViewId(), parent, g.Frame(),
                                   ShownText(String(g.Properties(), "text")), g.Binding());
          },
          [](CStaticText& text, CZilGenerator& g) {
            std::int32_t font = 0;
            if (g.Properties().GetInt("text_font", font)) text.SetFont(FontOf(font));
            // kTrim_Middle
            if (Int(g.Properties(), "text_trim", 0) == 2) text.SetTrim(CStaticText::ETrim::kMiddle);
            // kAlign_Center, kAlign_Right
            const std::int32_t align =
                Int(g.Properties(), "text_align_x", Int(g.Properties(), "text_align", 0));
            if (align == 2) text.SetAlignment(EAlign::kCenter);
            if (align == 3) text.SetAlignment(EAlign::kEnd);
            bool wrap = false;
            if (g.Properties().GetBool("static_wrap", wrap)) text.SetWrap(wrap);
          },
          [](const CViewProxy& proxy) {
            return CSize{TextWidth(String(proxy.properties, "text")) + 4, 22};
          }));
  CViewBuilder::Register(
      "CEditNumber",
      std::make_unique<CPaneBuilder<CEditNumber>>(
          [](CView* parent, CZilGenerator& g) {
            const CZilPropertyList& p = g.Properties();
            auto* field =
                new CEditNumber(g.ViewId(), parent, g.Frame(), Number(p, "number_value", 0),
                                Number(p, "number_minimum", 0), Number(p, "number_maximum", 100),
                                std::clamp(Int(p, "decimal_digits", 0), 0, 9),
                                g.Options(kView_TabStop), g.Binding());
            field->SetSteps(Number(p, "minor_increment", 1), Number(p, "major_increment", 10));
            return field;
          },
          nullptr,
          [](const CViewProxy&) {
            return CSize{70, 24};
          }));
  CViewBuilder::Register(
      "CEditSlider", std::make_unique<CPaneBuilder<CEditSlider>>(
                         [](CView* parent, CZilGenerator& g) {
                           const CZilPropertyList& p = g.Properties();
                           auto* row = new CEditSlider(
                               g.ViewId(), parent, g.Frame(), ShownText(String(p, "button_label")),
                               Number(p, "number_value", Number(p, "slider_value", 0)),
                               Number(p, "number_minimum", Number(p, "slider_minimum", 0)),
                               Number(p, "number_maximum", Number(p, "slider_maximum", 100)),
                               std::clamp(Int(p, "decimal_digits", 0), 0, 9),
                               ShownText(String(p, "unit_text")), g.Binding(), LabelWidth(g, 90),
                               Int(p, "text_width", 90));
                           row->Field().SetSteps(Number(p, "minor_increment", 1),
                                                 Number(p, "major_increment", 10));
                           return row;
                         },
                         nullptr,
                         [](const CViewProxy& proxy) {
                           const std::int32_t label = proxy.hasLabelWidth ? proxy.labelWidth : 90;
                           return CSize{label + 160 + Int(proxy.properties, "text_width", 90), 24};
                         }));
  CViewBuilder::Register("CRadioPopup",
                         std::make_unique<CPaneBuilder<CRadioPopup>>(
                             [](CView* parent, CZilGenerator& g) {
                               return new CRadioPopup(g.ViewId(), parent, g.Frame(),
                                                      Items(g.Properties()), 0,
                                                      g.Options(kView_TabStop), g.Binding());
                             },
                             nullptr,
                             [](const CViewProxy& proxy) {
                               std::int32_t widest = 0;
                               for (const std::string& item : Items(proxy.properties)) {
                                 widest = std::max(widest, TextWidth(item));
                               }
                               return CSize{std::max(100, widest + 36), 24};
                             }));
  CViewBuilder::Register("CSlider",
                         std::make_unique<CPaneBuilder<CSlider>>(
                             [](CView* parent, CZilGenerator& g) {
                               const CZilPropertyList& p = g.Properties();
                               return new CSlider(
                                   g.ViewId(), parent, g.Frame(), Number(p, "slider_value", 0),
                                   Number(p, "slider_minimum", 0), Number(p, "slider_maximum", 100),
                                   std::clamp(Int(p, "slider_positions", 101), 2, 100000),
                                   g.Options(kView_TabStop), g.Binding());
                             },
                             nullptr,
                             [](const CViewProxy&) {
                               return CSize{160, 24};
                             }));
}

void RegisterPanes() {
  CViewBuilder::Register(
      "CFramePane",
      std::make_unique<CPaneBuilder<CView>>([](CView* parent, CZilGenerator& g) -> CView* {
        const CZilPropertyList& p = g.Properties();
        std::string title;
        if (p.GetString("frame_title", title)) {
          return new CGroupBox(g.ViewId(), parent, g.Frame(), ShownText(title), g.Binding());
        }
        // frame_none: no frame at all, only the area that holds the views.
        if (Int(p, "frame_style", 2) == 0) {
          return new CView(g.ViewId(), parent, g.Frame(), kView_NoOptions, g.Binding());
        }
        return new CFramePane(g.ViewId(), parent, g.Frame(), 0xFFFFFFFFu, g.Binding());
      }));
  // A plain area that only holds and places other views.
  CViewBuilder::Register(
      "CFrameInsert", std::make_unique<CPaneBuilder<CView>>([](CView* parent, CZilGenerator& g) {
        return new CView(g.ViewId(), parent, g.Frame(), kView_NoOptions, g.Binding());
      }));
  CViewBuilder::Register(
      "CGroupBox", std::make_unique<CPaneBuilder<CGroupBox>>([](CView* parent, CZilGenerator& g) {
        return new CGroupBox(g.ViewId(), parent, g.Frame(),
                             ShownText(String(g.Properties(), "frame_title")), g.Binding());
      }));
  CViewBuilder::Register("CStaticImage", std::make_unique<CPaneBuilder<CStaticImage>>(
                                             [](CView* parent, CZilGenerator& g) {
                                               return new CStaticImage(g.ViewId(), parent,
                                                                       g.Frame(), g.Binding());
                                             },
                                             [](CStaticImage& image, CZilGenerator& g) {
                                               std::string icon;
                                               if (g.Properties().GetString("icon", icon))
                                                 image.SetIcon(icon);
                                             },
                                             [](const CViewProxy&) {
                                               return CSize{16, 16};
                                             }));
  CViewBuilder::Register("CProgressBar", std::make_unique<CPaneBuilder<CProgressBar>>(
                                             [](CView* parent, CZilGenerator& g) {
                                               return new CProgressBar(g.ViewId(), parent,
                                                                       g.Frame(), g.Binding());
                                             },
                                             nullptr,
                                             [](const CViewProxy&) {
                                               return CSize{160, 12};
                                             }));
  // The stand-ins: a pane for any class with no builder, a window at the root.
  CViewBuilder::Register(
      "", std::make_unique<CPaneBuilder<CPlaceholderPane>>([](CView* parent, CZilGenerator& g) {
        return new CPlaceholderPane(g.ViewId(), parent, g.Frame(), g.Proxy().ClassName(),
                                    g.Binding());
      }));
  CViewBuilder::Register("CWindow", std::make_unique<CWindowBuilder<CWindow>>());
}

}  // namespace

void RegisterFrameworkBuilders() {
  RegisterControls();
  RegisterPanes();
  RegisterZoomBuilders();
}

}  // namespace Tarsa
