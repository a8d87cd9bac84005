#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

#include "params/ConstraintBlob.h"

namespace Project {

class Constraint;
class ConstraintList;

// Moves constraints between the list and the blob records that ride in the
// scripting descriptor and the stored parameters, so that a scripted run
// solves the constraints its action carries. Ids are not in the blob: the
// list gives fresh ones when records come in. Stateless.
class ConstraintBlobAdapter {
 public:
  ConstraintBlobAdapter() = delete;

  // One record per item, in list order: a line's ends, kind and reported
  // angle; a polygon's corners and edge kinds.
  static std::vector<BlobRecord> ToRecords(const ConstraintList& list);
  // A new constraint with no id; polygon corners usable, a missing edge kind
  // Unfixed; a line's angle kept for kind 4 only.
  static std::unique_ptr<Constraint> FromRecord(const BlobRecord& record);
  // Replaces the list's items by the records' constraints, with ids from
  // the list's counter. Nothing is traced: the warp build (or RegisterAll)
  // traces them once the solver's mesh exists.
  static void ReadRecords(ConstraintList& list, const std::vector<BlobRecord>& records);

  // The same in the blob's bytes.
  static std::vector<std::uint8_t> WriteBlob(const ConstraintList& list);
  static void ReadBlob(ConstraintList& list, const std::uint8_t* data, std::size_t size);
};

}  // namespace Project
