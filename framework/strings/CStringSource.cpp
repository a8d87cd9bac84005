#include "framework/strings/CStringSource.h"

namespace Tarsa {

namespace {
CStringSource* gCurrentSource = nullptr;
}  // namespace

CStringSource::CStringSource() { gCurrentSource = this; }

CStringSource::~CStringSource() {
  if (gCurrentSource == this) gCurrentSource = nullptr;
}

CStringSource* CStringSource::Current() { return gCurrentSource; }

bool CStringSource::UsesDefaultStrings() {
  if (prefersDefaults_ < 0) prefersDefaults_ = PrefersDefaultStrings() ? 1 : 0;
  return prefersDefaults_ == 1;
}

}  // namespace Tarsa
