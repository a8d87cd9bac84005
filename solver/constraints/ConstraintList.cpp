#include "solver/constraints/ConstraintList.h"

#include <algorithm>
#include <cmath>

#include "solver/constraints/LineConstraint.h"
#include "solver/constraints/PlaneConstraint.h"
#include "solver/constraints/TraceConstraint.h"
#include "solver/frame/Solver.h"

namespace Project {

ConstraintList::ConstraintList(SolverContext& context) : context_(context) {}

ConstraintList::~ConstraintList() = default;

Solver& ConstraintList::GetSolver() {
  if (!solver_) {
    solver_ = std::make_unique<Solver>(context_);
    solver_->SetConstraints(this);
  }
  return *solver_;
}

ConstraintEnv ConstraintList::Env() { return {GetSolver(), context_}; }

ConstraintList::ItemList::iterator ConstraintList::FindItem(std::int32_t id) {
  return std::find_if(items_.begin(), items_.end(),
                      [id](const std::unique_ptr<Constraint>& c) { return c->GetId() == id; });
}

Constraint* ConstraintList::Find(std::int32_t id) const {
  for (const auto& item : items_) {
    if (item->GetId() == id) return item.get();
  }
  return nullptr;
}

bool ConstraintList::Add(std::unique_ptr<Constraint> constraint) {
  Constraint& added = *constraint;
  Append(std::move(constraint));
  return added.Register(GetSolver());
}

bool ConstraintList::AddClone(const Constraint& constraint) {
  items_.push_back(constraint.Clone());
  return items_.back()->Register(GetSolver());
}

void ConstraintList::Append(std::unique_ptr<Constraint> constraint) {
  constraint->SetId(nextId_++);
  items_.push_back(std::move(constraint));
}

void ConstraintList::Replace(std::int32_t id, const Constraint& templ) {
  Constraint* item = Find(id);
  if (item == nullptr) return;
  if (auto* plane = dynamic_cast<PlaneConstraint*>(item)) {
    const auto* shape = dynamic_cast<const PlaneConstraint*>(&templ);
    if (shape == nullptr) return;
    *plane = *shape;
    plane->SetId(id);
    plane->Rebuild(GetSolver());
    plane->Update(Env());
  } else if (auto* line = dynamic_cast<LineConstraint*>(item)) {
    const auto* shape = dynamic_cast<const LineConstraint*>(&templ);
    if (shape == nullptr) return;
    line->SetStart(shape->GetStart());
    line->SetEnd(shape->GetEnd());
    RetraceConstraint(GetSolver(), *line, 2);
  }
}

std::unique_ptr<Constraint> ConstraintList::ReplaceItem(const Constraint& old,
                                                        std::unique_ptr<Constraint> replacement) {
  auto it = std::find_if(items_.begin(), items_.end(),
                         [&](const std::unique_ptr<Constraint>& c) { return c.get() == &old; });
  if (it == items_.end()) return replacement;
  replacement->SetId(old.GetId());
  replacement->Register(GetSolver());
  std::swap(*it, replacement);
  return replacement;
}

void ConstraintList::Remove(const Constraint& constraint) {
  const std::int32_t id = constraint.GetId();
  auto it = FindItem(id);
  if (it == items_.end()) return;
  if (solver_) (*it)->Unregister(*solver_);
  items_.erase(it);
  std::erase(selected_, id);
}

void ConstraintList::RemoveAll() {
  items_.clear();
  selected_.clear();
  if (!solver_) return;
  if (const auto& lines = solver_->GetLines()) {
    lines->GetLines().clear();
    lines->GetPlanes().clear();
  }
}

std::size_t ConstraintList::TotalSerializedSize() const {
  std::size_t size = 0;
  for (const auto& item : items_) size += item->GetSerializedSize();
  return size;
}

bool ConstraintList::IsSelected(const Constraint& constraint) const {
  return std::find(selected_.begin(), selected_.end(), constraint.GetId()) != selected_.end();
}

void ConstraintList::Select(std::int32_t id) {
  if (std::find(selected_.begin(), selected_.end(), id) == selected_.end()) {
    selected_.push_back(id);
  }
}

void ConstraintList::Deselect(const Constraint& constraint) {
  std::erase(selected_, constraint.GetId());
}

void ConstraintList::SelectOnly(const Constraint& constraint) {
  selected_.assign(1, constraint.GetId());
}

Constraint* ConstraintList::FirstSelected() const {
  for (const auto& item : items_) {
    if (IsSelected(*item)) return item.get();
  }
  return nullptr;
}

void ConstraintList::ReduceSelection() {
  for (const std::int32_t id : selected_) {
    if (Find(id) != nullptr) {
      selected_.assign(1, id);
      return;
    }
  }
}

Constraint* ConstraintList::FindAt(Point2f point, bool inWarpedView, float tolerance) {
  const ConstraintEnv env = Env();
  Constraint* first = FirstSelected();
  if (first != nullptr && first->HitTest(env, point, inWarpedView, tolerance)) return first;
  for (const auto& item : items_) {
    if (item->HitTest(env, point, inWarpedView, tolerance)) return item.get();
  }
  return nullptr;
}

LineConstraint* ConstraintList::PickRotationHandle(Point2f point, float tolerance, float zoom,
                                                   std::int32_t& outCursor) {
  auto* line = dynamic_cast<LineConstraint*>(FirstSelected());
  if (line == nullptr) return nullptr;
  const ConstraintEnv env = Env();
  if (!line->IsValid(env.solver)) return nullptr;
  float degrees = 0.0f;
  line->GetOrientation(&degrees);
  RotationGadget gadget;
  if (!line->GetRotationGadget(env, zoom, degrees, gadget)) return nullptr;
  auto near = [&](Point2f grip) {
    return std::hypot(point.x - grip.x, point.y - grip.y) < tolerance;
  };
  const bool hit = near(gadget.grips[0]) || near(gadget.grips[1]);
  if (!hit) return nullptr;
  outCursor =
      LineConstraint::RotationCursor(degrees, point.x - gadget.middle.x, point.y - gadget.middle.y);
  return line;
}

void ConstraintList::RegisterAll(Solver& solver) {
  for (const auto& item : items_) item->Register(solver);
}

void ConstraintList::UpdateDisplays(Solver& solver, std::int32_t id) {
  const ConstraintEnv env{solver, context_};
  for (const auto& item : items_) {
    if (id == -1 || item->GetId() == id) item->Update(env);
  }
}

}  // namespace Project
