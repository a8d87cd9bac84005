#pragma once

#include "framework/strings/CString.h"

namespace Tarsa {

// Where keyed strings go when the string table does not know them: the
// process object, which a plug-in answers through its host. There is at most
// one current source, the process; it registers itself on construction and
// leaves on destruction, so "a process exists" and "a source exists" agree.
class CStringSource {
 public:
  CStringSource();
  virtual ~CStringSource();
  CStringSource(const CStringSource&) = delete;
  CStringSource& operator=(const CStringSource&) = delete;

  static CStringSource* Current();

  // PrefersDefaultStrings(), asked once and then remembered.
  bool UsesDefaultStrings();

  // True when keyed strings should take their default text without asking.
  virtual bool PrefersDefaultStrings() { return false; }
  // The text for a keyed string, when this source has one.
  virtual bool LookupString(const CString& keyed, CString& text) {
    (void)keyed;
    (void)text;
    return false;
  }

 private:
  int prefersDefaults_ = -1;  // -1 not asked yet
};

}  // namespace Tarsa
