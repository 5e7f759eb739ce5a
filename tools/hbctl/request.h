// What the daemon is asked to do, how it is asked, and what is told about it.
#pragma once

#include <functional>
#include <string>

#include "command.h"
#include "hb_client/types.h"

namespace hbctl {

enum class Outcome {
  Sent,  // the daemon does not answer it
  Done,  // the daemon answered that it is done
};

struct Request {
  std::string words;       // those of the command line, as "adapter disable"
  std::string what;        // for people, as "disable adapter 3"
  Outcome outcome;         // of its success
  std::string danger;      // what it does to the cluster; empty when nobody need be asked
  std::string if_invalid;  // what to do when the library finds an argument invalid
  Json subject;            // the members of its JSON object that say to whom and with what
};

// Asks first when it is dangerous, connects, calls, and writes the outcome. Throws CommandError.
void carry_out(const Context& context, const Request& request, const std::function<Hb_Rc()>& call);

// Writes the outcome of a request that has succeeded.
void write_outcome(const Context& context, const Request& request);

// The error for a request or a reading that the library has just reported as failed.
CommandError request_error(const std::string& what, const std::string& if_invalid);

}  // namespace hbctl
