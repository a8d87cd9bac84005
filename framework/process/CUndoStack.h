#pragma once

namespace Tarsa {

// What the process's Edit commands need of an undo stack. The task stack
// implements it; the process asks it before each undo or redo.
class CUndoStack {
 public:
  virtual ~CUndoStack() = default;
  virtual bool CanUndo() const = 0;
  virtual bool CanRedo() const = 0;
  virtual void Undo() = 0;
  virtual void Redo() = 0;
  virtual void UndoRedo() = 0;
};

}  // namespace Tarsa
