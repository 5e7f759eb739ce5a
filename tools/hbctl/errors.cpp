#include "errors.h"

#include <fmt/format.h>

#include "error_catalogue.h"
#include "hb_client.h"

namespace hbctl {
namespace {

ExitStatus exit_status_of(int number) {
  switch (number) {
    case HB_ECONNECT:
      return ExitStatus::NotReachable;
    case HB_EDAEMONGONE:
      return ExitStatus::DaemonGone;
    default:
      return ExitStatus::Failed;
  }
}

bool is_about_published_memory(int number) {
  return (number >= HB_EKEY_CONFIG && number <= HB_ESEMGET) || number == HB_EKEY_SECURITY;
}

std::string advice_for_start(int number, const std::string& socket_path) {
  if (number == HB_ECONNECT)
    return fmt::format("start a daemon with: hbd --socket {}\nor name another socket with --socket PATH", socket_path);
  if (number == HB_EDAEMONGONE) return "it may be stopping: look at its log, then try again";
  if (is_about_published_memory(number)) {
    return "the daemon answers, but what it publishes in shared memory cannot be used: see that it runs on this "
           "machine, as a user whose segments you may read (ipcs -m), and start it again if they are missing";
  }
  return "look at the daemon's log, then try again";
}

}  // namespace

CommandError library_error(const std::string& what_failed) {
  const int number = hb_get_errno();
  return {exit_status_of(number), fmt::format("{}: {}", what_failed, describe_error(number)), number};
}

CommandError start_error(const std::string& socket_path) {
  const int number = hb_get_errno();
  const char* failed = number == HB_ECONNECT ? "no daemon answers on" : "cannot start with the daemon on";
  return {
      exit_status_of(number),
      fmt::format("{} {}: {}\n{}", failed, socket_path, describe_error(number), advice_for_start(number, socket_path)),
      number};
}

}  // namespace hbctl
