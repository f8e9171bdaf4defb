#!/usr/bin/env python3
"""Every read-only command of the tree, on the demo host, in all six formatters.

Walks the registered tree through the machine-readable help, runs each command
that needs no option and changes nothing, and checks that the output of each
formatter parses: xml with xmllint, csv with an RFC 4180 reader, json with a
JSON parser; simple and table must not fail.

    formats_check.py OSTRACLI OSTRAHOST
"""
import concurrent.futures
import csv
import io
import json
import os
import shutil
import subprocess
import sys
import tempfile

from command_tree import read_only_commands


def main():
    cli, host_tool = sys.argv[1], sys.argv[2]
    with tempfile.TemporaryDirectory() as tmp:
        db = os.path.join(tmp, "host.db")
        subprocess.run([host_tool, "init", db, "--profile", "demo"], check=True)
        env = dict(os.environ, OSTRACLI_HOST=db)

        def run(args, **kw):
            return subprocess.run([cli] + args, capture_output=True, env=env, **kw)

        commands = read_only_commands(cli, env)
        xmllint = shutil.which("xmllint")

        def check(path, fmt):
            done = run(["--formatter", fmt] + path)
            if done.returncode not in (0, 1):
                return f"exit status {done.returncode}"
            if fmt == "json" and done.stdout:
                try:
                    json.loads(done.stdout)
                except ValueError as error:
                    return f"not JSON: {error}"
            elif fmt == "xml" and done.stdout and xmllint:
                lint = subprocess.run([xmllint, "--noout", "-"], input=done.stdout,
                                      capture_output=True)
                if lint.returncode:
                    return "not well-formed: " + lint.stderr.decode()[:200]
            elif fmt == "csv" and done.stdout:
                try:
                    rows = list(csv.reader(io.StringIO(done.stdout.decode(), newline=""),
                                           strict=True))
                    if len({len(row) for row in rows}) > 1:
                        return "rows of different lengths"
                except csv.Error as error:
                    return f"not CSV: {error}"
            return None

        runs = [(path, fmt) for path in commands
                for fmt in ("simple", "table", "json", "xml", "csv", "keyvalue")]
        # The commands only read the host, so they run in parallel.
        with concurrent.futures.ThreadPoolExecutor(max_workers=os.cpu_count() or 1) as pool:
            problems = list(pool.map(lambda run_: check(*run_), runs))
        passed = failed = 0
        for (path, fmt), problem in zip(runs, problems):
            if problem:
                failed += 1
                print(f"{' '.join(path)} --formatter {fmt}: {problem}")
            else:
                passed += 1
        print(f"{len(commands)} commands; {passed} passed, {failed} failed")
        return 1 if failed or not commands else 0


if __name__ == "__main__":
    sys.exit(main())
