#include <gtest/gtest.h>

#include <chrono>
#include <string>
#include <vector>

#include "framework/controls/CCheckButton.h"
#include "framework/controls/CEditSlider.h"
#include "framework/controls/CPushButton.h"
#include "framework/controls/CSlider.h"
#include "framework/controls/CStaticText.h"
#include "framework/layout/CPlaceholderPane.h"
#include "framework/layout/CViewProxy.h"
#include "framework/layout/CZilGenerator.h"
#include "framework/native/NativeDisplay.h"
#include "framework/resource/ModuleResources.h"
#include "framework/view/CWindow.h"
#include "tests/framework/controls/Desktop.h"

namespace Tarsa::testing {
namespace {

class ZilWindow : public ::testing::Test {
 protected:
  void SetUp() override {
    if (!Native::HasDisplay()) GTEST_SKIP() << "no display; these tests run under xvfb-run";
    desktop_ = std::make_unique<Desktop>();
  }
  void TearDown() override { desktop_.reset(); }

  static CView* Find(CWindow& window, const char* id) {
    return window.FindView(CObjID::Intern(id));
  }

  // Siblings do not overlap, and each view lies inside its parent: what
  // every layout that places rows and columns must give.
  static void ExpectTidy(const CView& view, const std::string& path) {
    const CSize size = view.Size();
    const auto& children = view.Children();
    for (std::size_t i = 0; i < children.size(); ++i) {
      const CRect a = children[i]->Frame();
      const std::string name = path + "/" + children[i]->GetId().Text();
      EXPECT_TRUE(a.left >= 0 && a.top >= 0 && a.right <= size.width && a.bottom <= size.height)
          << name << " leaves its parent";
      for (std::size_t j = i + 1; j < children.size(); ++j) {
        const CRect b = children[j]->Frame();
        const bool apart =
            a.right <= b.left || b.right <= a.left || a.bottom <= b.top || b.bottom <= a.top;
        EXPECT_TRUE(apart) << name << " overlaps " << children[j]->GetId().Text();
      }
      ExpectTidy(*children[i], name);
    }
  }

  std::unique_ptr<Desktop> desktop_;
};

TEST_F(ZilWindow, GeneratedViewsHaveTheirClassesIdsAndPlaces) {
  CZilGenerator generator;
  const std::string text =
      "Window(view_id: 'Test/Window', window_title: 'Built', margin: 10, spacing: 6) {\n"
      "  CStaticText(view_id: 'Test/Text', text: 'Hello', width: 120, text_trim: kTrim_Middle);\n"
      "  CCheckButton(view_id: 'Test/Check', button_label: '&Mesh', button_value: 1,\n"
      "               view_tip: '$$$/Test/Tip=A tip');\n"
      "  FuturePane(view_id: 'Test/Future', width: 50, height: 40);\n"
      "  CPushButton(view_id: 'Test/Hidden', button_label: 'X', view_options: kView_Invisible);\n"
      "  CPushButton(view_id: 'Test/OK', button_label: 'OK', default_button: true,\n"
      "              horizontal: align_right);\n"
      "}";
  const auto layout = generator.Layout(text);
  std::unique_ptr<CWindow> window = generator.Generate(text, nullptr);
  ASSERT_NE(window, nullptr);
  EXPECT_EQ(window->GetId(), CObjID::Intern("Test/Window"));
  // The window is the root's measured size.
  EXPECT_EQ(window->Size().width, layout->measuredWidth);
  EXPECT_EQ(window->Size().height, layout->measuredHeight);
  ASSERT_EQ(window->Children().size(), 5u);
  for (std::size_t i = 0; i < 5; ++i) {
    const CRect made = window->Children()[i]->Frame();
    const CRect planned = layout->children[i]->frame;
    EXPECT_EQ(made.left, planned.left);
    EXPECT_EQ(made.top, planned.top);
    EXPECT_EQ(made.right, planned.right);
    EXPECT_EQ(made.bottom, planned.bottom);
  }
  auto* check = dynamic_cast<CCheckButton*>(Find(*window, "Test/Check"));
  ASSERT_NE(check, nullptr);
  EXPECT_TRUE(check->IsChecked());
  EXPECT_EQ(check->Tip(), "A tip");
  auto* future = dynamic_cast<CPlaceholderPane*>(Find(*window, "Test/Future"));
  ASSERT_NE(future, nullptr);
  EXPECT_EQ(future->ClassName(), "FuturePane");
  EXPECT_FALSE(Find(*window, "Test/Hidden")->IsVisible());
  EXPECT_NE(dynamic_cast<CStaticText*>(Find(*window, "Test/Text")), nullptr);
  EXPECT_EQ(window->DefaultView(), CObjID::Intern("Test/OK"));
  // Right-aligned: its right edge on the right margin.
  EXPECT_EQ(Find(*window, "Test/OK")->Frame().right, window->Size().width - 10);
}

TEST_F(ZilWindow, AFileWhoseRootIsNoWindowClassStillGivesAWindow) {
  CZilGenerator generator;
  const auto window = generator.Generate("CStaticText(text: 'x');", nullptr);
  EXPECT_NE(window, nullptr);
  EXPECT_TRUE(generator.BareWindow());
}

struct WorkspaceFile {
  const char* file;
  const char* window;
  std::vector<const char*> ids;
};

const WorkspaceFile kFiles[] = {
    {"PDialog.zil",
     "Project/Dialog",
     {"Project/Dialog/Toolbar",
      "Project/Tool/ManageConstraint",
      "Project/Tool/PlaneTool",
      "Project/Tool/MoveImage",
      "Project/Tool/Hand",
      "Project/Tool/Zoom",
      "Project/Dialog/Tooltip",
      "Project/Dialog/PreviewScroller",
      "Project/Dialog/ZoomCombo",
      "Project/Dialog/PreviewPane",
      "Project/Dialog/CameraEXIFInfo",
      "Project/Dialog/LensEXIFInfo",
      "Project/Dialog/PreviewResultCheck",
      "Project/Dialog/ShowConstraintsCheck",
      "Project/Dialog/ShowMeshCheck",
      "Project/Dialog/OKButton",
      "Project/Dialog/CancelButton",
      "Project/Dialog/CorrectionOptionPane",
      "Project/Dialog/ProjectionModelPopup",
      "Project/Dialog/CorrectionFlyout",
      "Project/Dialog/ImageScaleSlider",
      "Project/Dialog/FocalLengthPane",
      "Project/Dialog/FocalLengthSlider",
      "Project/Dialog/CropFactorPane",
      "Project/Dialog/CropFactorSlider",
      "Project/Dialog/AsShotCheck",
      "Project/Dialog/LoupePane",
      "Project/Dialog/DetailedPreviewPane",
      "Project/Dialog/SolverInfoPane",
      "Project/Dialog/SolverInfoText"}},
    {"PParamDialog.zil",
     "Project/Dialog/ParamDialog",
     {"Project/ParamDialog/IterationNumber", "Project/ParamDialog/CacheDSSPermutation",
      "Project/ParamDialog/UseDebugSolve", "Project/ParamDialog/MeshResolution",
      "Project/ParamDialog/BorderExpand", "Project/ParamDialog/MeshUseTriangle",
      "Project/ParamDialog/AutoRotate", "Project/ParamDialog/RegularizerProjectionModelPopup",
      "Project/ParamDialog/GaussNewtonSolver", "Project/ParamDialog/PardisoSolver",
      "Project/ParamDialog/TextureRendering", "Project/ParamDialog/RegularWeight",
      "Project/ParamDialog/RegWeightApplyTo", "Project/ParamDialog/LineWeight",
      "Project/ParamDialog/HighCenterWeight", "Project/ParamDialog/ConformalWeight",
      "Project/ParamDialog/SmoothnessWeight", "Project/ParamDialog/OkButton",
      "Project/ParamDialog/CancelButton"}},
    {"PPreferenceDialog.zil",
     "Project/Dialog/PreferenceDialog",
     {"Project/PreferenceDialog/OrdinaryConstraintColorButton",
      "Project/PreferenceDialog/HorizontalConstraintColorButton",
      "Project/PreferenceDialog/VerticalConstraintColorButton",
      "Project/PreferenceDialog/FixedConstraintColorButton",
      "Project/PreferenceDialog/InvalidConstraintColorButton",
      "Project/PreferenceDialog/MeshColorButton", "Project/PreferenceDialog/ShowLoupeCheck",
      "Project/PreferenceDialog/LoupeSizeSlider", "Project/PreferenceDialog/OkButton",
      "Project/PreferenceDialog/CancelButton"}},
};

TEST_F(ZilWindow, WorkspaceFilesBuildWholeTreesReachableById) {
  for (const WorkspaceFile& file : kFiles) {
    SCOPED_TRACE(file.file);
    CZilGenerator generator;
    const auto start = std::chrono::steady_clock::now();
    std::unique_ptr<CWindow> window = generator.GenerateWindow(file.file, nullptr);
    const double seconds =
        std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
    EXPECT_LT(seconds, 0.5);
    ASSERT_NE(window, nullptr);
    EXPECT_EQ(window->GetId(), CObjID::Intern(file.window));
    for (const char* id : file.ids) EXPECT_NE(Find(*window, id), nullptr) << id;
    EXPECT_FALSE(window->DefaultView().IsNull());
    EXPECT_FALSE(window->CancelView().IsNull());
    ExpectTidy(*window, file.window);
    window->Show();
    desktop_->Pump(0.3);
    window->PaintNow();
    std::string shot = file.file;
    shot = "layout-" + shot.substr(0, shot.find('.')) + ".png";
    EXPECT_TRUE(window->SaveImage(Desktop::Artefact(shot)));
  }
}

TEST_F(ZilWindow, MainDialogPlacesItsColumnsAndOptionRows) {
  CZilGenerator generator;
  std::unique_ptr<CWindow> window = generator.GenerateWindow("PDialog.zil", nullptr);
  CView* preview = Find(*window, "Project/Dialog/PreviewPane");
  CView* ok = Find(*window, "Project/Dialog/OKButton");
  CView* focal = Find(*window, "Project/Dialog/FocalLengthPane");
  CView* crop = Find(*window, "Project/Dialog/CropFactorPane");
  CView* solver = Find(*window, "Project/Dialog/SolverInfoPane");
  // The preview is at least its least size, and the buttons are right of it.
  EXPECT_GE(preview->Size().width, 320);
  EXPECT_GE(preview->Size().height, 320);
  EXPECT_GT(ok->LocalToWindow(CPoint{0, 0}).x,
            preview->LocalToWindow(CPoint{0, 0}).x + preview->Size().width);
  EXPECT_EQ(ok->Size().width, 160);
  // The option rows stand one under the other, 35 pixels apart (24 high,
  // 11 between): the step the dialog moves the column by.
  EXPECT_EQ(crop->Frame().top - focal->Frame().top, 35);
  EXPECT_FALSE(solver->IsVisible());
  // Each slider row's label is as wide as the others'.
  auto* scale = dynamic_cast<CEditSlider*>(Find(*window, "Project/Dialog/ImageScaleSlider"));
  auto* focalSlider = dynamic_cast<CEditSlider*>(Find(*window, "Project/Dialog/FocalLengthSlider"));
  ASSERT_NE(scale, nullptr);
  ASSERT_NE(focalSlider, nullptr);
  EXPECT_EQ(scale->Slider().LocalToWindow(CPoint{0, 0}).x,
            focalSlider->Slider().LocalToWindow(CPoint{0, 0}).x);
}

}  // namespace
}  // namespace Tarsa::testing
