#pragma once

#include <cstddef>
#include <memory>
#include <vector>

#include "lens/metadata/PhotoInfo.h"

namespace Project {

// The entries of one lens profile file: for each calibrated setting of the
// lens (focal length, aperture, focus distance) its shooting data and camera
// model, kept in a fixed order (EntryLess; equal entries in the order they
// were read). Owns its entries and their models. Reading a file adds its
// entries only when the file as a whole is sound.
class PLensProfiles {
 public:
  PLensProfiles() = default;
  PLensProfiles(const PLensProfiles&) = delete;
  PLensProfiles& operator=(const PLensProfiles&) = delete;

  void Clear() { entries_.clear(); }
  std::size_t Count() const { return entries_.size(); }
  // In order; index below Count().
  const PhotoInfo& Entry(std::size_t index) const { return *entries_[index]; }

  // Reads the XMP document of size bytes: its array CameraProfiles, at most
  // one item when firstOnly is set. Unusable entries are dropped; the rest
  // join the list when they pass PassesFileCheck, and the answer says so.
  // The XMP toolkit must be open. Never throws for the file's content.
  bool ParseFile(const char* data, std::size_t size, bool firstOnly);
  // Adds one entry in its place in the order.
  void Insert(std::unique_ptr<PhotoInfo> entry);

  // The entry nearest to the photo's shooting data (NearerLess), null when
  // there are none. outList, when given, gets the first `limit` entries in
  // that order, all of them when limit is 0.
  const PhotoInfo* BestProfile(const PhotoInfo& photo,
                               std::vector<const PhotoInfo*>* outList = nullptr,
                               std::size_t limit = 0) const;

  // An entry with a radial, tangential or fisheye model that is valid.
  static bool IsUsable(const PhotoInfo& entry);
  // What makes one file: entries all usable, of the first one's camera and
  // lens, agreeing with it on having a focal length, on the raw flag and on
  // the sensor (crop factors within 0.05), and not mixing fisheye models
  // with others. An empty list fails.
  static bool PassesFileCheck(const std::vector<const PhotoInfo*>& entries);
  // The list's order: camera, lens, focal length, aperture, image size and
  // resolution, focus distance, raw profiles first; entries with the same
  // calibration are equal.
  static bool EntryLess(const PhotoInfo& a, const PhotoInfo& b);
  // BestProfile's order against photo: the nearer focal length (the longest
  // when the photo has none), then aperture, then focus distance; each
  // decides only when the two differ by 0.01 or more, and two at an equal
  // distance keep the list's order.
  static bool NearerLess(const PhotoInfo& a, const PhotoInfo& b, const PhotoInfo& photo);

 private:
  std::vector<std::unique_ptr<PhotoInfo>> entries_;
};

}  // namespace Project
