// The constraint blob under the descriptor's cnsD key: decoded into records,
// each record made into the constraint the list would hold.
#include <cstddef>
#include <cstdint>
#include <vector>

#include "params/ConstraintBlob.h"
#include "solver/constraints/Constraint.h"
#include "solver/constraints/ConstraintBlobAdapter.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::vector<Project::BlobRecord> records = Project::ConstraintBlob::Decode(data, size);
  if (Project::ConstraintBlob::ByteSize(records) > size) {
    Fuzz::Broken("the records take more bytes than the blob had");
  }
  for (const Project::BlobRecord& record : records) {
    const auto constraint = Project::ConstraintBlobAdapter::FromRecord(record);
    if (constraint == nullptr) Fuzz::Broken("a record made no constraint");
  }
  // What was decoded encodes to bytes that decode to as many records.
  const std::vector<std::uint8_t> encoded = Project::ConstraintBlob::Encode(records);
  if (Project::ConstraintBlob::Decode(encoded.data(), encoded.size()).size() != records.size()) {
    Fuzz::Broken("a blob written back holds a different number of records");
  }
  return 0;
}
