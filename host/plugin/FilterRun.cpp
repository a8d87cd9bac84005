#include "host/plugin/FilterRun.h"

#include <vector>

#include "host/io/HostError.h"
#include "host/plugin/BlockExchange.h"
#include "host/plugin/HostCodes.h"
#include "host/plugin/HostRecord.h"

namespace Host {

namespace {

using Outcome = FilterRun::Outcome;

Outcome Failed(std::string why) {
  Outcome outcome;
  outcome.status = Outcome::Status::kFailed;
  outcome.failure = std::move(why);
  return outcome;
}

Outcome Cancelled() {
  Outcome outcome;
  outcome.status = Outcome::Status::kCancelled;
  return outcome;
}

}  // namespace

const char* FilterRun::SelectorName(int16_t selector) {
  switch (selector) {
    case Tarsa::kSelectorAbout:
      return "about";
    case Tarsa::kSelectorParameters:
      return "parameters";
    case Tarsa::kSelectorPrepare:
      return "prepare";
    case Tarsa::kSelectorStart:
      return "start";
    case Tarsa::kSelectorContinue:
      return "continue";
    case Tarsa::kSelectorFinish:
      return "finish";
    default:
      return "an unknown selector";
  }
}

Outcome FilterRun::Run(Tarsa::HostEntryProc entry, HostDocument& document, const Options& options,
                       RunObserver& observer) {
  const bool interactive = options.kind == Kind::kInteractive;
  HostProperties::Settings properties = options.host;
  properties.replay = options.action.has_value();
  HostRecord record(document,
                    {std::move(properties), options.memoryOffer, int16_t(interactive ? 2 : 1)},
                    observer);
  if (options.action) record.SetDescriptor(*options.action);

  // The filter's own word, kept from selector to selector of the run.
  intptr_t dataSlot = 0;
  auto call = [&](int16_t selector) {
    int16_t result = 0;
    {
      HostRecord::Scope scope(record);
      entry(selector, record.Record(), &dataSlot, &result);
    }
    // A block the filter took and did not give back by a last advance is
    // taken when the selector returns.
    record.Blocks().Commit();
    return result;
  };
  auto refused = [&](int16_t selector, int16_t result) {
    if (result == HostCodes::kUserCanceled || observer.AbortRequested()) return Cancelled();
    return Failed(std::string("the module stopped at ") + SelectorName(selector) + " (code " +
                  std::to_string(result) + ")");
  };

  std::vector<int16_t> opening = {Tarsa::kSelectorPrepare, Tarsa::kSelectorStart};
  if (interactive) opening.insert(opening.begin(), Tarsa::kSelectorParameters);
  for (int16_t selector : opening) {
    const int16_t result = call(selector);
    // An interactive start answers 1 when the user closed the workspace
    // with Cancel: nothing was taken, and that is no failure.
    if (result == 1 && interactive && selector == Tarsa::kSelectorStart &&
        !observer.AbortRequested()) {
      Outcome closed;
      closed.status = Outcome::Status::kClosed;
      return closed;
    }
    if (result != 0) return refused(selector, result);
  }

  // The filter asks for more by leaving a request in the record; it is
  // handed the block before each continue.
  std::optional<Outcome> failure;
  while (record.Blocks().HasRequest() && !observer.AbortRequested()) {
    const int16_t code = record.Blocks().Advance();
    if (code != 0) {
      failure = Failed("the module asked for a block the document does not have (code " +
                       std::to_string(code) + ")");
      break;
    }
    const int16_t result = call(Tarsa::kSelectorContinue);
    if (result != 0) {
      failure = refused(Tarsa::kSelectorContinue, result);
      break;
    }
  }
  const int16_t finished = call(Tarsa::kSelectorFinish);
  if (failure) return *failure;
  if (observer.AbortRequested()) return Cancelled();
  if (finished != 0) return refused(Tarsa::kSelectorFinish, finished);

  Outcome outcome;
  try {
    outcome.descriptor = record.LeftDescriptor();
  } catch (const HostError& error) {
    return Failed(error.Problem());
  }
  return outcome;
}

}  // namespace Host
