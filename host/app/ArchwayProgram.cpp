#include "host/app/ArchwayProgram.h"

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <optional>
#include <string>

#include "framework/native/NativeDisplay.h"
#include "host/actions/ActionFile.h"
#include "host/app/CommandLine.h"
#include "host/app/ImageBatch.h"
#include "host/app/TerminalProgress.h"
#include "host/io/HostError.h"
#include "host/io/ImageFile.h"
#include "host/platform/Interruption.h"
#include "host/platform/SystemInfo.h"
#include "host/plugin/FilterRun.h"
#include "host/plugin/HostRecord.h"
#include "host/plugin/PluginModule.h"

namespace Host {

namespace {

constexpr const char* kUsageText =
    "Usage: archway apply [options] <image or folder>...\n"
    "       archway edit  [options] <image or folder>...\n"
    "\n"
    "Straightens what wide-angle, fisheye and panoramic photographs bend.\n"
    "\n"
    "Commands:\n"
    "  apply   correct each image silently, with the correction stored in an\n"
    "          action file (--action), or else from the default settings\n"
    "  edit    open the workspace on each image and correct it interactively\n"
    "\n"
    "Images are TIFF, PNG or JPEG files in Gray, RGB, Lab or CMYK at 8 or 16\n"
    "bits. A folder stands for its image files, in name order, except hidden\n"
    "files and earlier results (*-archway.*). The input files are never\n"
    "changed. Each result goes beside its image as <name>-archway.<ext>,\n"
    "unless -o says otherwise; it is written under a temporary name and\n"
    "renamed when complete, so a failed or interrupted run leaves no output.\n"
    "\n"
    "Options:\n"
    "  -o, --output PATH     the result file (one image), or an existing\n"
    "                        folder for the results (one or more images); the\n"
    "                        extension chooses the format\n"
    "  --action FILE         replay the correction stored in an action file\n"
    "  --save-action FILE    store the module's correction in an action file\n"
    "                        (one image only), to replay later with --action\n"
    "  --module PATH         the module to run; else $ARCHWAY_MODULE, else\n"
    "                        Archway.so beside this program\n"
    "  --no-gpu              tell the module the graphics processor is off\n"
    "  --timings             say where each image's time went: reading, the\n"
    "                        module's start (metadata and solve), rendering,\n"
    "                        writing\n"
    "  --host-version N      tell the module the host's major version is N\n"
    "                        (default 18), to check how it answers others\n"
    "  -h, --help            show this text\n"
    "\n"
    "Progress is shown on a terminal. Ctrl-C stops the run: the current\n"
    "image is not written and no further image is started.\n"
    "\n"
    "Exit status: 0 all images corrected (or, with edit, closed by the user),\n"
    "1 an image or file failed (the others are still done), 2 a wrong command\n"
    "line, 130 interrupted.\n";

void Report(const std::string& message) { std::fprintf(stderr, "archway: %s\n", message.c_str()); }

std::string ModulePath(const CommandLine& line) {
  if (line.module) return *line.module;
  if (const char* path = std::getenv("ARCHWAY_MODULE"); path != nullptr && *path != '\0') {
    return path;
  }
  const std::string folder = SystemInfo::ExecutableFolder();
  return (folder.empty() ? std::string(".") : folder) + "/Archway.so";
}

std::string FileName(const std::string& path) {
  const size_t slash = path.rfind('/');
  return slash == std::string::npos ? path : path.substr(slash + 1);
}

enum class ImageResult { kDone, kFailed, kInterrupted, kStop };

ImageResult CorrectImage(const CommandLine& line, PluginModule& module,
                         const std::optional<Descriptor>& action, const ImageBatch::Job& job) {
  using Clock = std::chrono::steady_clock;
  const Clock::time_point started = Clock::now();
  std::unique_ptr<HostDocument> document;
  try {
    document = ImageFile::Read(job.input);
  } catch (const HostError& error) {
    Report(error.what());
    return ImageResult::kFailed;
  }
  if (const std::string refusal = module.Refusal(*document); !refusal.empty()) {
    Report("'" + job.input + "': " + refusal);
    return ImageResult::kFailed;
  }
  FileFormat format = ImageFile::FormatFromName(job.output);
  if (format == FileFormat::kNone) format = document->SourceFormat();
  if (const std::string refusal = ImageFile::WriteRefusal(*document, format); !refusal.empty()) {
    Report("'" + job.output + "': " + refusal);
    return ImageResult::kFailed;
  }
  try {
    module.Load();
  } catch (const HostError& error) {
    Report(error.what());
    return ImageResult::kStop;
  }

  FilterRun::Options options;
  options.kind = line.command == CommandLine::Command::kEdit ? FilterRun::Kind::kInteractive
                                                             : FilterRun::Kind::kSilent;
  options.host.majorVersion = line.hostVersion;
  options.host.graphicsProcessor = !line.noGraphicsProcessor;
  options.host.title = FileName(job.input);
  options.host.scratchVolumes = {SystemInfo::TemporaryFolder()};
  options.action = action;
  options.memoryOffer = HostRecord::DefaultMemoryOffer();

  TerminalProgress progress(FileName(job.input));
  const Clock::time_point read = Clock::now();
  const FilterRun::Outcome outcome = FilterRun::Run(module.Entry(), *document, options, progress);
  const Clock::time_point ran = Clock::now();
  progress.Clear();
  if (outcome.status == FilterRun::Outcome::Status::kCancelled || Interruption::Requested()) {
    Report("interrupted; '" + job.output + "' was not written");
    return ImageResult::kInterrupted;
  }
  if (outcome.status == FilterRun::Outcome::Status::kClosed) {
    Report("'" + job.input + "': the workspace closed without correcting it; '" + job.output +
           "' was not written");
    return ImageResult::kDone;
  }
  if (outcome.status == FilterRun::Outcome::Status::kFailed) {
    Report("'" + job.input + "': not corrected: " + outcome.failure);
    return ImageResult::kFailed;
  }
  try {
    ImageFile::Write(*document, job.output, format);
    if (line.timings) {
      // The render starts with the module's first progress report.
      const Clock::time_point rendering = progress.FirstReport().value_or(ran);
      const auto seconds = [](Clock::time_point from, Clock::time_point to) {
        char text[32];
        std::snprintf(text, sizeof text, "%.3f s",
                      std::chrono::duration<double>(to - from).count());
        return std::string(text);
      };
      Report("'" + job.input + "': read " + seconds(started, read) + ", start " +
             seconds(read, rendering) + ", render " + seconds(rendering, ran) + ", write " +
             seconds(ran, Clock::now()));
    }
    if (line.saveAction) {
      if (!outcome.descriptor) {
        throw HostError(*line.saveAction, "the module left no action to save");
      }
      ActionFile::Write(*outcome.descriptor, *line.saveAction);
    }
  } catch (const HostError& error) {
    Report(error.what());
    return ImageResult::kFailed;
  }
  return ImageResult::kDone;
}

}  // namespace

const char* ArchwayProgram::Usage() { return kUsageText; }

int ArchwayProgram::Main(int argc, char** argv) {
  std::vector<std::string> arguments;
  for (int i = 1; i < argc; ++i) arguments.emplace_back(argv[i]);
  return Run(arguments);
}

int ArchwayProgram::Run(const std::vector<std::string>& arguments) {
  CommandLine line;
  try {
    line = CommandLine::Parse(arguments);
  } catch (const HostError& error) {
    Report(std::string(error.what()) + " (see archway --help)");
    return kUsage;
  }
  if (line.command == CommandLine::Command::kHelp) {
    std::fputs(kUsageText, stdout);
    return 0;
  }
  // The workspace is a window: without a display there is nothing to open
  // it on, and saying so before any image is read loses nothing.
  if (line.command == CommandLine::Command::kEdit && !Tarsa::Native::HasDisplay()) {
    Report(
        "edit opens the workspace in a window, and no display is set (DISPLAY); "
        "'archway apply' corrects images without one");
    return kFailed;
  }

  std::vector<ImageBatch::Job> jobs;
  std::optional<Descriptor> action;
  std::unique_ptr<PluginModule> module;
  try {
    jobs = ImageBatch::Plan(line.inputs, line.output);
    if (line.saveAction && jobs.size() > 1) {
      throw HostError(*line.saveAction,
                      "--save-action takes one image, not " + std::to_string(jobs.size()));
    }
    module = PluginModule::Inspect(ModulePath(line));
    if (line.action) {
      std::optional<ActionTerms> terms;
      if (module->Terminology() != nullptr) terms.emplace(*module->Terminology());
      action = ActionFile::Read(*line.action, terms ? &*terms : nullptr);
    }
  } catch (const HostError& error) {
    Report(error.what());
    return kFailed;
  }

  Interruption::Catch();
  bool failed = false;
  for (const ImageBatch::Job& job : jobs) {
    if (Interruption::Requested()) {
      Report("interrupted; '" + job.output + "' was not written");
      return kInterrupted;
    }
    switch (CorrectImage(line, *module, action, job)) {
      case ImageResult::kDone:
        break;
      case ImageResult::kFailed:
        failed = true;
        break;
      case ImageResult::kInterrupted:
        return kInterrupted;
      case ImageResult::kStop:
        return kFailed;
    }
  }
  return failed ? kFailed : 0;
}

}  // namespace Host
