#pragma once

#include <string>

namespace Project {

// One candidate profile as the host's lens profile service names it: the
// file, the camera and lens it was made for, and the sensor's crop factor.
// The matcher ranks candidates before it reads any file. A value; flagA and
// flagB are the host's and are only carried.
class PLensRepresent {
 public:
  PLensRepresent() = default;
  PLensRepresent(const PLensRepresent&) = default;
  PLensRepresent& operator=(const PLensRepresent&) = default;
  virtual ~PLensRepresent() = default;

  // The order of the matcher's set of candidates, which lets a duplicate of
  // the host's answer in only once: path, make, model, modelDisplay,
  // lensDisplay, lens, cropFactor, strings byte by byte.
  static bool IdentityLess(const PLensRepresent& a, const PLensRepresent& b);
  // Whether a goes before b as a profile for the photo `reference` (make,
  // model, lens and cropFactor): the same make first, then the same lens,
  // then the same model; then a sensor no smaller in crop than the photo's,
  // then the nearer crop factor.
  static bool RankLess(const PLensRepresent& a, const PLensRepresent& b,
                       const PLensRepresent& reference);

  std::string path;
  std::string make;
  std::string model;
  std::string lens;
  std::string modelDisplay;
  std::string lensDisplay;
  bool flagA = false;
  bool flagB = true;
  float cropFactor = 0.0f;
};

}  // namespace Project
