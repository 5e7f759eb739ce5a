#include "error_catalogue.h"

#include <fmt/format.h>

#include <algorithm>
#include <iterator>

#include "hb_client/error.h"

namespace hbctl {
namespace {

struct ErrorText {
  int number;
  const char* name;
  const char* meaning;
};

constexpr ErrorText kErrors[] = {
    {HB_ENOMORE, "HB_ENOMORE", "an iteration ran past its last entry"},
    {HB_ENOTREADY, "HB_ENOTREADY", "the time given passed without a packet from the daemon"},
    {HB_EWRONGSTATE, "HB_EWRONGSTATE", "the request does not fit the state, or the event does not carry the datum"},
    {HB_EINVAL, "HB_EINVAL", "an argument is out of range or a null pointer"},
    {HB_EGROUPTYPE, "HB_EGROUPTYPE", "a group was asked for what only the other kind of group has"},
    {HB_ENOROUTE, "HB_ENOROUTE", "no route is known for the node"},
    {HB_ENOADAPTER, "HB_ENOADAPTER", "the adapter is not configured, or not in the group"},
    {HB_ENONETWORK, "HB_ENONETWORK", "the network is not configured"},
    {HB_ENONODE, "HB_ENONODE", "the node has no configured adapter"},
    {HB_EBADREPLY, "HB_EBADREPLY", "the daemon's packet is of another kind, not whole, or has an unknown status"},
    {HB_ESUBSCRIBE, "HB_ESUBSCRIBE", "the subscription group's type does not allow the operation"},
    {HB_ECOMM, "HB_ECOMM", "waiting or receiving failed, or there is no connection"},
    {HB_ESOCKET, "HB_ESOCKET", "the socket could not be created"},
    {HB_ESOCKOPT, "HB_ESOCKOPT", "a socket buffer size could not be set"},
    {HB_ECONNECT, "HB_ECONNECT", "the daemon's socket could not be connected to"},
    {HB_EDAEMONGONE, "HB_EDAEMONGONE", "the daemon closed the connection"},
    {HB_ENOMEM, "HB_ENOMEM", "memory ran out"},
    {HB_ESENDFAULT, "HB_ESENDFAULT", "sending failed: bad address"},
    {HB_ESENDWOULDBLOCK, "HB_ESENDWOULDBLOCK", "sending failed: it would block"},
    {HB_ESENDNOTRESTARTED, "HB_ESENDNOTRESTARTED", "sending failed: interrupted"},
    {HB_ESENDIO, "HB_ESENDIO", "sending failed: input/output error"},
    {HB_ESEND, "HB_ESEND", "sending failed otherwise"},
    {HB_ERECVFAULT, "HB_ERECVFAULT", "receiving the configuration failed: bad address"},
    {HB_ERECVWOULDBLOCK, "HB_ERECVWOULDBLOCK", "receiving the configuration failed: it would block"},
    {HB_ERECVNOTRESTARTED, "HB_ERECVNOTRESTARTED", "receiving the configuration failed: interrupted"},
    {HB_ERECVIO, "HB_ERECVIO", "receiving the configuration failed: input/output error"},
    {HB_ERECV, "HB_ERECV", "receiving the configuration failed otherwise"},
    {HB_EKEY_CONFIG, "HB_EKEY_CONFIG", "no key for the configuration segment"},
    {HB_EKEY_ROUTE, "HB_EKEY_ROUTE", "no key for the route segment"},
    {HB_EKEY_SEM, "HB_EKEY_SEM", "no key for the semaphore set"},
    {HB_ESHMGET_ACCESS, "HB_ESHMGET_ACCESS", "getting a segment: no permission"},
    {HB_ESHMGET_INVAL, "HB_ESHMGET_INVAL", "getting a segment: its size does not fit"},
    {HB_ESHMGET_NOENT, "HB_ESHMGET_NOENT", "getting a segment: the daemon has not published it"},
    {HB_ESHMGET_NOMEM, "HB_ESHMGET_NOMEM", "getting a segment: no memory"},
    {HB_ESHMGET_LIMIT, "HB_ESHMGET_LIMIT", "getting a segment: a limit of the system"},
    {HB_ESHMGET, "HB_ESHMGET", "getting a segment failed otherwise"},
    {HB_ESHMAT_ACCESS, "HB_ESHMAT_ACCESS", "attaching a segment: no permission"},
    {HB_ESHMAT_INVAL, "HB_ESHMAT_INVAL", "attaching a segment: invalid"},
    {HB_ESHMAT_NOENT, "HB_ESHMAT_NOENT", "attaching a segment: it is gone"},
    {HB_ESHMAT_NOMEM, "HB_ESHMAT_NOMEM", "attaching a segment: no memory"},
    {HB_ESHMAT, "HB_ESHMAT", "attaching a segment failed otherwise"},
    {HB_ESEMGET_ACCESS, "HB_ESEMGET_ACCESS", "getting the semaphores: no permission"},
    {HB_ESEMGET_INVAL, "HB_ESEMGET_INVAL", "getting the semaphores: their number does not fit"},
    {HB_ESEMGET_NOENT, "HB_ESEMGET_NOENT", "getting the semaphores: the daemon has not made them"},
    {HB_ESEMGET_NOMEM, "HB_ESEMGET_NOMEM", "getting the semaphores: no memory"},
    {HB_ESEMGET_NOSPC, "HB_ESEMGET_NOSPC", "getting the semaphores: a limit of the system"},
    {HB_ESEMGET, "HB_ESEMGET", "getting the semaphores failed otherwise"},
    {HB_ENOIPROUTE, "HB_ENOIPROUTE", "the node's route is not an IP route"},
    {HB_EBADSERVICEADDR, "HB_EBADSERVICEADDR", "the daemon refused the service address"},
    {HB_ESAMEADDR, "HB_ESAMEADDR", "the adapter has that address already"},
    {HB_ENOTSUPPORTED, "HB_ENOTSUPPORTED", "the daemon does not support the request"},
    {HB_EMSGTOOBIG, "HB_EMSGTOOBIG", "a message for routing is too large"},
    {HB_EKEY_SECURITY, "HB_EKEY_SECURITY", "no key for the security segment"},
    {HB_EGRACEFAILED, "HB_EGRACEFAILED", "the grace period could not be granted"},
    {HB_EGRACETIMEOUT, "HB_EGRACETIMEOUT", "the grace period timed out"},
    {HB_EMONITOR_READ, "HB_EMONITOR_READ", "VEX mode: the new-group monitor could not be read"},
    {HB_EEVENTPIPE, "HB_EEVENTPIPE", "VEX mode: a pipe could not be written"},
    {HB_EVEXTBL_BUILD, "HB_EVEXTBL_BUILD", "VEX mode: the configuration table could not be built"},
    {HB_EVEXTBL_ENTRY, "HB_EVEXTBL_ENTRY", "VEX mode: an entry of the configuration table could not be made"},
    {HB_EVEXTBL_INTF, "HB_EVEXTBL_INTF", "VEX mode: interface information could not be obtained"},
    {HB_EVEXGROUP, "HB_EVEXGROUP", "VEX mode: the new-group monitor reported a group of unknown kind"},
    {HB_EVEXTBL_COPY, "HB_EVEXTBL_COPY", "VEX mode: the configuration table could not be copied"},
    {HB_EADAPTERSTATE, "HB_EADAPTERSTATE", "an adapter state outside the known range"},
    {HB_EPIPEMSG, "HB_EPIPEMSG", "VEX mode: an unexpected byte in the event pipe"},
    {HB_ENODEMISSING, "HB_ENODEMISSING", "migration: a node of the old table is missing from the new one"},
    {HB_EMIGRATE_PREP, "HB_EMIGRATE_PREP", "migration: the preparation failed"},
    {HB_EMIGRATE_TBL, "HB_EMIGRATE_TBL", "migration: the table could not be built"},
    {HB_EDISPATCH, "HB_EDISPATCH", "VEX mode: no handler owns the descriptor"},
    {HB_ENODESCRIPTORS, "HB_ENODESCRIPTORS", "VEX mode: a handler left while none was registered"},
    {HB_ESITESUB, "HB_ESITESUB", "the site is not configured"},
    {HB_ESITECONFIG_READ, "HB_ESITECONFIG_READ", "VEX mode: the site monitor could not be read"},
    {HB_ESITECONFIG_DATA, "HB_ESITECONFIG_DATA", "VEX mode: the site event could not be processed"},
    {HB_ESITECONFIG_EVENT, "HB_ESITECONFIG_EVENT", "VEX mode: the site event could not be queued"},
    {HB_ENOGROUPHANDLER, "HB_ENOGROUPHANDLER", "VEX mode: there is no new-group handler"},
    {HB_ENOPIPEHANDLER, "HB_ENOPIPEHANDLER", "VEX mode: there is no event-pipe handler"},
    {HB_EMIGRATE_EVENTS, "HB_EMIGRATE_EVENTS", "migration: table and events could not be built"},
};

const ErrorText* find_error(int number) {
  const auto* found = std::find_if(std::begin(kErrors), std::end(kErrors),
                                   [number](const ErrorText& error) { return error.number == number; });
  return found == std::end(kErrors) ? nullptr : found;
}

}  // namespace

std::string error_name(int number) {
  const ErrorText* error = find_error(number);
  return error != nullptr ? error->name : "unknown error";
}

std::string describe_error(int number) {
  const ErrorText* error = find_error(number);
  if (error == nullptr) return fmt::format("unknown error ({})", number);
  return fmt::format("{} ({}), {}", error->name, number, error->meaning);
}

}  // namespace hbctl
