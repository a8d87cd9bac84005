#include "host/app/ImageBatch.h"

#include <algorithm>
#include <filesystem>
#include <set>
#include <system_error>

#include "host/io/HostError.h"
#include "host/io/ImageFile.h"

namespace Host {

namespace fs = std::filesystem;

namespace {

std::vector<std::string> FolderImages(const std::string& folder) {
  std::vector<std::string> images;
  std::error_code error;
  for (fs::directory_iterator it(folder, error), end; !error && it != end; it.increment(error)) {
    const fs::path& path = it->path();
    const std::string name = path.filename().string();
    const std::string stem = path.stem().string();
    std::error_code ignored;
    if (name.starts_with('.') || stem.ends_with(ImageBatch::kResultSuffix) ||
        !it->is_regular_file(ignored) || ImageFile::FormatFromName(name) == FileFormat::kNone) {
      continue;
    }
    images.push_back((fs::path(folder) / name).string());
  }
  if (error) throw HostError(folder, "cannot list the folder: " + error.message());
  if (images.empty()) throw HostError(folder, "the folder holds no TIFF, PNG or JPEG files");
  std::ranges::sort(images);
  return images;
}

// Whether two paths name the same file, existing or not.
bool SameFile(const std::string& a, const std::string& b) {
  std::error_code same, first, second;
  if (fs::equivalent(a, b, same)) return true;
  const fs::path canonicalA = fs::weakly_canonical(a, first);
  const fs::path canonicalB = fs::weakly_canonical(b, second);
  return !first && !second && canonicalA == canonicalB;
}

}  // namespace

std::string ImageBatch::DefaultOutput(const std::string& input) {
  const fs::path path(input);
  return (path.parent_path() / (path.stem().string() + kResultSuffix + path.extension().string()))
      .string();
}

std::vector<ImageBatch::Job> ImageBatch::Plan(const std::vector<std::string>& arguments,
                                              const std::optional<std::string>& output) {
  std::vector<Job> jobs;
  for (const std::string& argument : arguments) {
    std::error_code error;
    if (fs::is_directory(argument, error)) {
      for (std::string& image : FolderImages(argument)) jobs.push_back({std::move(image), {}});
    } else {
      jobs.push_back({argument, {}});
    }
  }

  std::error_code error;
  const bool toFolder = output && (fs::is_directory(*output, error) || output->ends_with('/'));
  if (toFolder && !fs::is_directory(*output, error)) {
    throw HostError(*output, "the output folder does not exist");
  }
  if (output && !toFolder && jobs.size() > 1) {
    throw HostError(*output, "-o names a file, but there are " + std::to_string(jobs.size()) +
                                 " images; name an existing folder instead");
  }
  std::set<std::string> taken;
  for (Job& job : jobs) {
    if (!output) {
      job.output = DefaultOutput(job.input);
    } else if (toFolder) {
      job.output = (fs::path(*output) / fs::path(job.input).filename()).string();
    } else {
      job.output = *output;
    }
    if (SameFile(job.input, job.output)) {
      throw HostError(job.output,
                      "the result would replace the input image; choose another output");
    }
    const std::string key = fs::weakly_canonical(job.output, error).string();
    if (!taken.insert(error ? job.output : key).second) {
      throw HostError(job.output, "two images would be written to the same file");
    }
  }
  return jobs;
}

}  // namespace Host
