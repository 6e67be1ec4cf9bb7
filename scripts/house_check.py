#!/usr/bin/env python3
"""Holds the tree against the rules of the house (docs/architecture.md).

Folders include downwards only, no header includes itself in a circle, the host is reached through
platform/ alone, every test file belongs to a test program, and no file outgrows its subject.
Prints one line a breach and ends with status 1 when there is any.
"""

import pathlib
import re
import subprocess
import sys

ROOT = pathlib.Path(__file__).resolve().parent.parent

# What a folder may include besides itself. The longest matching folder counts.
MAY_INCLUDE = {
    "platform": set(),
    "platform/linux/wire": {"platform"},
    "platform/linux/client_channel": {"platform", "platform/linux/wire"},
    "platform/linux": {"platform", "platform/linux/wire"},
    "collectors": {"platform"},
    "session": {"platform", "collectors"},
    "dump": {"platform", "collectors", "session"},
    "agent": {"platform", "collectors", "session", "dump"},
    "client": {"platform"},
    "cli": {"platform", "client"},
}
# The places where a program is put together from its parts, and the one host folder each may know.
COMPOSITION = {
    "agent/main.cpp": {"platform/linux"},
    "cli/main.cpp": {"platform/linux"},
    "cli/host.cpp": {"platform/linux"},
}
# Only platform/linux/ may do these; everything else asks an interface.
HOST_CALLS = [
    (re.compile(r"_clock::now\s*\("), "reads a real clock"),
    (re.compile(r"\bsleep_(for|until)\s*\(|\b(u|nano)?sleep\s*\("), "sleeps"),
    (re.compile(r"std::(j?thread)\b(?!::id)|\bpthread_create\b|std::async\b"), "starts a thread"),
    (re.compile(r"(?<![\w:.>])::(socket|connect|bind|listen|accept4?|send|recv|sendmsg|recvmsg)\s*\("),
     "uses a socket"),
    (re.compile(r"\b(fork|vfork|execv\w*|posix_spawnp?|popen|waitpid|kill)\s*\(|\bstd::system\s*\("),
     "handles a process"),
    (re.compile(r"\b(getenv|secure_getenv)\s*\("), "reads the environment"),
]
INCLUDE = re.compile(r'^\s*#include\s+"([^"]+)"')
LARGEST = 500


def tracked():
    names = subprocess.run(["git", "ls-files", "-co", "--exclude-standard"], cwd=ROOT, text=True,
                           capture_output=True, check=True).stdout.split("\n")
    return [n for n in names if n.endswith((".h", ".hpp", ".cpp")) and (ROOT / n).exists()]


def owner(name):
    """The folder of the table that a file belongs to, or nothing for tests, benchmarks and the like."""
    fitting = [f for f in MAY_INCLUDE if name.startswith(f + "/")]
    return max(fitting, key=len) if fitting else None


def from_root(name, target):
    """A header that is installed includes its neighbour by its bare name."""
    neighbour = pathlib.PurePosixPath(name).parent / target
    return str(neighbour) if "/" not in target and (ROOT / neighbour).exists() else target


def code_lines(text):
    text = re.sub(r"/\*.*?\*/", lambda m: "\n" * m.group().count("\n"), text, flags=re.S)
    for number, line in enumerate(text.split("\n"), 1):
        yield number, re.sub(r"//.*", "", line)


def check_includes(name, folder, includes, breaches):
    allowed = MAY_INCLUDE[folder] | {folder} | COMPOSITION.get(name, set())
    for number, target in includes:
        target_folder = owner(target)
        if target_folder is None:
            breaches.append(f"{name}:{number}: includes {target}, which is outside the house")
        elif not any(target_folder == a or target_folder.startswith(a + "/")
                     and (a.startswith("platform/linux") or a != "platform") for a in allowed):
            breaches.append(f"{name}:{number}: {folder} must not include {target}")


def check_circles(graph, breaches):
    state = {}

    def visit(name, path):
        state[name] = "open"
        for target in graph.get(name, []):
            if state.get(target) == "open":
                circle = path[path.index(target):] + [target]
                breaches.append("include circle: " + " -> ".join(circle))
            elif target not in state:
                visit(target, path + [target])
        state[name] = "done"

    for name in graph:
        if name not in state:
            visit(name, [name])


def check_tests(names, breaches):
    text = "\n".join(p.read_text() for p in [ROOT / "tests/CMakeLists.txt", *ROOT.glob("tests/**/CMakeLists.txt")])
    for name in names:
        if not re.match(r"tests/.*_test\.cpp$", name):
            continue
        folder = str(pathlib.PurePosixPath(name).parent.relative_to("tests"))
        if not re.search(rf"[\s/(]{re.escape(folder)}[\s)/]", text):
            breaches.append(f"{name}: belongs to no test program")


def main():
    breaches = []
    graph = {}
    names = tracked()
    for name in names:
        text = (ROOT / name).read_text(encoding="utf-8")
        lines = list(code_lines(text))
        includes = [(n, from_root(name, m.group(1))) for n, line in lines if (m := INCLUDE.match(line))]
        graph[name] = [target for _, target in includes]
        if len(lines) > LARGEST + 1:
            breaches.append(f"{name}: {len(lines)} lines; look for a second subject")
        folder = owner(name)
        if folder is None:
            continue
        check_includes(name, folder, includes, breaches)
        if folder.startswith("platform/linux"):
            continue
        for number, line in lines:
            for pattern, what in HOST_CALLS:
                if pattern.search(line) and name not in COMPOSITION:
                    breaches.append(f"{name}:{number}: {what}; only platform/linux/ may")
    check_circles(graph, breaches)
    check_tests(names, breaches)
    for breach in breaches:
        print(breach)
    if not breaches:
        print(f"house check: {len(names)} files keep the rules")
    return 1 if breaches else 0


if __name__ == "__main__":
    sys.exit(main())
