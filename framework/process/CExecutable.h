#pragma once

#include <cstdint>
#include <vector>

#include "framework/process/CMessenger.h"
#include "framework/process/CObjID.h"

namespace Tarsa {

// A messenger that owns a run: it starts and stops with its parent and keeps
// its child executables in order of creation. A child joins its parent's
// list in its constructor and leaves it in its destructor, and its parent is
// its supervisor. Children live where their makers put them (members, the
// stack); only those marked to be deleted when stopped belong to the parent,
// which deletes them after stopping them and when it dies itself. Other
// children still alive when the parent dies are detached from it.
class CExecutable : public virtual CMessenger {
 public:
  static constexpr std::uint32_t kExec_StartWithParent = 1u << 0;
  static constexpr std::uint32_t kExec_StopWithParent = 1u << 1;
  static constexpr std::uint32_t kExec_Running = 1u << 2;
  static constexpr std::uint32_t kExec_DeleteWhenStopped = 1u << 3;

  CExecutable(CExecutable* parent, CObjID id, bool shown = true, bool enabled = true,
              bool startWithParent = true, bool stopWithParent = true);
  ~CExecutable() override;

  CExecutable* Parent() const { return parent_; }
  const std::vector<CExecutable*>& Children() const { return children_; }
  std::uint32_t Flags() const { return flags_; }
  bool IsRunning() const { return (flags_ & kExec_Running) != 0; }
  // Hands this executable, made with new, to its parent (see above).
  void SetDeleteWhenStopped(bool deleteWhenStopped);

  // Marks this running, then starts the children set to start with their
  // parent, in order of creation.
  virtual void Start();
  // Stops the children set to stop with their parent, last made first,
  // deleting those that belong to the parent, then marks this stopped.
  virtual void Stop();

  // The children in order, each with FindById.
  CMessenger* FindDeep(CObjID id) override;

 protected:
  void SetRunning(bool running);

 private:
  bool HasChild(const CExecutable* child) const;

  CExecutable* parent_;
  std::vector<CExecutable*> children_;
  std::uint32_t flags_ = 0;
};

}  // namespace Tarsa
