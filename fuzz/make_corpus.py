#!/usr/bin/env python3
"""Writes the first inputs of the fuzz targets: make_corpus.py DIRECTORY

Each target gets a directory of its own. An input is what the target's source says that it takes: most start with the
64 bytes of support/hostile.h, and a packet follows.
"""
import struct
import sys
from pathlib import Path

NO_ADAPTER = 0xFFFFFFFF
CONFIGURATION, ADAPTER_DEATH, ADAPTER_JOIN, ADAPTER_NEW_GROUP = 0, 2, 3, 4
NODE_DEATH, NODE_JOIN, NODE_NEW_GROUP, ROUTE, UPDATE = 5, 6, 7, 8, 9
CONFIG_ADAPTER, GRACE, FAILURE_DATA, DIFFERENT_INSTANCE, STATE, HEARTBEAT = 10, 11, 12, 13, 14, 15
ANSWERS = {CONFIGURATION, 1, ROUTE, CONFIG_ADAPTER, GRACE, STATE}
SUBSCRIBE, UNSUBSCRIBE = 209, 210
NODES, ALL_NODES, ADAPTERS, ALL_ADAPTERS, EMPTY, NETWORK = 0, 1, 2, 3, 4, 5


def hostile(cursor=0, group_type=1, group_events=4, adapter=5, offset=1, subscription_type=EMPTY, count=0, events=7,
            node=1, network=1, site=0, flags=0, address=b"service", members=b""):
    """Arguments and fields that the target passes and overwrites."""
    numbers = struct.pack("<iiiIiiiihhHH", cursor, group_type, group_events, adapter, offset, subscription_type, count,
                          events, node, network, site, flags)
    return numbers + address.ljust(16, b"\0") + members.ljust(8, b"\0")


def packet(kind, message=b"", leader=4, incarnation=7, status=0, name=b"watch", value=0, ffdc=b"ffdc.0001", sequence=9):
    """A packet of the daemon, without the length in front."""
    header = struct.pack("<iIIIIi32si43sxI", kind, leader, 0, 0, incarnation, status, name, value, ffdc, sequence)
    return header + message


def framed(*packets):
    return b"".join(struct.pack("<i", len(each)) + each for each in packets)


def adapters(*entries):
    return struct.pack("<i", len(entries) - 1) + b"".join(struct.pack("<II", *entry) for entry in entries)


def nodes(*members):
    return b"".join(struct.pack("<i", member) for member in members)


def adapter(number, network=0, last_byte=1, kind=b"en0", state=1):
    address = bytes(10) + b"\xff\xff" + bytes([10, 0, 0, last_byte])
    return address + struct.pack("<h36sxxIi", network, kind, number, state)


def configuration(records=(), networks=(b"service", b"standby"), local=1, max_nodes=6, per_node=4, adapter_count=None,
                  network_count=None):
    header = struct.pack("<iiiiiqqqq", local, max_nodes, per_node,
                         len(records) if adapter_count is None else adapter_count,
                         len(networks) if network_count is None else network_count, 30, 0, 20, 0)
    return header + b"".join(records) + b"".join(struct.pack("<70s16s", name, b"ether") for name in networks)


CONFIGURATIONS = {
    "two-nodes": configuration([adapter(0), adapter(1, 1, 2), adapter(12, 0, 3)]),
    "nothing": configuration([], []),
    "no-node": configuration([adapter(0)], max_nodes=0),
    "repeated-address": configuration([adapter(0), adapter(4)]),
    "repeated-number": configuration([adapter(4, 0, 1), adapter(4, 1, 2)]),
    "number-beyond-limit": configuration([adapter(24), adapter(98352), adapter(NO_ADAPTER)]),
    "text-without-end": configuration([adapter(0, kind=b"x" * 36)], [b"n" * 70]),
    "unused-network": configuration([adapter(0, 1)], [b"", b"second"]),
    "most-networks": configuration([adapter(0)], [b"n%d" % i for i in range(48)], per_node=48),
    "more-adapters-than-networks": configuration([adapter(60)], per_node=64),
    "too-many-nodes": configuration(max_nodes=2050, per_node=1),
    "most-nodes": configuration([adapter(2048)], max_nodes=2049, per_node=1),
    "too-many-networks": configuration([], [b"n"] * 49),
    "too-many-numbers": configuration(max_nodes=2049, per_node=49),
    "no-adapter-per-node": configuration(per_node=0),
    "negative-adapters": configuration([adapter(0)], adapter_count=-1),
    "negative-networks": configuration([adapter(0)], network_count=-1),
    "negative-nodes": configuration([adapter(0)], max_nodes=-1),
    "negative-per-node": configuration([adapter(0)], per_node=-4),
    "adapters-beyond-packet": configuration([adapter(0)], adapter_count=98352),
    "networks-beyond-packet": configuration([adapter(0)], network_count=48),
    "half-a-header": configuration()[:26],
}

ADAPTER_LISTS = {
    "two": adapters((4, 1), (5, 0x08000005)),
    "none": adapters(),
    "unknown": adapters((3, 1), (23, 2)),
    "beyond-limit": adapters((24, 1), (98351, 2), (98352, 3), (NO_ADAPTER, 4)),
    "twice": adapters((4, 1), (4, NO_ADAPTER)),
    "beyond-packet": struct.pack("<iII", 5, 4, 1),
    "negative": struct.pack("<iII", -7, 4, 1),
    "largest-count": struct.pack("<iII", 0x7FFFFFFF, 4, 1),
    "nothing": b"",
}

NODE_LISTS = {
    "three": nodes(1, 1, 0, 0, 1, 0),
    "none": nodes(0, 0, 0, 0, 0, 0),
    "neither-true-nor-false": nodes(1, 2, -1, 0x01000000, 1, 1),
    "one-missing": nodes(1, 1, 1, 1, 1),
    "more-than-there-are": nodes(*[1] * 9),
}


def adapter_events():
    return {f"{kind}-{name}": packet(kind, message) for kind in (ADAPTER_DEATH, ADAPTER_JOIN, ADAPTER_NEW_GROUP)
            for name, message in ADAPTER_LISTS.items()}


def node_events():
    events = {f"{kind}-{name}": packet(kind, message) for kind in (NODE_DEATH, NODE_JOIN, NODE_NEW_GROUP)
              for name, message in NODE_LISTS.items()}
    events["heartbeat"] = packet(HEARTBEAT, struct.pack("<iiii", 5, 0, 1, 4711))
    events["short-heartbeat"] = packet(HEARTBEAT, bytes(15))
    return events


def other_events():
    sender = bytes(10) + b"\xff\xff\x0a\0\0\x09" + struct.pack("<I", 3)
    return {"failure-data": packet(FAILURE_DATA), "failure-data-without-end": packet(FAILURE_DATA, ffdc=b"f" * 43),
            "no-failure-data": packet(FAILURE_DATA, ffdc=b""), "sender": packet(DIFFERENT_INSTANCE, sender),
            "short-sender": packet(DIFFERENT_INSTANCE, sender[:19]),
            "name-without-end": packet(DIFFERENT_INSTANCE, sender, name=b"n" * 32),
            "half-a-header": packet(FAILURE_DATA)[:70]}


def updates():
    return {name: packet(UPDATE, message) for name, message in CONFIGURATIONS.items()}


def answers():
    return {f"kind-{kind}": packet(kind, struct.pack("<i", 2), value=kind % 10) for kind in sorted(ANSWERS) + [16, -1]}


def with_hostile(packets, **fields):
    return {name: hostile(**fields) + each for name, each in packets.items()}


def of_kind(packets, *kinds):
    return {name: each for name, each in packets.items() if struct.unpack_from("<i", each)[0] in kinds}


def starts():
    packets = {name: packet(CONFIGURATION, message) for name, message in CONFIGURATIONS.items()}
    return with_hostile({**packets, "another-kind": packet(ROUTE), "empty": b"", "half-a-kind": b"\0\0"}, flags=6)


def sequences():
    def sequence(*packets):
        return hostile(site=3) + b"".join(struct.pack("<H", len(each)) + each for each in packets)

    events = list(adapter_events().values()) + list(node_events().values()) + list(other_events().values())
    return {"events": sequence(*events[:12]), "updates": sequence(*list(updates().values())[:8]),
            "shrinking": sequence(events[0], updates()["no-node"], events[0], updates()["two-nodes"], events[0]),
            "answers": sequence(*answers().values())}


def largest():
    events = {**adapter_events(), **node_events(), **other_events()}
    return {**with_hostile(events, flags=8, adapter=98351, node=2048, cursor=98351),
            "all-nodes": hostile(flags=8) + packet(NODE_NEW_GROUP, nodes(*[1] * 2049)),
            "last-adapters": hostile(cursor=98350) + packet(ADAPTER_JOIN, adapters((98350, 1), (98351, 2)))}


def subscriptions():
    def operations(*numbers, number=4, node=1, network=1, events=7):
        return b"".join(struct.pack("<BBhhH", each, number, node, network, events) for each in numbers)

    inputs = {f"type-{kind}": hostile(subscription_type=kind) + operations(*range(20)) for kind in range(-1, 11)}
    for number in range(20):
        inputs[f"operation-{number}"] = hostile() + operations(0, number, number, 18)
    for events in (0x60, 0x100, 0x3000, 0x8000, 0, 0x7377):
        inputs[f"events-{events:x}"] = hostile() + operations(1, 18, 18, events=events)
    inputs["count-at-its-end"] = hostile(subscription_type=ADAPTERS, count=0x7FFFFFFF) + operations(4, 5, 4)
    inputs["cursor-negative"] = hostile(subscription_type=ADAPTERS, cursor=-1, members=b"\xff" * 8) + operations(13, 12)
    inputs["last-member"] = hostile(subscription_type=ADAPTERS, cursor=98351, members=b"\xff" * 8) + operations(13, 13)
    return inputs


def exchanges():
    def exchange(answer, request=214, length=8, kind=10, flags=0, faults=b""):
        return struct.pack("<iiiBB", request, length, kind, flags, len(faults)) + faults + answer

    inputs = {f"{name}-{flags}": exchange(each, flags=flags) for name, each in answers().items() for flags in range(16)}
    inputs["short"] = exchange(struct.pack("<i", CONFIG_ADAPTER), flags=15)
    inputs["number-in-length"] = exchange(packet(ROUTE), request=206, length=98350, kind=ROUTE)
    inputs["length-too-large"] = exchange(packet(ROUTE), request=206, length=98352, kind=ROUTE)
    inputs["length-negative"] = exchange(packet(ROUTE), length=-4, flags=1)
    for fault in range(16):
        inputs[f"fault-{fault}"] = exchange(packet(STATE), kind=STATE, flags=2, faults=bytes([fault, fault << 4, fault]))
        inputs[f"later-fault-{fault}"] = exchange(packet(STATE), kind=STATE, flags=7, faults=bytes([0, 0, fault, 0x27]))
    return inputs


def streams():
    def session(stream, flags=1, at_start=b"", later=b""):
        return bytes([flags, len(at_start), len(later)]) + at_start + later + stream

    start = framed(packet(CONFIGURATION, CONFIGURATIONS["two-nodes"]))
    events = framed(*adapter_events().values())
    inputs = {"from-the-start": session(start + events, flags=0), "events": session(events),
              "nodes": session(framed(*node_events().values())), "others": session(framed(*other_events().values())),
              "updates": session(framed(*updates().values())), "answers": session(framed(*answers().values()), flags=3)}
    for length in (0, 1, 107, -1, -0x80000000, 0x7FFFFFFF, 0x100000):
        inputs[f"length-{length}"] = session(struct.pack("<i", length) + packet(FAILURE_DATA)[:107])
    inputs["cut-in-length"] = session(events[:2])
    inputs["cut-behind-length"] = session(events[:4])
    inputs["byte-by-byte"] = session(events, later=b"\x07" * 63)
    inputs["large-frame"] = session(struct.pack("<i", 0x100000), flags=0xB5)
    for fault in range(1, 16):
        inputs[f"fault-{fault}"] = session(events, flags=5, later=bytes([fault, 0, fault | 0x20, fault]))
        for step in range(14):
            inputs[f"fault-{fault}-at-{step}"] = session(start, flags=0, at_start=bytes([0] * step + [fault]))
    return inputs


def segments():
    def publication(sequence=1, node_count=4, adapter_count=8, routes=4, script=b""):
        return struct.pack("<IIIHxx", sequence, node_count, adapter_count, routes) + script

    inputs = {"good": publication(), "no-node": publication(node_count=0, routes=0),
              "more-nodes-than-routes": publication(node_count=5),
              "hostile-nodes": publication(node_count=0xFFFFFFFF)}
    for step in range(11):
        for fault in range(1, 8):
            inputs[f"fault-{fault}-at-{step}"] = publication(script=bytes([0] * step + [fault]))
    return inputs


def steering_replies(kind):
    def exchange(answer, adapter=0, address=0, seconds=30, node=1, keep_adapter=0, keep_address=0):
        return struct.pack("<IIihBB", adapter, address, seconds, node, keep_adapter, keep_address) + answer

    state = struct.pack("<i", 2)
    hops = b"".join(adapter(0, last_byte=i)[:16] for i in range(11))
    inputs = {f"status-{status}": exchange(packet(kind, state, value=status)) for status in range(-1, 12)}
    inputs["route"] = exchange(packet(kind, hops, value=32))
    inputs["short-route"] = exchange(packet(kind, hops[:175], value=32))
    inputs["long-length"] = exchange(packet(kind, hops, value=0x10020))
    inputs["no-message"] = exchange(packet(kind))
    inputs["three-bytes"] = exchange(packet(kind, state[:3]))
    inputs["half-a-header"] = exchange(packet(kind, value=1)[:57])
    inputs["kind-alone"] = exchange(packet(kind)[:4])
    inputs["nothing"] = exchange(b"")
    inputs.update({f"kind-{other}": exchange(packet(other, state)) for other in range(16) if other != kind})
    inputs.update({f"adapter-{number}": exchange(packet(kind, state), adapter=number, keep_adapter=1)
                   for number in (0, 3, 4, 5, 7, 8, 17, 24, 9000, NO_ADAPTER)})
    inputs.update({f"address-{i}": exchange(packet(kind, state), address=i) for i in range(8)})
    inputs["unknown-address"] = exchange(packet(kind, state), address=0x0100007F, keep_address=1)
    inputs.update({f"node-{node}": exchange(packet(kind, hops, value=16), node=node)
                   for node in (-1, 0, 3, 5, 6, 2049)})
    return inputs


def routes():
    def publication(sequence=5, stamps=(5, 5, 4, 0), nonip=(0, 1, 0, 0), current=0, script=b"", node=6):
        entries = b"".join(struct.pack("<IHH", stamp, 32, mark) + bytes(range(16)) * 11
                           for stamp, mark in zip(stamps, nonip))
        lock = struct.pack("<BBxx", current, len(script)) + script
        return struct.pack("<I", sequence) + entries + lock + struct.pack("<h", node)

    inputs = {"good": publication(), "nothing-published": publication(sequence=0, stamps=(0, 0, 0, 0)),
              "all-current": publication(current=15),
              "all-off-ip": publication(current=15, nonip=(1, 2, 0x8000, 0xFFFF)), "negative": publication(node=-1),
              "far-beyond": publication(node=0x7FFF)}
    for fault in range(1, 5):
        inputs[f"entering-{fault}"] = publication(current=15, script=bytes([fault]))
        inputs[f"leaving-{fault}"] = publication(current=15, script=bytes([0, 1, fault]))
    return inputs


def published_keys():
    def stored(length, value=b""):
        return struct.pack("<i", length) + value.ljust(256, b"\0")

    def key(value, claimed=None):
        marshalled = struct.pack("<III", 1, 2, len(value)) + value
        return stored(len(marshalled) if claimed is None else claimed, marshalled)

    def segment(previous=stored(0), current=stored(0), cache=()):
        numbers = struct.pack("<iiiii", 1, 2, 0, 1, 1)
        slots = [*cache, *[stored(0)] * (10 - len(cache))]
        cached = b"".join(slots) + struct.pack("<I", len(cache))
        return struct.pack("<I", 3) + numbers + previous + numbers + current + cached

    good = key(bytes(range(32)))
    inputs = {"none": segment(), "current": segment(current=good), "both": segment(good, good),
              "full": segment(good, good, [key(bytes([i] * 24 * i)) for i in range(10)])}
    bad = {"negative": stored(-1), "too-long": stored(257, bytes(256)), "longest": key(bytes(244)),
           "header-alone": key(b"", 11), "length-too-small": key(b"8 bytes.", 19),
           "length-too-large": key(b"8 bytes.", 21)}
    for name, each in bad.items():
        inputs[f"current-{name}"] = segment(good, each, [good])
        inputs[f"previous-{name}"] = segment(each, good, [good])
        inputs.update({f"cache-{i}-{name}": segment(good, good, [*[good] * i, each, good][:10]) for i in (0, 5, 9)})
    return inputs


def hash_operations():
    inputs = {}
    for kind in range(3):
        for size in (-1, 0, 256, 257, 300, 599):
            steps = bytes([0, 1, 1, 5, 2, 9, 5, 1, 3, 1, 6, 0, 0, 0xC1, 5, 0x55, 4, 5, 0xF7, 0, 0, 7, 6, 0])
            inputs[f"kind-{kind}-size-{size}"] = struct.pack("<Bh", kind, size) + steps
    return inputs


def keys():
    def key(length, value, claimed=None):
        marshalled = struct.pack("<III", 1, 2, length) + value
        return struct.pack("<h", len(marshalled) if claimed is None else claimed) + marshalled

    return {"good": key(8, b"8 bytes."), "empty": key(0, b""), "longest": key(244, bytes(244)),
            "too-long": key(245, bytes(245)), "length-too-small": key(7, b"8 bytes."),
            "length-too-large": key(0xFFFFFFFF, b"8 bytes."), "negative": key(8, b"8 bytes.", -1),
            "header-alone": key(0, b"", 11)}


def routed_messages(request):
    def message(nodes, text, size=None, count=None):
        front = struct.pack("<iii40xi", 0x6712, 20, 1, len(nodes) if count is None else count)
        return request(221, front + struct.pack(f"<{len(nodes)}i", *nodes) +
                       struct.pack("<i", len(text) if size is None else size) + text)

    return {"routed": message([1, 2, 3], b"text"), "routed-empty": message([1], b""),
            "routed-nowhere": message([], b"text"), "routed-half": request(221, bytes(7)),
            "routed-size-too-large": message([1], b"text", 5), "routed-size-too-small": message([1], b"text", 3),
            "routed-size-negative": message([1], b"text", -1), "routed-descending": message([2, 1], b"text"),
            "routed-twice": message([1, 1], b"text"), "routed-count-too-large": message([1], b"text", count=2050),
            "routed-count-negative": message([1], b"text", count=-1)}


def requests():
    def request(code, data=b"", length=None):
        header = struct.pack("<iiiihh", 0, 0, code, len(data) if length is None else length, 0, 0)
        return header + bytes(44) + struct.pack("<iii", 4711, 0, 0) + data

    def subscription(kind, name=b"watch", events=7, count=2, members=b"\x0c"):
        record = struct.pack("<iii32shxxi", kind, 0, events, name, 0, count) + members
        return request(SUBSCRIBE, record.ljust(12348, b"\0"))

    inputs = {f"code-{code}-{size}": request(code, bytes(size)) for code in range(200, 229) for size in (0, 1, 2, 4, 8)}
    inputs.update({f"subscription-{kind}": subscription(kind) for kind in range(-1, 11)})
    inputs["name-without-end"] = subscription(NETWORK, name=b"n" * 32)
    inputs["all-members"] = subscription(ADAPTERS, members=b"\xff" * 12294)
    inputs["unsubscribe"] = request(UNSUBSCRIBE, b"watch\0")
    inputs["unsubscribe-without-end"] = request(UNSUBSCRIBE, b"watch")
    inputs["number-in-length"] = request(206, bytes(7))
    inputs.update(routed_messages(request))
    inputs["length-too-large"] = request(206, bytes(7), 98352)
    inputs["length-negative"] = request(206, bytes(7), -1)
    inputs["half-a-header"] = request(201)[:40]
    return inputs


def request_streams():
    def stream(cuts, *packets):
        return bytes([len(cuts)]) + bytes(cuts) + framed(*packets)

    packets = [each for each in requests().values() if 76 <= len(each) < 1000]
    return {"whole": stream([], *packets[:5]), "cut": stream([1, 3, 5, 7, 80, 200], *packets[:5]),
            "empty-packet": stream([4], b"", packets[0]), "no-length": bytes([0]) + b"\x50\0",
            "too-long": bytes([0]) + struct.pack("<i", 98428) + packets[0],
            "negative": bytes([0]) + struct.pack("<i", -1) + packets[0]}


def scenarios():
    directory = Path(__file__).parent.parent / "daemon" / "scenarios"
    inputs = {path.stem: path.read_bytes() for path in sorted(directory.glob("*.toml"))}
    for name, text in list(inputs.items()):
        for i, paragraph in enumerate(text.split(b"\n\n")):
            inputs[f"{name}-{i}"] = paragraph
    return inputs


def vex_days():
    """Steps of targets/vex_notifications.cpp: changes, notifications, calls, taking one or everything. The first byte
    says whether they are traced."""
    down, up, split, merge = 0, 1, 14, 15
    add, delete, address_add, address_delete = 2, 3, 4, 5
    take_one, take_all = bytes([4]), bytes([5])

    def node_status(index, status, reason=0):
        return bytes([0, 0, index, status, reason])

    def interface_status(index, status):
        return bytes([0, 1, index, status & 0xFF])

    def new_node(number):
        return bytes([0, 2, number])

    def new_interface(node, name=0, address=9):
        return bytes([0, 3, node, name, address])

    def interface_gone(index):
        return bytes([0, 4, index])

    def node_gone(index):
        return bytes([0, 5, index])

    def node_report(kind, node):
        return bytes([1, 0, kind, node])

    def interface_report(kind, node, name=0):
        return bytes([1, 1, kind, node, name, 1])

    def address_report(kind, node, name=0, address=9):
        return bytes([1, 2, kind, node, name, 1, address])

    def split_report(kind, local, remote, subtype=0, own_monitor=1):
        lists = b"".join(bytes([len(part)]) + bytes(part).ljust(8, b"\0") for part in (local, remote))
        return bytes([1, 3, kind, subtype]) + lists + bytes([own_monitor])

    def result(monitor, value):
        return bytes([1, 4, monitor, value & 0xFF])

    def other_report(kind):
        return bytes([1, kind, 2, 0] + ([1, 0] if kind in (8, 9) else []))

    def call(number, *arguments):
        return bytes([3, number, *arguments])

    death = node_status(2, 0, 2) + interface_status(4, 0) + interface_status(5, 0) + node_report(down, 3)
    back = node_status(2, 1) + interface_status(4, 1) + interface_status(5, 1) + node_report(up, 3)
    days = {
        "death-and-return": death + take_all + back + take_all,
        "death-that-waits": death + take_one + call(1) + take_one + back + take_all,
        "stale-and-repeated": node_report(down, 3) + node_report(up, 3) + take_all + death * 2 + take_all,
        "stale-interfaces": node_status(2, 0) + interface_status(4, 2) + node_report(down, 3) + take_all + call(1),
        "unknown-status": interface_status(1, 77) + interface_status(2, -1) + call(1) + take_all,
        "interface": interface_status(3, 0) + interface_report(down, 2, 1) + take_all + interface_report(up, 2, 1),
        "interface-comes-and-goes": interface_gone(3) + interface_report(delete, 2, 1) + take_all
        + new_interface(2, 1, 128) + interface_report(add, 2, 1) + take_all,
        "alias": new_interface(2) + address_report(address_add, 2) + take_one + interface_report(add, 2, 2)
        + take_all + address_report(address_delete, 2) + take_all,
        "new-node": new_node(7) + new_interface(7) + other_report(5) + node_report(up, 7) + take_all + node_gone(5)
        + node_report(down, 7) + take_all,
        "node-beyond": new_node(0xF3) + new_interface(0xF8, 4) + node_report(up, 0xF5) + call(1) + take_all,
        "split-and-merge": split_report(split, [1, 2], [3, 4, 5]) + take_all + split_report(merge, [1, 2], [3, 4, 5])
        + take_all + back + take_all,
        "split-with-foreign-lists": split_report(split, [0xF8], [0xF3, 3, 3]) + split_report(split, [1], [2], 1)
        + split_report(split, [1], [2], 0, 8) + take_all,
        "daemon": death + take_all + call(4, 3) + back + take_all + call(0, 3) + call(0, 2) + call(0, 7) + take_all,
        "subscriptions": call(3, 0) + call(3, 1) + call(3, 2) + death + take_all + call(2) + take_all,
        "foreign-bytes": call(5, 0, 9) + call(5, 1, 9) + call(5, 1, 2) + take_all,
        "failed-queries": b"".join(call(6, which, 0xFF) + death + take_all + back + take_all for which in range(6)),
        "results": b"".join(result(monitor, value) for monitor in range(8) for value in (0, 1, 2, -1, -16)) + take_all,
        "others": b"".join(other_report(kind) for kind in (5, 6, 7, 8, 9)) + take_all,
    }
    return {f"{name}{'-traced' if traced == 0 else ''}": bytes([traced]) + steps
            for name, steps in days.items() for traced in (0, 1)}


CORPORA = {
    "adapter_event": lambda: with_hostile(adapter_events(), cursor=5),
    "awaited_reply": exchanges,
    "configuration_at_start": starts,
    "configure_reply": lambda: steering_replies(CONFIG_ADAPTER),
    "configuration_update": lambda: with_hostile(updates(), flags=6),
    "daemon_request": requests,
    "daemon_stream": request_streams,
    "different_instance": lambda: with_hostile(of_kind(other_events(), DIFFERENT_INSTANCE), group_type=2,
                                               group_events=256),
    "event_sequence": sequences,
    "failure_data": lambda: with_hostile(of_kind(other_events(), FAILURE_DATA), group_events=8),
    "grace_reply": lambda: steering_replies(GRACE),
    "hash": hash_operations,
    "largest_cluster": largest,
    "node_event": lambda: with_hostile(node_events(), group_type=0),
    "published_keys": published_keys,
    "published_route": routes,
    "route_reply": lambda: steering_replies(ROUTE),
    "scenario": scenarios,
    "shared_segments": segments,
    "state_reply": lambda: steering_replies(STATE),
    "stream": streams,
    "subscription": subscriptions,
    "swap_reply": lambda: steering_replies(CONFIG_ADAPTER),
    "typed_key": keys,
    "unawaited_kind": lambda: with_hostile(answers()),
    "unconfigure_reply": lambda: steering_replies(CONFIG_ADAPTER),
    "vex_notifications": vex_days,
}


def main():
    if len(sys.argv) != 2:
        sys.exit("make_corpus.py: say where the inputs are to be written: make_corpus.py DIRECTORY")
    for target, inputs in CORPORA.items():
        directory = Path(sys.argv[1]) / f"fuzz_{target}"
        directory.mkdir(parents=True, exist_ok=True)
        for name, content in inputs().items():
            (directory / name).write_bytes(content)


if __name__ == "__main__":
    main()
