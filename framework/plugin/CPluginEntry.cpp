#include "framework/plugin/CPluginEntry.h"

#include "framework/plugin/CFrameworkServices.h"
#include "framework/plugin/CQuillmarkFilter.h"
#include "framework/process/CReporter.h"

namespace Tarsa {

namespace {

// A new object, with the framework started for it.
CQuillmarkFilter* MakeObject(const CPluginEntry::Factory& make) {
  CFrameworkServices::Start();
  return make();
}

CQuillmarkFilter* Ensure(HostFilterRecord* record, const CPluginEntry::Factory& make) {
  if (CQuillmarkFilter* filter = CQuillmarkFilter::Current()) return filter;
  CQuillmarkFilter* filter = MakeObject(make);
  filter->ReadDisplayProperties(record);
  return filter;
}

}  // namespace

void CPluginEntry::TearDown() {
  delete CQuillmarkFilter::Current();
  CFrameworkServices::Shutdown();
}

void CPluginEntry::Dispatch(std::int16_t selector, HostFilterRecord* record,
                            std::intptr_t* dataSlot, std::int16_t* result, const Factory& make) {
  std::int16_t ignored = 0;
  if (result == nullptr) result = &ignored;
  *result = 0;
  try {
    switch (selector) {
      case kSelectorAbout: {
        // The about box gets an object of its own, which never outlives it.
        if (CQuillmarkFilter::Current() != nullptr) TearDown();
        *result = MakeObject(make)->HandleAbout(record, dataSlot);
        TearDown();
        break;
      }
      case kSelectorParameters:
        *result = Ensure(record, make)->HandleParameters(record, dataSlot);
        if (*result != 0) TearDown();
        break;
      case kSelectorPrepare:
        *result = Ensure(record, make)->HandlePrepare(record, dataSlot);
        if (*result != 0) TearDown();
        break;
      case kSelectorStart:
        *result = Ensure(record, make)->HandleStart(record, dataSlot);
        if (*result != 0) TearDown();
        break;
      case kSelectorContinue:
        if (CQuillmarkFilter* filter = CQuillmarkFilter::Current()) {
          *result = filter->HandleContinue(record, dataSlot);
        }
        break;
      case kSelectorFinish:
        if (CQuillmarkFilter* filter = CQuillmarkFilter::Current()) {
          *result = filter->HandleFinish(record, dataSlot);
        }
        TearDown();
        break;
      default:
        break;
    }
  } catch (...) {
    // Shown while the object can still ask the host for its texts.
    CReporter::ReportCurrent();
    TearDown();
    *result = 1;
  }
}

}  // namespace Tarsa
