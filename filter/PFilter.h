#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "filter/PImageHub.h"
#include "filter/PRenderContext.h"
#include "framework/plugin/CQuillmarkFilter.h"
#include "lens/metadata/PhotoInfo.h"
#include "lens/profiles/PLensMatcher.h"
#include "lens/sphere/PhotoToSphere.h"
#include "params/Descriptor.h"
#include "params/PPreferences.h"
#include "params/PSettings.h"
#include "solver/constraints/ConstraintList.h"
#include "solver/frame/SolverContext.h"

namespace Project {

// The program: the module's one filter object, alive from the first
// parameters, prepare or start selector to finish or the first failure. It
// decides in DoStart whether a run is interactive, scripted or refused, and
// what goes back to the host. It owns, each made on first use and deleted
// with it, the image hub (whose making starts OpenGL), the working settings
// and the preferences; the photo's metadata and the host's lens profile
// suite are held for one run. The image hub and its stages see it only as
// their PRenderContext. The rest of the program reaches it through
// Current().
class PFilter : public Tarsa::CQuillmarkFilter,
                private PLensMatcher::Run,
                private SolverContext,
                private PRenderContext {
 public:
  // What the photo's metadata says about its focal length; zero is absent.
  struct FocalData {
    float focalLength = 0;      // millimetres
    float cropFactor = 0;       // sensor crop factor
    float focalLength35mm = 0;  // 35 mm equivalent, millimetres
    bool complete = false;      // the image is a panorama with its own focal data
  };

  PFilter();
  ~PFilter() override;

  // The module's filter object, or null.
  static PFilter* Current();

  Tarsa::CString ProcessName() const override { return "$$$/Archway/Process/Name=Archway"; }

  // first: the floor of 80 % of total; second: the rest.
  bool SplitMemory(std::uint32_t total, std::uint32_t& first, std::uint32_t& second) override;
  // Switches on 32-bit coordinates.
  bool DoParameters() override;
  bool DoPrepareFinish() override;
  // The run (see the .cpp for its order).
  bool DoStart() override;

  // The lazily made objects of a run.
  PImageHub& ImageHub();
  PSettings& Settings() override;
  // The constraint list, which owns the run's Solver; made at first use.
  ConstraintList& Constraints();
  // Whether the last solve failed, for the dialog's warning line.
  bool SolveFailed() const { return solveFailed_ != 0; }
  // Loaded from the preferences directory unless Ctrl, Alt and Shift are
  // all held at the moment of making.
  PPreferences& Preferences();
  bool HasImageHub() const { return imageHub_ != nullptr; }
  bool HasPreferences() const { return preferences_ != nullptr; }
  // The photo's metadata; null outside a run's start.
  const PhotoInfo* Photo() const override { return photoInfo_.get(); }
  bool Rendered() const { return rendered_ != 0; }

  // Where the filter's files live; empty when it cannot be had.
  std::string PreferencesDirectory() const;

  // Decides settings' projection model; see the .cpp.
  void ResolveProjectionModel(std::int32_t fallback, bool forceAuto, bool warn);
  // Takes the photo's focal length and crop factor into the settings and
  // answers the focal length in pixels.
  float FocalFromMetadata(bool initial);
  // Millimetres to pixels and back, over the larger side of the image.
  float ImageFocal();
  float PhysicalFromImage();
  // The sensible focal lengths in millimetres, widened to take the one the
  // metadata gives; false when the image or crop factor is empty.
  bool PhysicalFocalRange(float& low, float& high);
  // The same as focal lengths in pixels.
  bool ImageFocalRange(float& low, float& high);

  // Builds the grid and solves it as a scripted run does, from the settings
  // alone: the dialog's OK ends with this, so that what it writes is what a
  // replay of the stored action writes.
  void SolveAfresh();
  // One solve of the grid as it stands, with its constraints.
  void Solve();

  // What the photo's metadata says of its focal length, for As Shot.
  FocalData PhotoFocalData() const { return MetadataFocalData(); }

  // The run's lens profile matcher, made at first use.
  PLensMatcher& LensMatcher();
  // The lens record's crop ratio to the photo (see PLensMatcher::CropRatio),
  // kept for CropRatio().
  float GetCropRatio();
  float CropRatio() const { return cropRatio_; }
  // The sphere model of the settings' projection model over image: the
  // photo's panorama, or with Auto the matched profile's camera model and
  // crop ratio. False, with model as it was, when none can be built.
  bool ChooseSphereModel(const std::shared_ptr<const Image>& image,
                         std::shared_ptr<PhotoToSphere>& model);

  // The scripting descriptor of the record's script block.
  bool ReadDescriptor(PSettings& target);
  // A silent run: the model and focal length the descriptor did not give
  // (said holds the keys it gave) come from the photo, as an interactive
  // start takes them; an automatic model without a matching lens profile
  // goes by the 35 mm equivalent focal length.
  void ResolveUnsaid(const std::vector<std::uint32_t>& said);
  // Throws the framework's error, naming the key and the value, when a
  // replayed descriptor left a value no run can use: a number that is not
  // finite, a focal length outside the photo's focal range, a crop factor,
  // scale or centre out of bounds. Runs before any pixel is read.
  void RefuseUnusableValues();
  void WriteDescriptor(const PSettings& source);
  // The behavioural parameters file over the settings.
  void LoadBehaviorFile();

 protected:
  // The photo's focal data; every value absent outside a run's start.
  virtual FocalData MetadataFocalData() const;
  // True when a lens profile of the photo was found and put in the settings.
  virtual bool MatchLensProfile(bool warn);
  // The fragment shader's file; empty: the one beside the host executable.
  virtual std::string ShaderFile() const { return {}; }
  // The interactive run: the workspace, open until the user closes it; true
  // when it closed with OK after the final image went to the host. The
  // filter alone has no workspace and refuses.
  virtual bool RunDialog();

 private:
  void OpenMetadata();
  void CloseMetadata();
  void EndRun();
  void PrepareSolver();
  float KnownPhysicalFocal();
  std::int64_t LargerSide() const;

  // The lens matcher's view of the run.
  const Tarsa::HostBufferSuite* BasicSuite() override { return BufferSuite(); }
  const Tarsa::HostLensProfilesSuite* LensProfilesSuite() override;
  const PhotoInfo* LensPhoto() override { return photoInfo_.get(); }
  PhotoInfo& LensRecord() override { return Settings().lensRecord; }
  std::string& LensKey() override { return Settings().lensKey; }
  float LensCropRatio() override { return GetCropRatio(); }

  // The solver's view of the run. Until a preview pane exists the preview
  // is the image itself, so constraint points are image pixels.
  std::int32_t SourceWidth() const override;
  std::int32_t SourceHeight() const override;
  std::int32_t PreviewWidth() const override { return SourceWidth(); }
  std::int32_t PreviewHeight() const override { return SourceHeight(); }
  bool BuildImageModel(const std::shared_ptr<const Image>& image,
                       std::shared_ptr<PhotoToSphere>& model) override {
    return ChooseSphereModel(image, model);
  }
  void ReportSolve(bool failed) override { solveFailed_ = failed ? 1 : 0; }
  // A new mesh makes every rendered result stale.
  void RebuildResults() override {
    if (imageHub_ != nullptr) imageHub_->RebuildResults();
  }
  void RedrawResults() override {
    if (imageHub_ != nullptr && imageHub_->HasPreview()) imageHub_->RebuildResults();
  }

  // The render stages' view of the run.
  Tarsa::CQuillmarkFilter& RenderHost() override { return *this; }
  const PSettings& RenderSettings() override { return Settings(); }
  const Solver& RenderSolver() override { return Constraints().GetSolver(); }

  std::unique_ptr<PImageHub> imageHub_;
  std::unique_ptr<PSettings> settings_;
  std::unique_ptr<PPreferences> preferences_;
  std::unique_ptr<PhotoInfo> photoInfo_;
  std::unique_ptr<ConstraintList> constraints_;
  std::uint8_t solveFailed_ = 0;
  std::uint8_t rendered_ = 0;
  std::uint8_t metadataToolkitOpen_ = 0;
  const Tarsa::HostLensProfilesSuite* lensSuite_ = nullptr;
  std::unique_ptr<PLensMatcher> lensMatcher_;
  // The keys the last ReadDescriptor found values for.
  DescriptorReport descriptorRead_;
  float cropRatio_ = 0;
};

}  // namespace Project
