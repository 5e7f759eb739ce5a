// The examples at the end of each help text.
#pragma once

namespace hbctl::help {

constexpr const char* kMain =
    "Examples:\n"
    "  hbctl status                       is the daemon there, and how is the cluster\n"
    "  hbctl adapters --network net0      the adapters of one network\n"
    "  hbctl watch                        follow every node and adapter until Ctrl-C\n"
    "  hbctl --socket /tmp/hb watch --json | jq .event\n"
    "\n"
    "'hbctl COMMAND --help' tells the options of a command.\n"
    "\n"
    "Exit status: 0 done, 1 failed, 2 wrong command line, 3 no daemon answers, 4 the daemon went away.\n"
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
    "  hbctl watch --events death --count 1   wait for the next death";

}  // namespace hbctl::help
