#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "framework/plugin/HostSuites.h"
#include "lens/metadata/PhotoInfo.h"
#include "lens/profiles/PLensProfiles.h"
#include "lens/profiles/PLensRepresent.h"

namespace Project {

// Finds the lens profile of the photo: asks the host's lens profile service
// for candidate files, ranks them against the photo's camera, lens and crop
// factor, reads the best one and puts its entry nearest to the photo's
// shooting data into the run's lens record. Failures are codes (kNo...),
// kept in LastError() and, when asked to warn, shown in an alert and
// cleared. One per run, made at first use; what it needs of the run comes
// through Run, which outlives it.
class PLensMatcher {
 public:
  // Failure codes, each with its alert text.
  static constexpr std::int32_t kNoLensSuite = 1;
  static constexpr std::int32_t kNoBasicSuite = 2;
  static constexpr std::int32_t kNoMatch = 3;
  static constexpr std::int32_t kUnreadableProfile = 4;
  static constexpr std::int32_t kIncorrectProfile = 5;
  static constexpr std::int32_t kOutOfMemory = 6;

  // The run's side of a match.
  class Run {
   public:
    virtual ~Run() = default;
    // The host's basic (buffer) suite; null when the host has none.
    virtual const Tarsa::HostBufferSuite* BasicSuite() = 0;
    // The lens profile suite, acquired when needed; null when unavailable.
    virtual const Tarsa::HostLensProfilesSuite* LensProfilesSuite() = 0;
    // The photo's metadata; null when there is none.
    virtual const PhotoInfo* LensPhoto() = 0;
    // The settings' lensRecord and lensKey.
    virtual PhotoInfo& LensRecord() = 0;
    virtual std::string& LensKey() = 0;
    // CropRatio of the lens record against the photo, as the run keeps it.
    virtual float LensCropRatio() = 0;
  };

  explicit PLensMatcher(Run& run) : run_(run) {}
  PLensMatcher(const PLensMatcher&) = delete;
  PLensMatcher& operator=(const PLensMatcher&) = delete;

  // True when a usable profile entry is in the lens record and its crop
  // ratio to the photo is above 0.001. A photo without a camera make never
  // reaches the host. With no candidates the lens record stays as it was.
  bool MatchProfile(bool warn);
  // Reads the candidate's file into profiles and its entry nearest to the
  // photo into the lens record; a file that is missing, empty or no sound
  // profile blanks the record and still answers true. False for a
  // candidate without a path, or when memory ran out (code 6).
  bool LoadProfile(const PLensRepresent& candidate);
  // Code 0 shows the kept failure, another code is kept and shown; the kept
  // code is cleared after.
  void Report(std::int32_t code);

  // 1.0 for a record of the photo's own camera and lens, else the photo's
  // crop factor over the record's sensorFormatFactor (1.0 when they are
  // within 0.01), 0.0 when either is unknown.
  static float CropRatio(const PhotoInfo& record, const PhotoInfo& photo);
  static const char* TextOf(std::int32_t code);

  const std::vector<std::unique_ptr<PLensRepresent>>& Candidates() const { return candidates_; }
  const PLensProfiles& Profiles() const { return profiles_; }
  std::int32_t LastError() const { return lastError_; }

 private:
  // Asks the host; fills candidates_ ranked. Answers a failure code.
  std::int32_t QueryCandidates(const Tarsa::HostBufferSuite& basic,
                               const Tarsa::HostLensProfilesSuite& suite, const PhotoInfo& photo);
  // Frees the host's answer and the filter's strings, then zeroes the block.
  static void ReleaseQuery(const Tarsa::HostBufferSuite& basic, Tarsa::HostLensQuery& query);
  static PLensRepresent Candidate(const Tarsa::HostLensResult& result);

  Run& run_;
  std::vector<std::unique_ptr<PLensRepresent>> candidates_;
  PLensProfiles profiles_;
  std::int32_t lastError_ = 0;
};

}  // namespace Project
