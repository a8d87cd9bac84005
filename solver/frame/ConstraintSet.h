#pragma once

#include <cstdint>

namespace Project {

class Solver;

// The user's constraints as the Solver sees them: it re-registers them on a
// new warp and asks them to recompute their on-screen form. The constraint
// list implements it; the Solver borrows it.
class ConstraintSet {
 public:
  virtual ~ConstraintSet() = default;
  virtual bool IsEmpty() const = 0;
  // Traces every line into the solver's store and rebuilds every polygon.
  virtual void RegisterAll(Solver& solver) = 0;
  // Recomputes the on-screen form of the constraint with this id, or of all
  // when id is -1.
  virtual void UpdateDisplays(Solver& solver, std::int32_t id) = 0;
};

}  // namespace Project
