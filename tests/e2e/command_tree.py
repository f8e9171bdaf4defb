"""The commands of the live tree that read the host and need no option.

Shared by the end-to-end checks that run every such command: the tree is read
through ostracli's machine-readable help, so no list of commands is kept by
hand.
"""
import json
import subprocess

# Words of a command name that mark it as changing the host.
CHANGING = ("add", "remove", "set", "load", "unload", "refresh", "change", "run", "restart")


def read_only_commands(cli, env=None, extra=()):
    """Paths (lists of words) of every command below `network` that needs no
    option and whose name does not say it changes the host. `extra` goes in
    front of the help request (e.g. ["--host", PATH])."""

    def help_of(path):
        done = subprocess.run([cli] + list(extra) + ["--formatter", "json"] + path + ["--help"],
                              capture_output=True, env=env, check=True)
        return json.loads(done.stdout)

    commands = []

    def walk(path):
        for child in help_of(path)["children"]:
            sub = path + [child["name"]]
            if child["kind"] == "namespace":
                walk(sub)
            elif not any(p["required"] for p in help_of(sub)["parameters"]) and \
                    not any(word in sub[-1] for word in CHANGING):
                commands.append(sub)

    walk(["network"])
    return commands
