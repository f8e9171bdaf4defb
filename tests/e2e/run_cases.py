#!/usr/bin/env python3
"""End-to-end tests: run the built ostracli on imported hosts, compare whole outputs.

A case file (tests/e2e/cases/**/*.case) holds a host and a sequence of commands
with their expected output:

    # a comment
    host: demo                (a profile name, or a JSON host description
                               relative to the case file)
    $ ostracli network nic down -n vmnic1
    > true                    (one expected stdout line; ">" alone for an empty line)
    ! Error text              (one expected stderr line)
    ? 0                       (expected exit status)

All commands of one file share one fresh host, so later commands see the
changes of earlier ones. Run with --update to rewrite the expected output from
what the tools print now; review the diff before committing it.

A case file can name the Linux host instead (root only; without root the file
is skipped with the reason):

    host: linux               (a lab network namespace made for this file)
    setup: ip link add vmnic0 address 02:00:00:00:00:10 type veth peer name peer0
                              (run as `ip -n LAB ...`; likewise `bridge ...`)
    setup: exec sysctl -qw net.ipv6.conf.all.accept_dad=0
                              (run as `ip netns exec LAB ...`)
    setup: file hosts 192.0.2.7 web.lab
                              (a line appended to /etc/netns/LAB/hosts)

The setup lines run in order before the first command; the commands run with
OSTRACLI_HOST=netns:LAB. The word LAB in a command or setup line stands for the
namespace's name, and the name is shown as LAB in the outputs compared. Give
links fixed MAC addresses so that outputs stay the same from run to run. The
lab and /etc/netns/LAB are deleted afterwards, whatever happened.
"""
import argparse
import concurrent.futures
import itertools
import os
import pathlib
import shlex
import shutil
import subprocess
import sys
import tempfile

LAB_COUNTER = itertools.count()


def parse_case(path, setup=None):
    host = None
    steps = []
    comments = []  # comment lines met since the last step, kept for --update
    for number, raw in enumerate(path.read_text(encoding="utf-8").split("\n"), 1):
        line = raw
        if line.startswith("host:"):
            host = line[5:].strip()
        elif line.startswith("setup:"):
            if setup is None or steps:
                raise ValueError(f"{path}:{number}: setup lines come before the commands "
                                 "of a Linux host case")
            setup.append(line[6:].strip())
        elif line.startswith("$ "):
            steps.append({"command": line[2:], "out": [], "err": [], "status": 0, "line": number,
                          "comments": comments if steps else []})
            comments = []
        elif line.startswith(">") or line.startswith("!") or line.startswith("?"):
            if not steps:
                raise ValueError(f"{path}:{number}: output before any command")
            body = line[2:] if len(line) > 1 and line[1] == " " else line[1:]
            if line[0] == ">":
                steps[-1]["out"].append(body)
            elif line[0] == "!":
                steps[-1]["err"].append(body)
            else:
                steps[-1]["status"] = int(body)
        elif line.startswith("#"):
            comments.append(line)
        elif line.strip() == "":
            continue
        else:
            raise ValueError(f"{path}:{number}: unrecognised line: {raw!r}")
    if host is None:
        raise ValueError(f"{path}: no 'host:' line")
    return host, steps


def lines_of(data):
    text = data.decode("utf-8", errors="backslashreplace")
    if text.endswith("\n"):
        text = text[:-1]
    return text.split("\n") if text else []


class Lab:
    """A throwaway network namespace for one case file, deleted on exit."""

    def __init__(self, setup):
        self.name = f"ostra-e2e-{os.getpid()}-{next(LAB_COUNTER)}"
        self.setup = setup

    def run(self, argv):
        done = subprocess.run(argv, capture_output=True)
        if done.returncode != 0:
            raise ValueError(f"setup failed: {' '.join(argv)}: {done.stderr.decode().strip()}")

    def __enter__(self):
        self.run(["ip", "netns", "add", self.name])
        try:
            for line in self.setup:
                words = shlex.split(line.replace("LAB", self.name))
                if words[0] in ("ip", "bridge"):
                    self.run([words[0], "-n", self.name] + words[1:])
                elif words[0] == "exec":
                    self.run(["ip", "netns", "exec", self.name] + words[1:])
                elif words[0] == "file" and len(words) >= 2:
                    directory = pathlib.Path("/etc/netns") / self.name
                    directory.mkdir(parents=True, exist_ok=True)
                    with open(directory / words[1], "a", encoding="utf-8") as out:
                        out.write(" ".join(words[2:]) + "\n")
                else:
                    raise ValueError(f"unknown setup line: {line}")
        except BaseException:
            self.__exit__(None, None, None)
            raise
        return self

    def __exit__(self, *exc):
        subprocess.run(["ip", "netns", "del", self.name], capture_output=True)
        shutil.rmtree(pathlib.Path("/etc/netns") / self.name, ignore_errors=True)


def linux_skip_reason():
    if os.geteuid() != 0:
        return "a Linux host case builds a network namespace lab, which needs root"
    if shutil.which("ip") is None:
        return "a Linux host case needs iproute2 (ip)"
    return None


def run_case(path, tools, update):
    setup = []
    host, steps = parse_case(path, setup)
    if host == "linux":
        reason = linux_skip_reason()
        if reason:
            return [], None, reason
        with Lab(setup) as lab:
            failures = run_steps(path, steps, tools, update, {"OSTRACLI_HOST": f"netns:{lab.name}"},
                                 lab.name)
        return failures, (host, steps), None
    if setup:
        raise ValueError(f"{path}: setup lines belong to a Linux host case")
    failures, parsed = run_simulated_case(path, host, steps, tools, update)
    return failures, parsed, None


def run_steps(path, steps, tools, update, env_extra, lab):
    """Runs the commands of a Linux host case in its lab."""
    failures = []
    env = dict(os.environ)
    env.update({"COLUMNS": "80", "LC_ALL": "C"})
    env.update(env_extra)
    env.pop("OSTRACLI_PLUGIN_DIR", None)
    for step in steps:
        argv = shlex.split(step["command"].replace("LAB", lab))
        if argv and argv[0] in tools:
            argv[0] = tools[argv[0]]
        done = subprocess.run(argv, env=env, capture_output=True, cwd=str(path.parent))
        out = [l.replace(lab, "LAB") for l in lines_of(done.stdout)]
        err = [l.replace(lab, "LAB") for l in lines_of(done.stderr)]
        failures += compare(path, step, out, err, done.returncode, update)
    return failures


def compare(path, step, out, err, status, update):
    if update:
        step["out"], step["err"], step["status"] = out, err, status
        return []
    if out == step["out"] and err == step["err"] and status == step["status"]:
        return []
    report = [f"{path}:{step['line']}: $ {step['command']}"]
    if status != step["status"]:
        report.append(f"  exit status {status}, expected {step['status']}")
    for name, got, want in (("stdout", out, step["out"]), ("stderr", err, step["err"])):
        if got != want:
            report.append(f"  {name} differs:")
            report += [f"    - {l}" for l in want]
            report += [f"    + {l}" for l in got]
    return ["\n".join(report)]


def run_simulated_case(path, host, steps, tools, update):
    failures = []
    with tempfile.TemporaryDirectory(prefix="ostra-e2e-") as tmp:
        db = os.path.join(tmp, "host.db")
        env = dict(os.environ)
        env.update({"OSTRACLI_HOST": db, "COLUMNS": "80", "HOME": tmp,
                    "XDG_STATE_HOME": tmp, "LC_ALL": "C"})
        env.pop("OSTRACLI_PLUGIN_DIR", None)
        description = path.parent / host
        if host.endswith(".json"):
            setup = [tools["ostrahost"], "import", str(description), "--host", db]
        else:
            setup = [tools["ostrahost"], "init", db, "--profile", host]
        done = subprocess.run(setup, env=env, capture_output=True)
        if done.returncode != 0:
            return [f"{path}: cannot create host {host}: {done.stderr.decode()}"], None
        for step in steps:
            argv = shlex.split(step["command"])
            if argv and argv[0] in tools:
                argv[0] = tools[argv[0]]
            done = subprocess.run(argv, env=env, capture_output=True, cwd=str(path.parent))
            failures += compare(path, step, lines_of(done.stdout), lines_of(done.stderr),
                                done.returncode, update)
    return failures, (host, steps)


def write_case(path, host, steps):
    original = path.read_text(encoding="utf-8").split("\n")
    header = []
    for line in original:
        if line.startswith("$ "):
            break
        header.append(line)
    while header and header[-1].strip() == "":
        header.pop()
    text = "\n".join(header) + "\n"
    for step in steps:
        text += "".join("\n" + c for c in step.get("comments", []))
        text += "\n$ " + step["command"] + "\n"
        text += "".join((">" + (" " + l if l else "")) + "\n" for l in step["out"])
        text += "".join(("!" + (" " + l if l else "")) + "\n" for l in step["err"])
        text += f"? {step['status']}\n"
    path.write_text(text, encoding="utf-8")


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--ostracli", required=True)
    parser.add_argument("--ostrahost", required=True)
    parser.add_argument("--cases", required=True)
    parser.add_argument("--update", action="store_true", help="rewrite expected output")
    parser.add_argument("--jobs", type=int, default=os.cpu_count() or 1,
                        help="case files run at once (default: one per core)")
    parser.add_argument("filter", nargs="*", help="only case files whose path contains one of these")
    args = parser.parse_args()
    tools = {"ostracli": os.path.abspath(args.ostracli), "ostrahost": os.path.abspath(args.ostrahost)}
    cases = sorted(pathlib.Path(args.cases).rglob("*.case"))
    if args.filter:
        cases = [c for c in cases if any(f in str(c) for f in args.filter)]
    def run(case):
        try:
            return run_case(case, tools, args.update)
        except ValueError as error:
            return [f"{case}: {error}"], None, None

    passed = failed = skipped = 0
    # Each case file has its own host, so files run in parallel; results are
    # reported in file order.
    with concurrent.futures.ThreadPoolExecutor(max_workers=max(1, args.jobs)) as pool:
        results = list(pool.map(run, cases))
    for case, (failures, parsed, skip) in zip(cases, results):
        if skip:
            skipped += 1
            print(f"{case}: skipped: {skip}")
            continue
        if args.update and parsed:
            write_case(case, *parsed)
        if failures:
            failed += 1
            print("\n".join(failures))
        else:
            passed += 1
    print(f"e2e: {passed} passed, {failed} failed" + (f", {skipped} skipped" if skipped else ""))
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main())
