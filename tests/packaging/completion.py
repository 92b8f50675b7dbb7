#!/usr/bin/env python3
"""Completes command lines: what the program says, and what each shell that is installed makes of
it when a person presses Tab, on a terminal of its own.
Usage: completion.py PROGRAM DIRECTORY_OF_COMPLETIONS TREE"""

import os
import pty
import re
import select
import shutil
import subprocess
import sys
import tempfile
import time

program, completions, tree = sys.argv[1:4]
failures = 0
PATIENCE = 60 * float(os.environ.get("ZR_TEST_LOAD", "1"))


def report(good, what, detail=""):
    global failures
    print("ok: " + what if good else f"FAILED: {what}: {detail}")
    failures += 0 if good else 1


def offered(*words):
    """The words that the program offers behind these, and what it says of them."""
    run = subprocess.run([program, "complete", *words], stdout=subprocess.PIPE, check=True,
                         env={**os.environ, "ZR_INSTRUMENTATION_TREE": tree})
    return [line.split("\t")[0] for line in run.stdout.decode().splitlines()]


def offers(wanted, *words):
    found = offered(*words)
    report(found == wanted, "offers behind " + " ".join(words), f"{found}, not {wanted}")


SETTING = 'QVXZR_DHCPSettingData.InstanceID="Computer%'

offers(["show"], "sh")
offers(["rename", "references"], "re")
offers(["show", "serve"], "s")
offers(["add"], "user", "a")
offers(["--users"], "user", "add", "--us")
offers(["table"], "--format", "ta")
offers(["--format"], "--fo")
offers(["--format=tsv"], "--format=ts")
offers(["--connect", "--columns", "--count", "--color"], "--co")
offers(["always"], "--color", "al")
offers(["state"], "show", "--sort", "st")
offers(["interface,state"], "show", "--columns", "interface,st")
offers(["InstanceID"], "instances", "QVXZR_DHCPSettingData", "--sort", "Ins")
offers(["ElementName,InstanceID"], "get", SETTING, "--properties", "ElementName,Inst")
offers([], "--timeout", "")
offers(["show", "serve"], "--parallel", "3", "--hosts", "file", "s")
offers(["QVXZR_DHCPSettingData"], "names", "QVXZR_DHCPS")
offers(["QVXZR_DHCPProtocolEndpoint"], "--format", "json", "instances", "QVXZR_DHCPP")
offers(["QVXZR_DHCPLease", "QVXZR_DHCPLeaseOfEndpoint"], "describe", "QVXZR_DHCPL")
offers(["QVXZR_SAPSAPDependency"], "associators", "--assoc-class", "QVXZR_SAP")
offers(["ManagedElement"], "associators", "--role", "M")
offers(["eth0", "eth1"], "rename", "eth")
offers([], "rename", "eth0", "of")
offers(["eth0", "eth1"], "watch", "wlan0", "eth")
offers(["eth1"], "show", "eth0", "eth")
offers(["version"], "profiles", "--sort", "v")
offers(["user"], "help", "us")
offers(["add"], "help", "user", "")
offers([":tree"], "--tree", "x")
offers([":tree"], "--tree=x")
offers([":file"], "--hosts", "")
offers([":directory"], "--data-dir", "")
offers([":host"], "--connect", "")
offers([":nospace", "ConfigurationName="], "modify", SETTING + 'eth0"', "")
paths = [SETTING + name + '"' for name in ("eth0", "wlan0", "eth1")]
offers(paths, "get", "QVXZR_DHCPS")
offers(paths[:1] + paths[2:], "get", SETTING + "eth")
offers(["root/cimv2:" + paths[1]], "references", "root/cimv2:" + SETTING + "w")
report(":nospace" in offered("get", "QVXZR_DHCP"), "goes on behind the names of classes")
# The tree in use, and a server that does not exist.
with tempfile.NamedTemporaryFile("w", suffix=".json") as other:
    other.write('{"nodes": []}')
    other.flush()
    offers([], "--tree", other.name, "show", "")
offers([], "--tree", "/does/not/exist", "show", "")
offers([], "--connect", "http://127.0.0.1:1", "show", "")


class Shell:
    """An interactive shell on a terminal, whose prompt is READY>."""

    def __init__(self, arguments, setup):
        self.text = ""
        self.pid, self.terminal = pty.fork()
        if self.pid == 0:
            environment = {"PATH": os.path.dirname(program) + ":" + os.environ["PATH"],
                           "HOME": home, "TERM": "dumb", "PS1": "READY>", "INPUTRC": "/dev/null",
                           "LC_ALL": "C.UTF-8", "ZR_INSTRUMENTATION_TREE": tree,
                           "ZR_CONFIG": os.environ.get("ZR_CONFIG", "/dev/null")}
            os.execve(arguments[0], arguments, environment)
        for line in setup:
            self.send(line + "\n")
        self.lines("printf '<%s>\\n' begin END\n")

    def send(self, text):
        os.write(self.terminal, text.encode())

    def lines(self, typed):
        """Types something, and gives the lines <...> that come of it, up to <END>."""
        start = len(self.text)
        self.send(typed)
        end = time.monotonic() + PATIENCE
        while not re.search(r"^<END>", self.text[start:], re.MULTILINE):
            left = end - time.monotonic()
            if left <= 0 or not select.select([self.terminal], [], [], left)[0]:
                return ["nothing within the time: " + repr(self.text[start:])]
            try:
                self.text += os.read(self.terminal, 65536).decode(errors="replace").replace("\r", "")
            except OSError:
                return ["the shell ended: " + repr(self.text[start:])]
        return re.findall(r"^<(.*)>$", self.text[start:], re.MULTILINE)[:-1]

    def completed(self, typed):
        """The words of the line that Tab makes of what was typed."""
        return self.lines(typed + "\t\x01printf '<%s>\\n' \x05 END\n")

    def end(self):
        self.send("\nexit\n")
        os.close(self.terminal)
        os.waitpid(self.pid, 0)


def try_shell(name, arguments, setup):
    path = shutil.which(name)
    if path is None:
        print(f"{name} is not installed: not tried")
        return
    shell = Shell([path, *arguments], setup)
    for typed, wanted in [
            ("cimdhcp sho", ["cimdhcp", "show"]),
            ("cimdhcp show --format=ts", ["cimdhcp", "show", "--format=tsv"]),
            ("cimdhcp names QVXZR_DHCPS", ["cimdhcp", "names", "QVXZR_DHCPSettingData"]),
            ("cimdhcp show --columns dhcp,sta", ["cimdhcp", "show", "--columns", "dhcp,state"]),
            ("cimdhcp rename wl", ["cimdhcp", "rename", "wlan0"]),
            ("cimdhcp get 'QVXZR_DHCPSettingData.InstanceID=\"Computer%w",
             ["cimdhcp", "get", paths[1]]),
            (f"cimdhcp --tree {tree[:-3]}", ["cimdhcp", "--tree", tree]),
            (f"cimdhcp --tree={tree[:-3]}", ["cimdhcp", "--tree=" + tree])]:
        found = shell.completed(typed)
        report(found == wanted, f"{name}: {typed}", f"gives {found}, not {wanted}")
    shell.end()


with tempfile.TemporaryDirectory() as home:
    shutil.copy(completions + "/cimdhcp.zsh", home + "/_cimdhcp")
    try_shell("bash", ["--norc", "--noprofile", "-i"], [f"source {completions}/cimdhcp.bash"])
    try_shell("zsh", ["-f", "-i"],
              ["bindkey -e; PS1='READY>'; fpath=(~ $fpath)", "autoload -U compinit; compinit -u -D"])
    try_shell("fish", ["--no-config", "-i"],
              ["function fish_prompt; echo 'READY>'; end", f"source {completions}/cimdhcp.fish"])
sys.exit(1 if failures else 0)
