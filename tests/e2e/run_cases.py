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
"""
import argparse
import concurrent.futures
import os
import pathlib
import shlex
import subprocess
import sys
import tempfile


def parse_case(path):
    host = None
    steps = []
    comments = []  # comment lines met since the last step, kept for --update
    for number, raw in enumerate(path.read_text(encoding="utf-8").split("\n"), 1):
        line = raw
        if line.startswith("host:"):
            host = line[5:].strip()
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


def run_case(path, tools, update):
    host, steps = parse_case(path)
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
            out, err = lines_of(done.stdout), lines_of(done.stderr)
            if update:
                step["out"], step["err"], step["status"] = out, err, done.returncode
                continue
            if out != step["out"] or err != step["err"] or done.returncode != step["status"]:
                report = [f"{path}:{step['line']}: $ {step['command']}"]
                if done.returncode != step["status"]:
                    report.append(f"  exit status {done.returncode}, expected {step['status']}")
                for name, got, want in (("stdout", out, step["out"]), ("stderr", err, step["err"])):
                    if got != want:
                        report.append(f"  {name} differs:")
                        report += [f"    - {l}" for l in want]
                        report += [f"    + {l}" for l in got]
                failures.append("\n".join(report))
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
            return [str(error)], None

    passed = failed = 0
    # Each case file has its own host, so files run in parallel; results are
    # reported in file order.
    with concurrent.futures.ThreadPoolExecutor(max_workers=max(1, args.jobs)) as pool:
        results = list(pool.map(run, cases))
    for case, (failures, parsed) in zip(cases, results):
        if args.update and parsed:
            write_case(case, *parsed)
        if failures:
            failed += 1
            print("\n".join(failures))
        else:
            passed += 1
    print(f"e2e: {passed} passed, {failed} failed")
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main())
