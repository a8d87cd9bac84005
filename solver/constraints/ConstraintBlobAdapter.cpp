#include "solver/constraints/ConstraintBlobAdapter.h"

#include "solver/constraints/ConstraintList.h"
#include "solver/constraints/LineConstraint.h"
#include "solver/constraints/PlaneConstraint.h"

namespace Project {

std::vector<BlobRecord> ConstraintBlobAdapter::ToRecords(const ConstraintList& list) {
  std::vector<BlobRecord> records;
  records.reserve(list.Items().size());
  for (const auto& item : list.Items()) {
    if (const auto* line = dynamic_cast<const LineConstraint*>(item.get())) {
      BlobLine record;
      record.x0 = line->GetStart().x;
      record.y0 = line->GetStart().y;
      record.x1 = line->GetEnd().x;
      record.y1 = line->GetEnd().y;
      record.kind = line->GetOrientation(&record.angle);
      records.emplace_back(record);
    } else if (const auto* plane = dynamic_cast<const PlaneConstraint*>(item.get())) {
      BlobPolygon record;
      for (const PlaneCorner& corner : plane->GetCorners()) {
        record.points.push_back({corner.x, corner.y});
        record.edgeKinds.push_back(corner.edgeOrientation);
      }
      records.emplace_back(std::move(record));
    }
  }
  return records;
}

std::unique_ptr<Constraint> ConstraintBlobAdapter::FromRecord(const BlobRecord& record) {
  if (const auto* line = std::get_if<BlobLine>(&record)) {
    auto constraint =
        std::make_unique<LineConstraint>(Point2f{line->x0, line->y0}, Point2f{line->x1, line->y1});
    constraint->StoreOrientation(line->kind,
                                 line->kind == LineConstraint::kArbitrary ? line->angle : 0.0f);
    return constraint;
  }
  const auto& polygon = std::get<BlobPolygon>(record);
  auto constraint = std::make_unique<PlaneConstraint>();
  for (std::size_t k = 0; k < polygon.points.size(); ++k) {
    const std::int32_t kind = k < polygon.edgeKinds.size() ? polygon.edgeKinds[k] : 1;
    constraint->AddCorner({polygon.points[k].x, polygon.points[k].y}, kind);
  }
  return constraint;
}

void ConstraintBlobAdapter::ReadRecords(ConstraintList& list,
                                        const std::vector<BlobRecord>& records) {
  list.RemoveAll();
  for (const BlobRecord& record : records) list.Append(FromRecord(record));
}

std::vector<std::uint8_t> ConstraintBlobAdapter::WriteBlob(const ConstraintList& list) {
  return ConstraintBlob::Encode(ToRecords(list));
}

void ConstraintBlobAdapter::ReadBlob(ConstraintList& list, const std::uint8_t* data,
                                     std::size_t size) {
  ReadRecords(list, ConstraintBlob::Decode(data, size));
}

}  // namespace Project
