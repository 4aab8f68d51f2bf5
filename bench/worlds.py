#!/usr/bin/env python3
"""Writes a scenario of a host with N worlds (standard output), for the process list benchmark.

The worlds are cartels of one main world and a few helpers, with names, command lines, states
and security domains cycled from a small set, so every row looks like a real one and the rows
differ. Usage: bench/worlds.py N
"""
import json
import sys

NAMES = ["hostagent", "logrelay", "netlinkd", "storagemon", "vitals", "webui", "vmshell",
         "dumpcollector", "resolvd", "periodicd", "fanctl-agent", "snapkeeper"]
STATES = ["sleeping", "waiting", "running", "sleeping", "ready", "sleeping", "stopped"]


def worlds(count):
    cartel = 0
    for i in range(count):
        helper = i % 4
        if helper == 0:
            cartel = 1000 + i
        name = NAMES[(i // 4) % len(NAMES)]
        yield {
            "id": 1000 + i,
            "cartel_id": cartel,
            "parent_cartel_id": 1,
            "name": name if helper == 0 else f"{name}-worker-{helper}",
            "command_line": f"/usr/lib/quarn/{name} --instance {i // 4} -c /etc/{name}.conf",
            "world_group_id": 4 + (i // 4) % 5,
            "cartel_group_id": cartel,
            "session_id": cartel,
            "flags": 3 if helper == 0 else 2,
            "type": "main" if helper == 0 else "helper",
            "state": STATES[i % len(STATES)],
            "security_domain_id": 1 + (i // 4) % 12,
        }


def main():
    count = int(sys.argv[1])
    json.dump({"format": 1, "worlds": list(worlds(count))}, sys.stdout)


if __name__ == "__main__":
    main()
