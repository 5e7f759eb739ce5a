// The examples at the end of each help text.
#pragma once

namespace hbctl::help {

constexpr const char* kMain =
    "Examples:\n"
    "  hbctl status                       is the daemon there, and how is the cluster\n"
    "  hbctl adapters --network net0      the adapters of one network\n"
    "  hbctl watch                        follow every node and adapter until Ctrl-C\n"
    "  hbctl --socket /tmp/hb watch --json | jq .event\n"
    "  hbctl adapter 0 state              what the daemon's monitoring says of an adapter\n"
    "\n"
    "'hbctl COMMAND --help' tells the options of a command.\n"
    "\n"
    "Exit status: 0 done, 1 failed, 2 wrong command line, 3 no daemon answers, 4 the daemon went away,\n"
    "5 dangerous and not agreed to, 6 refused by the daemon, 7 not known whether it was done.\n"
    "\n"
    "Environment: HB_SERVER_SOCKET, HA_DOMAIN_NAME and HA_SYSPAR_NAME choose the socket, NO_COLOR switches colour off.";

constexpr const char* kCommon =
    "\n\n"
    "--socket PATH and --color WHEN belong to every command, see 'hbctl --help'.";

constexpr const char* kStatus =
    "Examples:\n"
    "  hbctl status\n"
    "  hbctl status --json --wait 0       do not ask who is up";

constexpr const char* kNodes =
    "Examples:\n"
    "  hbctl nodes\n"
    "  hbctl nodes --json --wait 5";

constexpr const char* kAdapters =
    "Examples:\n"
    "  hbctl adapters\n"
    "  hbctl adapters --node 0 1\n"
    "  hbctl adapters --network net0 --json";

constexpr const char* kNetworks =
    "Examples:\n"
    "  hbctl networks\n"
    "  hbctl networks --json";

constexpr const char* kSites =
    "Examples:\n"
    "  hbctl sites\n"
    "  hbctl sites --json";

constexpr const char* kWatch =
    "Examples:\n"
    "  hbctl watch                            every node and adapter, until Ctrl-C\n"
    "  hbctl watch --node 1 2 --events death  when one of two nodes dies\n"
    "  hbctl watch --network net0 net1        the adapters of two networks\n"
    "  hbctl watch --json --duration 10       one object a line for ten seconds\n"
    "  hbctl watch --events death --count 1   wait for the next death\n"
    "  hbctl watch --discard-stale            without events that waited too long to be read";

constexpr const char* kAdapter =
    "Examples:\n"
    "  hbctl adapter 0 state                what the daemon's monitoring says of it\n"
    "  hbctl adapter 0 disable --yes        have it monitored no longer, and\n"
    "  hbctl adapter 0 configure 10.0.0.9   give it another address, and have it monitored\n"
    "  hbctl adapter 0 swap 10.0.1.1        exchange its address with that of another one of this node\n"
    "  hbctl adapter 0 grace 30             no death within 30 seconds\n"
    "  hbctl adapter 3 may-be-down          let the daemon look at an adapter of any node\n"
    "\n"
    "All but may-be-down and is-down are for adapters of this node. disable, ifdown, unconfigure, swap and is-down "
    "are\n"
    "dangerous: they are asked about on a terminal, and without one need --yes. The daemon answers configure,\n"
    "unconfigure, swap, grace and state; an event that comes before the answer is lost, and the status is then 7.";

constexpr const char* kNode =
    "Examples:\n"
    "  hbctl node 2 may-be-down     let the daemon look at it\n"
    "  hbctl node 2 is-down --yes   have the daemon take it for dead\n"
    "\n"
    "is-down is dangerous: it is asked about on a terminal, and without one needs --yes.";

constexpr const char* kRoute =
    "Examples:\n"
    "  hbctl route 2                 the route that the daemon publishes\n"
    "  hbctl route 2 --ip            the same, if it is an IP route\n"
    "  hbctl route 2 --from-daemon   the route that the daemon answers with; an event that comes first is lost";

constexpr const char* kSecurity =
    "Examples:\n"
    "  hbctl security\n"
    "  hbctl security --reveal --json   with the bytes of the keys: mind who reads along";

constexpr const char* kSend =
    "Examples:\n"
    "  hbctl send hello --node 1 2 --port 7\n"
    "  hbctl send --node 1,2 --port 7 - < message\n"
    "\n"
    "A word that follows the numbers of --node is taken for one: TEXT stands before --node or after another option.";

constexpr const char* kHeartbeat =
    "Examples:\n"
    "  hbctl heartbeat\n"
    "  hbctl heartbeat --settings             show what the daemon expects, too\n"
    "  hbctl heartbeat --every 2 --count 10   ten of them, two seconds apart\n"
    "  hbctl heartbeat --every 0.5            until Ctrl-C\n"
    "\n"
    "With --json each object is on a line of its own.";

constexpr const char* kSimulateDeath =
    "Examples:\n"
    "  hbctl simulate-death 5         this node plays dead for five seconds\n"
    "  hbctl simulate-death 0 --yes   for the time that the configuration says\n"
    "\n"
    "It is dangerous: it is asked about on a terminal, and without one needs --yes.";

constexpr const char* kStale =
    "Examples:\n"
    "  hbctl stale on\n"
    "  hbctl watch --discard-stale   where it is of use\n"
    "\n"
    "This concerns the connection of this command alone, which ends with it: use it to see whether the daemon takes "
    "the\n"
    "request, and watch --discard-stale to watch without stale events.";

constexpr const char* kMonitors =
    "Examples:\n"
    "  hbctl monitors on en0    failures and repairs of en0 are told no longer, only what is asked for happens\n"
    "  hbctl monitors off en0   back to normal\n"
    "  hbctl monitors off       all interfaces";

}  // namespace hbctl::help
