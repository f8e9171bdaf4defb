#!/usr/bin/env python3
"""Every exit path of ostracli and ostrahost: its status and its message.

One row of PATHS per way the two tools end: what it runs, on what host and
input, and the exit status and standard error it must give. A new way out of
either tool needs a new row here. Each row runs in a directory of its own,
whose name stands as {dir} in the arguments and the expected messages; the
built tools are {ostracli} and {ostrahost}.

A row is (tool, arguments, status, stderr lines, settings); the settings:

    host     what {dir}/host.db is: "demo" (made by ostrahost init), "dir" (a
             directory), "foreign" (an SQLite database of another program),
             "text" (a text file), "unreadable" (a demo host no one may read),
             "readonly" (a demo host no one may write), "locked" (a demo host
             whose write lock another process holds), "committing" (one whose
             commit another process is writing: readers wait too);
             absent: no such file. OSTRACLI_HOST names it unless the row
             gives --host.
    batch    the text of {dir}/batch, or "dir"/"unreadable" for a directory
             or an unreadable file of that name
    stdin    text fed to standard input (else nothing)
    stdout   "full": standard output is /dev/full
    env      more environment variables ({dir} is replaced)
    file     {name: text}: files made in {dir} first
    root     True: needs root (a network namespace); skipped otherwise

Rows that need a file nobody may read run the tool as user nobody when this
script runs as root (root reads every file); without setpriv they are
skipped, as are root rows without root. Skips are reported.

    exit_paths.py OSTRACLI OSTRAHOST [--show] [FILTER...]

--show prints what every selected row gives now instead of comparing.
"""
import argparse
import os
import pathlib
import shlex
import shutil
import sqlite3
import subprocess
import sys
import tempfile
import threading

DEMO = {"host": "demo"}

PATHS = [
    # --- ostracli: the host state
    ("ostracli", "--host {dir}/host.db network nic list", 1,
     ["ostracli: no host state at {dir}/host.db (create one with: ostrahost init {dir}/host.db)"],
     {}),
    ("ostracli", "--host {dir}/host.db network nic list", 1,
     ["ostracli: {dir}/host.db is a directory, not a host state"], {"host": "dir"}),
    ("ostracli", "--host {dir}/host.db network nic list", 1,
     ["ostracli: The file {dir}/host.db is not a host state database"], {"host": "text"}),
    ("ostracli", "--host {dir}/host.db network nic list", 1,
     ["ostracli: The file {dir}/host.db is not a host state database"], {"host": "foreign"}),
    ("ostracli", "--host {dir}/host.db network nic list", 1,
     ["ostracli: cannot read the host state at {dir}/host.db: Permission denied"],
     {"host": "unreadable"}),
    ("ostracli", "network nic list", 1,
     ["ostracli: no host state at {dir}/host.db (create one with: ostrahost init {dir}/host.db)"],
     {}),
    ("ostracli", "--host {dir}/host.db --lock-timeout 50 network nic down -n vmnic1", 1,
     ["ostracli: The host state at {dir}/host.db is locked by another process; try again"],
     {"host": "locked"}),
    ("ostracli", "--host {dir}/host.db --lock-timeout 50 network nic list", 1,
     ["ostracli: The host state at {dir}/host.db is locked by another process; try again"],
     {"host": "committing"}),
    ("ostracli", "--host {dir}/host.db network nic down -n vmnic1", 1,
     ["The host state at {dir}/host.db cannot be changed: it is read-only"], {"host": "readonly"}),
    ("ostracli", "--host {dir}/host.db network nic down -n vmnic9", 1,
     ["There is no pnic with name vmnic9"], DEMO),
    ("ostracli", "--host {dir}/host.db network nic down -n vmnic1", 0, [], DEMO),
    ("ostracli", "--host {dir}/host.db network nic list", 1,
     ["ostracli: cannot write the output: No space left on device"],
     {"host": "demo", "stdout": "full"}),
    # --- ostracli: the command line
    ("ostracli", "", 0, [], DEMO),
    ("ostracli", "--version", 0, [], DEMO),
    ("ostracli", "--reference", 0, [], DEMO),
    ("ostracli", "--complete network ni", 0, [], DEMO),
    ("ostracli", "network nic get --help", 0, [], DEMO),
    ("ostracli", "--host", 2, ["Error: option --host requires a value"], DEMO),
    ("ostracli", "--host= network nic list", 2, ["Error: option --host requires a path"], DEMO),
    ("ostracli", "--lock-timeout 1s network nic list", 2,
     ["Error: option --lock-timeout takes milliseconds from 0 to 9999999, got \"1s\""], DEMO),
    ("ostracli", "network nic list", 2,
     ["Error: OSTRACLI_LOCK_TIMEOUT_MS takes milliseconds from 0 to 9999999, got \"soon\""],
     {"host": "demo", "env": {"OSTRACLI_LOCK_TIMEOUT_MS": "soon"}}),
    ("ostracli", "--batch= network nic list", 2,
     ["Error: option --batch requires a file (- for standard input)"], DEMO),
    ("ostracli", "--format-param =x network nic list", 2,
     ["Error: option --format-param expects KEY=VALUE, got \"=x\""], DEMO),
    ("ostracli", "--colour network nic list", 2,
     ["Error: unknown global option --colour (global options come before the command; "
      "see ostracli --help)"], DEMO),
    ("ostracli", "--formatter yaml network nic list", 2,
     ["Error: unknown formatter \"yaml\" (one of: simple, table, json, xml, csv, keyvalue)"],
     DEMO),
    ("ostracli", "network nick list", 2,
     ["Error: unknown command \"nick\" under \"network\"; did you mean \"nic\"?"], DEMO),
    ("ostracli", "network nic --name vmnic0", 2,
     ["Error: --name is not a command; \"ostracli network nic --help\" lists the commands"],
     DEMO),
    ("ostracli", "network nic get", 2, ["Error: missing required option --nic-name (-n)"], DEMO),
    ("ostracli", "network nic get -n", 2, ["Error: option --nic-name requires a value"], DEMO),
    ("ostracli", "network nic list extra", 2,
     ["Error: unknown argument \"extra\" under \"network nic list\""], DEMO),
    ("ostracli", "network nic get -n vmnic0 -n vmnic1", 2,
     ["Error: option --nic-name is given more than once"], DEMO),
    ("ostracli", "network nic get -n vmnic0 --colour red", 2,
     ["Error: unknown option --colour"], DEMO),
    ("ostracli", "network nic queue count set -n vmnic2 --num two", 2,
     ["Error: option --num: \"two\" is not an integer"], DEMO),
    ("ostracli", "--format-param colour=red network nic list", 2,
     ["Error: unknown formatter parameter \"colour\" (known: fields, fields:S, table-columns, "
      "table-columns:S, header:S, units:S.F, show-header, wrap-last)"], DEMO),
    ("ostracli", "network nic list --keep-going", 2,
     ["Error: option --keep-going is a global option; global options go before the command "
      "words"], DEMO),
    ("ostracli", "--atomic network nic list", 2,
     ["Error: --atomic needs a host with transactions; the host linux applies each change as "
      "it is made"], {"env": {"OSTRACLI_HOST": "linux"}}),
    # --- ostracli: plug-ins and hosts that cannot be loaded
    ("ostracli", "network nic list", 1,
     ["Error: cannot load the plug-in {dir}/plugins/broken.so: file too short"],
     {"host": "demo", "file": {"plugins/broken.so": ""},
      "env": {"OSTRACLI_PLUGIN_DIR": "{dir}/plugins"}}),
    ("ostracli", "--host linux network nic list", 1,
     ["ostracli: The host linux needs the Linux host module (host-linux.so), which this "
      "ostracli does not have"],
     {"env": {"OSTRACLI_LINUX_MODULE": "{dir}/none.so"}}),
    ("ostracli", "--host netns:ostra-exit-none network nic list", 1,
     ["ostracli: the network namespace ostra-exit-none does not exist"], {"root": True}),
    # --- ostracli: batches
    ("ostracli", "--batch {dir}/batch", 2,
     ["Error: cannot read the batch file {dir}/batch: No such file or directory"], DEMO),
    ("ostracli", "--batch {dir}/batch", 2, ["Error: the batch file {dir}/batch is a directory"],
     {"host": "demo", "batch": "dir"}),
    ("ostracli", "--batch {dir}/batch", 2,
     ["Error: cannot read the batch file {dir}/batch: Permission denied"],
     {"host": "demo", "batch": "unreadable"}),
    ("ostracli", "--batch {dir}/batch network nic list", 2,
     ["Error: --batch takes its commands from the file, not from the command line"],
     {"host": "demo", "batch": "network nic list\n"}),
    ("ostracli", "--host {dir}/host.db --batch {dir}/batch", 1,
     ["ostracli: no host state at {dir}/host.db (create one with: ostrahost init "
      "{dir}/host.db)"], {"batch": "network nic down -n vmnic1\n"}),
    ("ostracli", "--host {dir}/host.db --batch {dir}/batch", 1,
     ["ostracli: {dir}/host.db is a directory, not a host state"],
     {"host": "dir", "batch": "network nic down -n vmnic1\n"}),
    ("ostracli", "--host {dir}/host.db --batch {dir}/batch", 1,
     ["ostracli: The file {dir}/host.db is not a host state database"],
     {"host": "foreign", "batch": "network nic down -n vmnic1\n"}),
    ("ostracli", "--batch -", 0, [], {"host": "demo", "stdin": "network nic down -n vmnic1\n"}),
    ("ostracli", "--batch -", 1,
     ["ostracli: -:1: There is no pnic with name vmnic9",
      "ostracli: -: 0 lines applied, 1 failed; stopped at line 1"],
     {"host": "demo", "stdin": "network nic down -n vmnic9\nnetwork nic down -n vmnic1\n"}),
    ("ostracli", "--batch -", 2,
     ["ostracli: -:1: Error: unterminated quote",
      "ostracli: -: 0 lines applied, 1 failed; stopped at line 1"],
     {"host": "demo", "stdin": "network nic down -n 'vmnic1\n"}),
    ("ostracli", "--batch -", 2,
     ["ostracli: -:1: Error: the line holds a NUL byte",
      "ostracli: -: 0 lines applied, 1 failed; stopped at line 1"],
     {"host": "demo", "stdin": "network nic down -n vmnic1\0\n"}),
    ("ostracli", "--batch -", 2,
     ["ostracli: -:1: Error: a line of a batch cannot name another host",
      "ostracli: -: 0 lines applied, 1 failed; stopped at line 1"],
     {"host": "demo", "stdin": "--host /tmp/other.db network nic list\n"}),
    ("ostracli", "--batch -", 2,
     ["ostracli: -:1: Error: --batch, --keep-going, --lock-timeout, --complete and --reference "
      "are options of a whole ostracli run, not of one command",
      "ostracli: -: 0 lines applied, 1 failed; stopped at line 1"],
     {"host": "demo", "stdin": "--lock-timeout 5 network nic list\n"}),
    ("ostracli", "--keep-going --batch -", 1,
     ["ostracli: -:1: There is no pnic with name vmnic9",
      "ostracli: -: 1 line applied, 1 failed"],
     {"host": "demo", "stdin": "network nic down -n vmnic9\nnetwork nic down -n vmnic1\n"}),
    ("ostracli", "--atomic --keep-going --batch -", 1,
     ["ostracli: -:1: There is no pnic with name vmnic9",
      "ostracli: -: 1 line applied, 1 failed; no change of the batch was kept"],
     {"host": "demo", "stdin": "network nic down -n vmnic9\nnetwork nic down -n vmnic1\n"}),
    # Output is passed on in large pieces, so the failed write comes after the
    # line ran; the batch is still not kept.
    ("ostracli", "--batch -", 1,
     ["ostracli: -: 1 line applied, 0 failed; cannot write the output: "
      "No space left on device; no change of the batch was kept"],
     {"host": "demo", "stdout": "full", "stdin": "network nic list\n"}),
    # --- ostrahost
    ("ostrahost", "", 2, ["ostrahost: no command given", "see ostrahost --help"], {}),
    ("ostrahost", "--help", 0, [], {}),
    ("ostrahost", "--version", 0, [], {}),
    ("ostrahost", "--man", 0, [], {}),
    ("ostrahost", "migrate {dir}/host.db", 2,
     ["ostrahost: unknown command migrate", "see ostrahost --help"], {}),
    ("ostrahost", "init {dir}/host.db --force", 2,
     ["ostrahost: unknown option --force", "see ostrahost --help"], {}),
    ("ostrahost", "init {dir}/host.db --profile", 2,
     ["ostrahost: option --profile requires a value", "see ostrahost --help"], {}),
    ("ostrahost", "init", 2, ["ostrahost: init takes one PATH", "see ostrahost --help"], {}),
    ("ostrahost", "init {dir}/host.db --routes 5", 2,
     ["ostrahost: only generate takes sizes", "see ostrahost --help"], {}),
    ("ostrahost", "init {dir}/host.db --max-size 1K", 2,
     ["ostrahost: only import takes --max-size", "see ostrahost --help"], {}),
    ("ostrahost", "init {dir}/host.db", 1, ["ostrahost: the file {dir}/host.db exists already"],
     DEMO),
    ("ostrahost", "init {dir}/host.db --profile lab", 1,
     ["ostrahost: invalid host description: unknown profile \"lab\" (known: demo, empty)"], {}),
    ("ostrahost", "init {dir}/host.db", 0, [], {}),
    ("ostrahost", "generate {dir}/big.db --vms", 2,
     ["ostrahost: option --vms requires a value", "see ostrahost --help"], {}),
    ("ostrahost", "generate {dir}/big.db --vms -5", 2,
     ["ostrahost: option --vms takes a count, not \"-5\"", "see ostrahost --help"], {}),
    ("ostrahost", "generate", 2, ["ostrahost: generate takes one PATH", "see ostrahost --help"],
     {}),
    ("ostrahost", "generate {dir}/host.db", 1,
     ["ostrahost: the file {dir}/host.db exists already"], DEMO),
    ("ostrahost", "generate {dir}/big.db --vms 4609", 1,
     ["ostrahost: vms must be from 0 to 4608"], {}),
    ("ostrahost", "import", 2, ["ostrahost: import takes one FILE", "see ostrahost --help"], {}),
    ("ostrahost", "import {dir}/in.json --max-size 1T", 2,
     ["ostrahost: option --max-size takes a size in bytes with an optional K, M or G, not \"1T\"",
      "see ostrahost --help"], {}),
    ("ostrahost", "import {dir}/in.json --max-size", 2,
     ["ostrahost: option --max-size requires a value", "see ostrahost --help"], {}),
    ("ostrahost", "import - --host {dir}/host.db", 1,
     ["ostrahost: Cannot open the host state at {dir}/host.db: unable to open database file"],
     {"host": "dir", "stdin": "{}"}),
    ("ostrahost", "import {dir}/in.json --host {dir}/host.db", 1,
     ["ostrahost: cannot read {dir}/in.json: No such file or directory"], DEMO),
    ("ostrahost", "import {dir}/in.json --host {dir}/host.db --max-size 1K", 1,
     ["ostrahost: {dir}/in.json holds more than the import limit of 1024 bytes (raise it with "
      "--max-size)"], {"host": "demo", "file": {"in.json": "{}" + " " * 1100}}),
    ("ostrahost", "import {dir}/in.json --host {dir}/host.db", 1,
     ["ostrahost: invalid host description: not JSON: parse error at line 1, column 2: syntax "
      "error while parsing object key - unexpected end of input; expected string literal"],
     {"host": "demo", "file": {"in.json": "{"}}),
    ("ostrahost", "import {dir}/in.json --host {dir}/host.db", 1,
     ["ostrahost: invalid host description: nics[0].colour: unknown field"],
     {"host": "demo", "file": {"in.json": '{"nics": [{"colour": "red"}]}'}}),
    ("ostrahost", "import - --host {dir}/host.db", 1,
     ["ostrahost: The file {dir}/host.db is not a host state database"],
     {"host": "foreign", "stdin": "{}"}),
    ("ostrahost", "import - --host {dir}/host.db", 0, [], {"host": "demo", "stdin": "{}"}),
    ("ostrahost", "export extra", 2,
     ["ostrahost: export takes no arguments", "see ostrahost --help"], DEMO),
    ("ostrahost", "export --host {dir}/host.db", 1,
     ["ostrahost: There is no host state at {dir}/host.db (create one with "
      "\"ostrahost init {dir}/host.db\")"], {}),
    ("ostrahost", "export --host {dir}/host.db", 1,
     ["ostrahost: The file {dir}/host.db is not a host state database"], {"host": "foreign"}),
    ("ostrahost", "export --host {dir}/host.db", 1,
     ["ostrahost: cannot write the output: No space left on device"],
     {"host": "demo", "stdout": "full"}),
    ("ostrahost", "export", 0, [], DEMO),
    ("ostrahost", "profile", 2, ["ostrahost: profile takes one NAME", "see ostrahost --help"], {}),
    ("ostrahost", "profile lab", 1,
     ["ostrahost: invalid host description: unknown profile \"lab\" (known: demo, empty)"], {}),
    ("ostrahost", "profile empty", 1,
     ["ostrahost: cannot write the output: No space left on device"], {"stdout": "full"}),
]


def parse_args():
    parser = argparse.ArgumentParser(description=__doc__.split("\n")[0])
    parser.add_argument("ostracli")
    parser.add_argument("ostrahost")
    parser.add_argument("--show", action="store_true", help="print what each row gives now")
    parser.add_argument("filters", nargs="*", help="rows whose command line holds one of these")
    return parser.parse_args()


NOBODY = []


def as_nobody(tools):
    """The prefix that runs a command as user nobody, or None when there is
    none or nobody cannot run the built tools (a build tree others may not
    enter)."""
    if not NOBODY:
        setpriv = shutil.which("setpriv")
        prefix = [setpriv, "--reuid=65534", "--regid=65534", "--clear-groups"] if setpriv else None
        if prefix and any(subprocess.run(prefix + [tool, "--version"], capture_output=True)
                          .returncode != 0 for tool in tools.values()):
            prefix = None
        NOBODY.append(prefix)
    return NOBODY[0]


class Locker(threading.Thread):
    """Holds the write lock of a host (exclusive: the lock a commit takes,
    which readers wait for too) until released."""

    def __init__(self, path, exclusive):
        super().__init__(daemon=True)
        self.path = path
        self.exclusive = exclusive
        self.held = threading.Event()
        self.release = threading.Event()

    def run(self):
        connection = sqlite3.connect(self.path, isolation_level=None)
        connection.execute("BEGIN EXCLUSIVE" if self.exclusive else "BEGIN IMMEDIATE")
        self.held.set()
        self.release.wait(30)
        connection.execute("ROLLBACK")
        connection.close()


def prepare(tools, directory, settings):
    """Makes the files of a row in directory."""
    host = settings.get("host")
    path = directory / "host.db"
    if host in ("demo", "unreadable", "readonly", "locked", "committing"):
        subprocess.run([tools["ostrahost"], "init", str(path)], check=True,
                       stdout=subprocess.DEVNULL)
    elif host == "dir":
        path.mkdir()
    elif host == "text":
        path.write_text("host: lab\n")
    elif host == "foreign":
        connection = sqlite3.connect(path)
        connection.execute("CREATE TABLE ledger(entry TEXT)")
        connection.commit()
        connection.close()
    batch = settings.get("batch")
    if batch == "dir":
        (directory / "batch").mkdir()
    elif batch is not None:
        (directory / "batch").write_text(batch)
    for name, text in settings.get("file", {}).items():
        (directory / name).parent.mkdir(parents=True, exist_ok=True)
        (directory / name).write_text(text)
    if host == "unreadable":
        path.chmod(0)
    if host == "readonly":
        path.chmod(0o444)
    if batch == "unreadable":
        (directory / "batch").chmod(0)


def needs_nobody(settings):
    """Whether the row needs a user that file permissions apply to."""
    return settings.get("host") in ("unreadable", "readonly") or \
        settings.get("batch") == "unreadable"


def skip_reason(tools, settings):
    if settings.get("root") and os.geteuid() != 0:
        return "needs root"
    if needs_nobody(settings) and os.geteuid() == 0 and as_nobody(tools) is None:
        return "root reads every file, and nobody cannot run the tools through setpriv"
    return None


def run_row(tools, row, show):
    """A failure report, "skip: why", or None."""
    tool, args, status, err, settings = row
    reason = skip_reason(tools, settings)
    if reason:
        return "skip: " + reason
    with tempfile.TemporaryDirectory(prefix="ostra-exit-") as tmp:
        directory = pathlib.Path(tmp)
        directory.chmod(0o755)
        fill = lambda text: text.replace("{dir}", tmp)
        prepare(tools, directory, settings)
        env = dict(os.environ)
        env.pop("OSTRACLI_PLUGIN_DIR", None)
        env.update({"OSTRACLI_HOST": f"{tmp}/host.db", "HOME": tmp, "XDG_STATE_HOME": tmp,
                    "LC_ALL": "C", "COLUMNS": "80"})
        env.update({key: fill(value) for key, value in settings.get("env", {}).items()})
        argv = [tools[tool]] + [fill(word) for word in shlex.split(args)]
        if needs_nobody(settings) and os.geteuid() == 0:
            argv = as_nobody(tools) + argv
        locker = None
        if settings.get("host") in ("locked", "committing"):
            locker = Locker(f"{tmp}/host.db", settings["host"] == "committing")
            locker.start()
            locker.held.wait(10)
        stdin = settings.get("stdin")
        try:
            with open("/dev/full", "wb") if settings.get("stdout") == "full" else \
                    open(os.devnull, "wb") as out:
                done = subprocess.run(argv, env=env, stdout=out, stderr=subprocess.PIPE,
                                      input=stdin.encode() if stdin is not None else None,
                                      stdin=None if stdin is not None else subprocess.DEVNULL,
                                      timeout=60)
        finally:
            if locker:
                locker.release.set()
                locker.join()
        got = done.stderr.decode(errors="replace").replace(tmp, "{dir}").splitlines()
    shown = f"{tool} {args}"
    if show:
        print(f"{shown}\n  ? {done.returncode}\n" + "".join(f"  ! {l}\n" for l in got), end="")
        return None
    if done.returncode == status and got == err:
        return None
    report = [f"{shown} ({', '.join(f'{k}={v}' for k, v in settings.items())})"]
    if done.returncode != status:
        report.append(f"  exit status {done.returncode}, expected {status}")
    if got != err:
        report += [f"  - {l}" for l in err] + [f"  + {l}" for l in got]
    return "\n".join(report)


def main():
    options = parse_args()
    tools = {"ostracli": os.path.abspath(options.ostracli),
             "ostrahost": os.path.abspath(options.ostrahost)}
    rows = [row for row in PATHS if not options.filters or
            any(f in f"{row[0]} {row[1]}" for f in options.filters)]
    passed = failed = skipped = 0
    for row in rows:
        result = run_row(tools, row, options.show)
        if result is None:
            passed += 1
        elif result.startswith("skip: "):
            skipped += 1
            print(f"{row[0]} {row[1]}: skipped: {result[6:]}")
        else:
            failed += 1
            print(result)
    print(f"exit paths: {passed} passed, {failed} failed" +
          (f", {skipped} skipped" if skipped else ""))
    return 1 if failed or not rows else 0


if __name__ == "__main__":
    sys.exit(main())
