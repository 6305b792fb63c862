"""Help, manual page and completion: they agree, and the examples do what they say."""

import os
import re
import shutil
import subprocess

from tool import COMMAND, delimited, expect, in_scratch_directory, run, write

ENVELOPE = bytes.fromhex("08 01 10 05 1A 04 22 02 10 01")


def commands():
    """The commands by name, each with its help."""
    section = run("--help").stdout.decode().split("Commands:\n")[1].split("\n\n")[0]
    names = [line.split()[0] for line in section.splitlines()]
    return {name: run(name, "--help").stdout.decode() for name in names}


def options(help_text):
    return set(re.findall(r"^  (?:-\w, |    )(--[\w-]+)", help_text, re.MULTILINE))


def completed(*words):
    """What completion offers for the last of the words."""
    script = 'source completion.bash; COMP_WORDS=("$@"); COMP_CWORD=$(($# - 1)); _orv'
    script += '; printf "%s\\n" "${COMPREPLY[@]}"'
    done = subprocess.run(["bash", "-c", script, "bash", *words], capture_output=True, timeout=60)
    expect(f"completion of {words}: standard error", done.stderr, b"")
    return set(done.stdout.decode().split())


def completion(helps):
    write("completion.bash", run("--bash-completion").stdout)
    expect("completion of commands", completed(COMMAND, ""), set(helps))
    for name, text in helps.items():
        expect(f"completion of {name}'s options", completed(COMMAND, name, "--"), options(text))
        for option, formats in re.findall(r"(--from|--to) FORMAT\s+[^:]*:([^-]*)", text):
            listed = set(re.findall(r"\b(binary|hex|base64|text|json|html)\b", formats))
            expect(f"completion of {name} {option}", completed(COMMAND, name, option, ""), listed)
            expect(f"completion of {name} {option}=", completed(COMMAND, name, option, "="), listed)
            first = min(listed)
            expect(
                f"completion of {name} {option}={first}", completed(COMMAND, name, option, "=", first), {first}
            )
    expect("completion without a command", completed(COMMAND, "--"), options(helps["decode"]) | {"--version"})
    expect(
        "completion of types", completed(COMMAND, "types", "JoinReq"), {"JoinRequest", "JoinRequest.Content"}
    )
    expect("completion of a type", completed(COMMAND, "-t", "Memb"), {"Member"})
    payload = "the type of a payload"
    expect(payload, completed(COMMAND, "--payload", "joinRequest", "=", "Memb"), {"Member"})
    expect(payload, completed(COMMAND, "--payload", "=", "joinRequest", "=", "Memb"), {"Member"})
    expect("completion of a kind", completed(COMMAND, "--payload", "join"), {"joinRequest=", "joinResponse="})
    expect("completion of a kind", completed(COMMAND, "--payload", "=", "group"), {"groupMessage="})
    expect("completion of a command to tell more of", completed(COMMAND, "help", ""), set(helps))


def man_page(helps):
    page = run("--man-page", "November 22, 2025").stdout
    for name, text in helps.items():
        section = page.decode().split(f".Ss orv {name}\n")[1].split(".Ss")[0].split(".Sh")[0]
        in_page = set("--" + option for option in re.findall(r"Fl -([\w-]+)", section))
        expect(f"manual page of {name}", in_page, options(text))
    if shutil.which("mandoc") is None:
        print("mandoc is missing: the manual page was not checked with it")
        return
    lint = subprocess.run(["mandoc", "-Tlint"], input=page, capture_output=True, timeout=60)
    expect("mandoc's lint", (lint.stdout + lint.stderr).decode(), "")


def examples(helps):
    """Each example runs as it stands."""
    for name, contents in {
        "capture.bin": delimited(ENVELOPE, ENVELOPE),
        "message.bin": ENVELOPE,
        "before.bin": ENVELOPE,
        "after.bin": ENVELOPE,
        "payload.bin": ENVELOPE[6:],
        "message.json": b'{"version":1}',
        "dump.txt": ENVELOPE.hex().encode(),
    }.items():
        write(name, contents)
    os.symlink(COMMAND, "orv")
    search = {**os.environ, "PATH": f"{os.getcwd()}:{os.environ['PATH']}"}
    for name, text in helps.items():
        lines = re.findall(r"^  (\S.*)\n      ", text.split("Examples:\n")[1], re.MULTILINE)
        expect(f"{name} has examples", bool(lines), True)
        for line in lines:
            if any(shutil.which(word) is None for word in re.findall(r"\| (\w+)", line) if word != "orv"):
                print(f"not run for want of a program: {line}")
                continue
            done = subprocess.run(
                ["bash", "-o", "pipefail", "-c", line], env=search, capture_output=True, timeout=60
            )
            expect(f"example {line}", (done.returncode, done.stderr), (0, b""))


def test():
    helps = commands()
    expect("help of no command", run("-h").stdout, run("--help").stdout)
    expect("version", run("--version").stdout.decode().split()[0], "orv")
    expect("version, in short", run("-V").stdout, run("--version").stdout)
    expect("help without a command", run("help").stdout, run("--help").stdout)
    for name, text in helps.items():
        longest = max(len(line) for line in text.splitlines() if not line.startswith("  echo"))
        expect(f"help on {name}", run("help", name).stdout.decode(), text)
        expect(f"help of {name} fits 80 columns", longest <= 80, True)
    completion(helps)
    man_page(helps)
    examples(helps)


in_scratch_directory(test)
