"""gdb_test.py <program> <printers>: gdb shows the program's values as a reader wants them."""

import re
import shutil
import subprocess
import sys

program, printers = sys.argv[1:]
SKIPPED = 77

MEMBER = 'orv::v0::Member = {handle = "Ann", unknownFields = {2 bytes: 48 01}}'
EXPECTED = {
    "shortText": '"zoë@phone"',
    "longText": '"' + "a" * 60 + '"',
    "emptyText": '""',
    "bytes": "{3 bytes: 0a 00 ff}",
    "longBytes": "{50 bytes: 01 01 01 01...}",
    "member": MEMBER,
    "group": "orv::v0::Group = {event = orv::v0::Group::MemberAdded = {groupUuid = {2 bytes: ab cd}, "
             f"member = {MEMBER}}}}}",
    "members": "orv::v0::Group::Initialization = {members = std::vector of length 2, capacity 2 = {"
               f"{MEMBER}, {MEMBER}}}}}",
    "envelope": "orv::v0::SessionMessage = {version = 0, data = {no bytes}}",
    "nothing": "orv::v0::Group",
}

if shutil.which("gdb") is None:
    print("skipped: there is no gdb")
    sys.exit(SKIPPED)
commands = ["set print repeats 0", "set print elements 0", "set charset UTF-8", f"source {printers}"]
commands += ["break stop", "run", "up"]
for name in EXPECTED:
    commands += ["set print elements 4"] if name == "longBytes" else []
    commands += [f"output {name}", "echo \\n#\\n", "set print elements 0"]
command = ["gdb", "-nx", "-batch", "-iex=set auto-load safe-path /", *(f"-ex={line}" for line in commands), program]
done = subprocess.run(command, capture_output=True, text=True, timeout=120, stdin=subprocess.DEVNULL)
if "Breakpoint 1, " not in done.stdout:
    print("skipped: gdb cannot run a program here", done.stdout, done.stderr, sep="\n")
    sys.exit(SKIPPED)
values = [value.strip() for value in done.stdout.split("#\n")]
values[0] = values[0].splitlines()[-1]
failures = 0
for (name, expected), actual in zip(EXPECTED.items(), values):
    if actual != expected:
        failures += 1
        print(f"{name}:\n  expected {expected}\n  but got  {actual}")
print(done.stderr, end="")
sys.exit(1 if failures or len(values) < len(EXPECTED) else 0)
