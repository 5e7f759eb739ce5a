#include "request.h"

#include <fmt/format.h>

#include <algorithm>
#include <iterator>

#include "confirmation.h"
#include "daemon_link.h"
#include "hb_client/error.h"

namespace hbctl {
namespace {

// How a command ends with an error, and what to do then.
struct Failure {
  int number;
  ExitStatus status;
  const char* advice;
};

constexpr Failure kFailures[] = {
    {HB_ENOTREADY, ExitStatus::Unclear,
     "the daemon did not answer for 55 seconds: it may be done or not, so look before you try again"},
    {HB_EBADREPLY, ExitStatus::Unclear,
     "an event came instead of the answer and is lost, or the answer has a status without an error of its own, which "
     "the daemon's log tells: it may be done or not, so look before you try again"},
    {HB_EWRONGSTATE, ExitStatus::Refused, "the adapter is enabled: first run hbctl adapter NUMBER disable"},
    {HB_ENONETWORK, ExitStatus::Refused, "the daemon does not know the adapter's network: see hbctl networks"},
    {HB_EBADSERVICEADDR, ExitStatus::Refused, "take an address that a host can have and that no adapter has"},
    {HB_ESAMEADDR, ExitStatus::Refused, "if it is to be monitored again, run hbctl adapter NUMBER enable"},
    {HB_ENOTSUPPORTED, ExitStatus::Refused, "look at the daemon's log for what it lacks"},
    {HB_EGRACEFAILED, ExitStatus::Refused,
     "the adapter has to be enabled and to have an address, and the time has to be more than 0 seconds"},
    {HB_EGRACETIMEOUT, ExitStatus::Refused, "try again later"},
    {HB_ENOADAPTER, ExitStatus::Failed, "list what is configured with: hbctl adapters"},
    {HB_ENONODE, ExitStatus::Failed, "list what is configured with: hbctl nodes"},
    {HB_ENOROUTE, ExitStatus::Failed, "nodes that cannot be reached have none: see hbctl nodes and hbctl adapters"},
    {HB_ENOIPROUTE, ExitStatus::Failed, "the route that is not an IP route is shown without --ip"},
    {HB_EMSGTOOBIG, ExitStatus::Failed, "text, 4 bytes for each node and 60 more have to be 10000 bytes or fewer"},
    {HB_EDAEMONGONE, ExitStatus::DaemonGone, "it may be stopping: look at its log, then try again"},
};

const Failure& failure_of(int number) {
  static constexpr Failure kOther = {0, ExitStatus::Failed, "look at the daemon's log, then try again"};
  const auto* found = std::find_if(std::begin(kFailures), std::end(kFailures),
                                   [number](const Failure& failure) { return failure.number == number; });
  return found == std::end(kFailures) ? kOther : *found;
}

const char* outcome_word(Outcome outcome) { return outcome == Outcome::Sent ? "sent" : "done"; }

Json request_json(const Request& request) {
  Json json = json_object("request");
  json["request"] = request.words;
  json["outcome"] = outcome_word(request.outcome);
  json.update(request.subject);
  return json;
}

std::string request_text(const Request& request) {
  return fmt::format("{}: {}\n", request.what, outcome_word(request.outcome));
}

}  // namespace

CommandError request_error(const std::string& what, const std::string& if_invalid) {
  const CommandError error = library_error("cannot " + what);
  const Failure& failure = failure_of(error.number());
  const std::string advice = error.number() == HB_EINVAL ? if_invalid : failure.advice;
  return {failure.status, fmt::format("{}\n{}", error.what(), advice), error.number()};
}

void write_outcome(const Context& context, const Request& request) {
  context.output.write(context.options.json ? json_text(context, request_json(request)) : request_text(request));
}

void carry_out(const Context& context, const Request& request, const std::function<Hb_Rc()>& call) {
  // Before the start: whatever the daemon sent while somebody thinks would come before the answer.
  if (!request.danger.empty()) confirm(request.what, request.danger, context.options.yes);
  const DaemonLink link(context.socket_path);
  if (call() != Hb_Success) throw request_error(request.what, request.if_invalid);
  write_outcome(context, request);
}

}  // namespace hbctl
