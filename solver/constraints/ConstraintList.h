#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

#include "solver/constraints/Constraint.h"
#include "solver/frame/ConstraintSet.h"

namespace Project {

class LineConstraint;
class SolverContext;

// The filter's one list of constraints, and the way every tool reaches
// them. It owns the constraints, in order of creation, and the Solver that
// traces and solves them, made at first use; the filter's context, which
// the solver reads too, is borrowed and outlives the list.
//
// Ids come from a counter that only grows: an id is never given twice in a
// run, so the undo tasks can find a constraint by id after any removal. The
// traced records in the solver's store follow the constraints by id: adding
// traces, removing drops the record, replacing retraces.
//
// The solver borrows the list back, as its ConstraintSet, to retrace and
// reshow everything on each new warp. Runs on the dialog's thread.
class ConstraintList final : public ConstraintSet {
 public:
  explicit ConstraintList(SolverContext& context);
  ConstraintList(const ConstraintList&) = delete;
  ConstraintList& operator=(const ConstraintList&) = delete;
  ~ConstraintList() override;

  Solver& GetSolver();
  bool HasSolver() const { return solver_ != nullptr; }
  SolverContext& Context() const { return context_; }
  // The list's solver and context, for a constraint's own operations.
  ConstraintEnv Env();

  // --- Items ---

  const std::vector<std::unique_ptr<Constraint>>& Items() const { return items_; }
  bool IsEmpty() const override { return items_.empty(); }
  Constraint* Find(std::int32_t id) const;
  std::int32_t NextId() const { return nextId_; }

  // Gives the constraint the next id, takes it and traces it; answers
  // whether the trace succeeded (a polygon always does). Before the solver
  // has a warp nothing is traced, and a line answers false.
  bool Add(std::unique_ptr<Constraint> constraint);
  // Appends and traces a clone that keeps the constraint's id: how an undo
  // task puts back a constraint it holds.
  bool AddClone(const Constraint& constraint);
  // Gives the next id and takes the constraint without tracing it; the next
  // warp build, or RegisterAll, traces it.
  void Append(std::unique_ptr<Constraint> constraint);
  // Gives the item with that id the shape of the template (a line its ends,
  // a polygon its corners) and retraces it. Other ids, or a template of
  // another kind, do nothing.
  void Replace(std::int32_t id, const Constraint& templ);
  // Puts replacement, traced and with old's id, in old's place and hands
  // old back; when old is not in the list, replacement comes back.
  std::unique_ptr<Constraint> ReplaceItem(const Constraint& old,
                                          std::unique_ptr<Constraint> replacement);
  // Deletes the item with the constraint's id, drops its record and its
  // selection.
  void Remove(const Constraint& constraint);
  // Deletes every item, the selection and all records.
  void RemoveAll();
  // Bytes of the stored blob of all items.
  std::size_t TotalSerializedSize() const;

  // --- Selection, by id ---

  bool IsSelected(const Constraint& constraint) const;
  void Select(std::int32_t id);
  void Deselect(const Constraint& constraint);
  void ClearSelection() { selected_.clear(); }
  void SelectOnly(const Constraint& constraint);
  // The first item, in list order, that is selected; null when none is.
  Constraint* FirstSelected() const;
  // Keeps only the first selected id that still has an item; when none
  // has, the selection is left alone.
  void ReduceSelection();
  const std::vector<std::int32_t>& Selected() const { return selected_; }

  // --- Picking, in the view's coordinates ---

  // The first selected item when it is hit, so that a selection wins an
  // overlap; otherwise the first item hit in list order; else null.
  Constraint* FindAt(Point2f point, bool inWarpedView, float tolerance);
  // The first selected line, when it is valid and the point is within the
  // tolerance of one of its two rotation grips; outCursor is then the
  // rotation cursor for the pointer's place. zoom is window pixels per view
  // unit.
  LineConstraint* PickRotationHandle(Point2f point, float tolerance, float zoom,
                                     std::int32_t& outCursor);

  // --- The solver's side ---

  // Traces every item into the solver's store, each record replacing any
  // of its id: lines traced, polygons rebuilt. Each warp build calls it
  // once the mesh exists, then UpdateDisplays(solver, -1).
  void RegisterAll(Solver& solver) override;
  // Recomputes the on-screen form of the item with that id, or of all with
  // -1.
  void UpdateDisplays(Solver& solver, std::int32_t id) override;

  // --- What the panes show ---

  std::int32_t HoverId() const { return hoverId_; }
  void SetHoverId(std::int32_t id) { hoverId_ = id; }
  // Degrees, or below 0 when no line is being rotated.
  float LiveRotation() const { return liveRotation_; }
  void SetLiveRotation(float degrees) { liveRotation_ = degrees; }
  // The orientation of the edge that the polygon tool is drawing.
  std::int32_t DrawingOrientation() const { return drawingOrientation_; }
  void SetDrawingOrientation(std::int32_t orientation) { drawingOrientation_ = orientation; }
  bool ShowHandles() const { return showHandles_; }
  void SetShowHandles(bool show) { showHandles_ = show; }
  // The focal handle being dragged, (-1, -1) when none; moved: it is to be
  // mapped by the solver before it is shown.
  Point2f LiveFocalHandle() const { return liveFocalHandle_; }
  bool LiveFocalMoved() const { return liveFocalMoved_; }
  void SetLiveFocalHandle(Point2f handle, bool moved) {
    liveFocalHandle_ = handle;
    liveFocalMoved_ = moved;
  }

 private:
  using ItemList = std::vector<std::unique_ptr<Constraint>>;
  ItemList::iterator FindItem(std::int32_t id);

  SolverContext& context_;
  std::unique_ptr<Solver> solver_;
  ItemList items_;
  std::vector<std::int32_t> selected_;
  std::int32_t hoverId_ = -1;
  std::int32_t nextId_ = 0;
  Point2f liveFocalHandle_{-1.0f, -1.0f};
  bool liveFocalMoved_ = false;
  float liveRotation_ = -1.0f;
  std::int32_t drawingOrientation_ = 1;
  bool showHandles_ = true;
};

}  // namespace Project
