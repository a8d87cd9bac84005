#include "framework/process/CIdler.h"

#include "framework/process/CReporter.h"

namespace Tarsa {

namespace {

// Never destroyed, so that an idler that outlives static destruction can
// still leave it.
CLinkList<CIdler>& Idlers() {
  static auto* idlers = new CLinkList<CIdler>;
  return *idlers;
}

}  // namespace

CIdler::CIdler(std::int16_t priority) : priority_(priority) {}

CIdler::~CIdler() { Stop(); }

CIdler* CIdler::FirstBelow(std::int16_t priority) {
  CIdler* at = Idlers().Front();
  while (at != nullptr && at->priority_ >= priority) at = at->Next();
  return at;
}

void CIdler::Start() {
  if (IsRunning()) return;
  Idlers().InsertBefore(this, FirstBelow(priority_));
  state_ |= kState_Running;
}

void CIdler::Stop() {
  Idlers().Unlink(this);
  state_ &= ~kState_Running;
}

bool CIdler::AnyRunning() { return !Idlers().IsEmpty(); }

bool CIdler::IdleOnce() {
  CIdler* idler = Idlers().Front();
  if (idler == nullptr) return false;
  Idlers().InsertBefore(idler, FirstBelow(idler->priority_));
  bool goOn = true;
  try {
    goOn = idler->Idle();
  } catch (...) {
    CReporter::ReportCurrent();
  }
  if (!goOn) idler->Stop();
  return true;
}

}  // namespace Tarsa
