// How a command ends when it cannot do what it was asked.
#pragma once

#include <stdexcept>
#include <string>

namespace hbctl {

enum class ExitStatus : int {
  Ok = 0,
  Failed = 1,        // the library or the system refused, or what was asked for does not exist
  Usage = 2,         // the command line is wrong
  NotReachable = 3,  // no daemon answers on the socket
  DaemonGone = 4,    // the daemon closed the connection
  NotConfirmed = 5,  // it is dangerous and nobody agreed to it; nothing was sent
  Refused = 6,       // the daemon answered that it will not do it
  Unclear = 7,       // no answer came, or none that tells whether it was done
};

// Carries what to tell the person, the exit status and, when the library failed, its error number.
class CommandError : public std::runtime_error {
 public:
  CommandError(ExitStatus status, const std::string& message, int number = 0)
      : std::runtime_error(message), status_(status), number_(number) {}
  ExitStatus status() const { return status_; }
  int number() const { return number_; }

 private:
  ExitStatus status_;
  int number_;
};

// A failure that standard output has told about already, in the command's own shape.
class ReportedError : public CommandError {
 public:
  explicit ReportedError(const CommandError& error) : CommandError(error) {}
};

// Standard output has no reader any more: the command ends, quietly and well.
class OutputClosed : public std::exception {};

// The error for a failure that the library has just reported: its name, its number, its meaning.
CommandError library_error(const std::string& what_failed);

// The error for a start that failed, with what to do about it.
CommandError start_error(const std::string& socket_path);

}  // namespace hbctl
