#!/usr/bin/env python3
"""Attacks a server from loopback addresses while a good client from another measures its latency.

Usage: siege.py [--short] [--memory MIB] [--latency MS] [--only NAME] PROGRAM

PROGRAM is cimdhcp, which is started as "serve" with users, without and with TLS. Each attack has
its time and its number of connections, and they come one after the other; what they show is
printed as a table. The exit status is 1 when the good client was refused anything, when the
server took more than MIB of memory, or when a response took longer than MS.
--short takes few connections and seconds.
"""
import argparse
import base64
import errno
import multiprocessing
import os
import random
import re
import resource
import select
import socket
import ssl
import subprocess
import sys
import tempfile
import time

ATTACKER = "127.0.0.2"
FRIEND = "127.0.0.1"
# So that the attacker leaves the machine, which both share, some of its time.
ACTIONS_PER_SECOND = 400
SOCKETS = 4096


def call(method, parameters):
    return (
        '<?xml version="1.0" encoding="utf-8"?><CIM CIMVERSION="2.0" DTDVERSION="2.0">'
        '<MESSAGE ID="1" PROTOCOLVERSION="1.0"><SIMPLEREQ><IMETHODCALL NAME="%s">'
        '<LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="interop"/>'
        "</LOCALNAMESPACEPATH>%s</IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>" % (method, parameters)
    ).encode()


def value(name, text):
    return '<IPARAMVALUE NAME="%s"><VALUE>%s</VALUE></IPARAMVALUE>' % (name, text)


NAMESPACES = '<IPARAMVALUE NAME="ClassName"><CLASSNAME NAME="CIM_Namespace"/></IPARAMVALUE>'
NAMES = call("EnumerateInstanceNames", NAMESPACES)
OPEN = call("OpenEnumerateInstancePaths", NAMESPACES + value("OperationTimeout", "600"))
MEBI = 1 << 20


def head(method, length, user, password):
    credentials = base64.b64encode(("%s:%s" % (user, password)).encode()).decode()
    return (
        "POST /cimom HTTP/1.1\r\nHost: localhost\r\nContent-Type: application/xml\r\n"
        "CIMOperation: MethodCall\r\nCIMMethod: %s\r\nCIMObject: root%%2Finterop\r\n"
        "Content-Length: %d\r\nAuthorization: Basic %s\r\n\r\n"
        % (method, length, credentials)
    ).encode()


def request(method, body, user, password="secret"):
    return head(method, len(body), user, password) + body


def client_context():
    context = ssl.SSLContext(ssl.PROTOCOL_TLS_CLIENT)
    context.check_hostname = False
    context.verify_mode = ssl.CERT_NONE
    return context


# ---------------------------------------------------------------- the attacker


class Attack:
    """What each of the attacker's connections does."""

    def __init__(self, name, tls=False, send=b"", repeat=False, leave=None, connections=2000):
        self.name = name
        self.tls = tls
        self.send = send  # at first, and after a response
        self.repeat = repeat  # send again after a response
        self.leave = leave  # "sent": leave when all is sent; "heard": when anything comes
        self.connections = connections


PARTIAL = request("EnumerateInstanceNames", NAMES, "eve", "wrong")
LONG = head("EnumerateInstanceNames", MEBI, "eve", "wrong") + b" " * (MEBI - 1)
OWN_LONG = head("EnumerateInstanceNames", MEBI, "eve", "secret") + b" " * (MEBI - 1)
ELEMENTS = request("EnumerateInstanceNames", b"<A>" + b"<A/>" * (MEBI // 4 - 8) + b"</A>", "eve")
ATTACKS = [
    Attack("silent"),
    Attack("silent, TLS port"),
    Attack("heads without an end", send=PARTIAL[:60]),
    Attack("wrong passwords", send=PARTIAL, repeat=True),
    Attack("wrong passwords, TLS", tls=True, send=PARTIAL, repeat=True),
    Attack("handshakes broken off", tls=True, leave="heard"),
    Attack("requests broken off", send=PARTIAL[:-20], leave="sent"),
    Attack("bodies without an end, wrong password", send=LONG, connections=495),
    Attack("bodies without an end, right password", send=OWN_LONG, connections=495),
    Attack("1 MiB of small elements, right password", send=ELEMENTS, repeat=True, connections=300),
    Attack("enumerations that are not pulled", repeat=True, connections=80,
           send=request("OpenEnumerateInstancePaths", OPEN, "eve")),
]


class Connection:
    def __init__(self, attack, port, context):
        self.attack = attack
        self.rest = attack.send
        self.ready = not attack.tls
        self.socket = socket.socket()
        self.socket.setblocking(False)
        self.socket.bind((ATTACKER, 0))
        try:
            self.socket.connect(("127.0.0.1", port))
        except BlockingIOError:
            pass
        if attack.tls:
            self.socket = context.wrap_socket(self.socket, do_handshake_on_connect=False)
        self.number = self.socket.fileno()

    def step(self, events):
        """Does what can be done; False when the connection is over."""
        try:
            if events & (select.EPOLLERR | select.EPOLLHUP):
                return False
            if not self.ready:
                if self.attack.leave == "heard" and events & select.EPOLLIN:
                    return False
                self.socket.do_handshake()
                self.ready = True
            while self.rest:
                self.rest = self.rest[self.socket.send(self.rest[:262144]):]
            if self.attack.leave == "sent":
                return False
            while True:
                heard = self.socket.recv(65536)
                if not heard:
                    return False
                if self.attack.repeat and heard.startswith(b"HTTP/1.1"):
                    self.rest = self.attack.send
        except (BlockingIOError, ssl.SSLWantReadError, ssl.SSLWantWriteError):
            return True
        except OSError:
            return False


def besiege(attack, port, connections, stop):
    context = client_context()
    poll = select.epoll()
    opened = {}
    allowance = 0.0
    last = time.monotonic()
    while not stop.is_set():
        now = time.monotonic()
        allowance = min(allowance + (now - last) * ACTIONS_PER_SECOND, connections)
        last = now
        while allowance >= 1 and len(opened) < connections:
            allowance -= 1
            try:
                made = Connection(attack, port, context)
            except OSError:
                continue
            opened[made.number] = made
            poll.register(made.number,
                          select.EPOLLIN | select.EPOLLOUT | select.EPOLLRDHUP | select.EPOLLET)
        for number, events in poll.poll(0.01):
            if not opened[number].step(events):
                opened.pop(number).socket.close()
        for number, made in random.sample(sorted(opened.items()), min(4, len(opened))):
            # Those that got a response go on.
            if made.rest and not made.step(0):
                opened.pop(number).socket.close()


# ---------------------------------------------------------------- the server and its friend


class Server:
    def __init__(self, program, directory, tls):
        command = [program, "serve", "--listen", "127.0.0.1:0", "--users", directory + "/users"]
        if tls:
            command += ["--tls-cert", directory + "/cert.pem", "--tls-key", directory + "/key.pem"]
        environment = dict(os.environ, STATE_DIRECTORY=directory)
        self.process = subprocess.Popen(command, stdout=subprocess.PIPE, env=environment)
        line = self.process.stdout.readline().decode()
        self.port = int(re.search(r":(\d+)/", line).group(1))
        self.tls = tls

    def memory(self, name):
        with open("/proc/%d/status" % self.process.pid, encoding="ascii") as status:
            return int(re.search(name + r":\s*(\d+) kB", status.read()).group(1)) / 1024

    def forget_peak(self):
        with open("/proc/%d/clear_refs" % self.process.pid, "w", encoding="ascii") as refs:
            refs.write("5")

    def end(self):
        self.process.terminate()
        self.process.wait()


class Friend:
    """A good client; every other request comes over a new connection."""

    def __init__(self, server, context):
        self.server = server
        self.context = context
        self.kept = None
        self.times = []
        self.failures = []
        self.count = 0

    def connect(self):
        made = socket.create_connection(("127.0.0.1", self.server.port), 20, (FRIEND, 0))
        return self.context.wrap_socket(made) if self.server.tls else made

    def respond(self, connection, text):
        connection.sendall(text)
        got = b""
        while b"\r\n\r\n" not in got:
            piece = connection.recv(65536)
            if not piece:
                raise OSError(errno.ECONNRESET, "closed without a response")
            got += piece
        got, _, body = got.partition(b"\r\n\r\n")
        length = int(re.search(rb"Content-Length: (\d+)", got).group(1))
        while len(body) < length:
            body += connection.recv(65536)
        if not got.startswith(b"HTTP/1.1 200") or b"<ERROR" in body:
            raise OSError(errno.EPROTO, (got.split(b"\r\n")[0] + b" " + body[-300:]).decode())
        return body

    def ask(self, user="ada"):
        """One request; the seconds it took."""
        start = time.monotonic()
        try:
            self.count += 1
            if user != "ada" or self.count % 3 == 0:
                with self.connect() as connection:
                    self.respond(connection, request("EnumerateInstanceNames", NAMES, user))
                return time.monotonic() - start
            if self.kept is None:
                self.kept = self.connect()
            if self.count % 3 == 1:
                self.respond(self.kept, request("EnumerateInstanceNames", NAMES, user))
                return time.monotonic() - start
            body = self.respond(self.kept, request("OpenEnumerateInstancePaths", OPEN, user))
            took = time.monotonic() - start
            opened = re.search(rb'EnumerationContext"[^>]*><VALUE>(\w+)', body).group(1).decode()
            self.respond(self.kept, request("CloseEnumeration", call(
                "CloseEnumeration", value("EnumerationContext", opened)), user))
            return took
        except OSError as error:
            self.failures.append(str(error))
            self.kept = None
            return time.monotonic() - start

    def watch(self, seconds):
        end = time.monotonic() + seconds
        while time.monotonic() < end:
            self.times.append(self.ask())
            time.sleep(0.02)


def close_wait(port):
    with open("/proc/net/tcp", encoding="ascii") as table:
        rows = [line.split() for line in table]
    return sum(1 for row in rows if row[1].endswith(":%04X" % port) and row[3] == "08")


def run(attack, server, newcomer, seconds, connections):
    friend = Friend(server, client_context())
    friend.ask()
    server.forget_peak()
    stop = multiprocessing.Event()
    attacker = multiprocessing.Process(target=besiege,
                                       args=(attack, server.port, connections, stop))
    attacker.start()
    friend.watch(seconds / 2)
    first = friend.ask(newcomer)
    friend.watch(seconds / 2)
    stop.set()
    attacker.join()
    after = friend.ask()
    # The server looks for those who have gone ten times a second.
    end = time.monotonic() + 20
    while close_wait(server.port) > 0 and time.monotonic() < end:
        time.sleep(0.05)
    left = close_wait(server.port)
    if left > 0:
        friend.failures.append("%d connections stay in CLOSE-WAIT" % left)
    times = sorted(friend.times + [after])
    return {
        "requests": len(times),
        "median": times[len(times) // 2],
        "late": times[len(times) * 99 // 100],
        "most": times[-1],
        "first": first,
        "peak": server.memory("VmHWM"),
        "rest": server.memory("VmRSS"),
        "failures": friend.failures,
    }


def prepare(program, directory, users):
    # A key that costs as little as a client's patience: the handshakes are not measured here.
    subprocess.run(
        ["openssl", "req", "-x509", "-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:P-256",
         "-nodes", "-keyout", directory + "/key.pem", "-out", directory + "/cert.pem", "-days", "2",
         "-subj", "/CN=localhost"], check=True, stderr=subprocess.DEVNULL)
    os.chmod(directory + "/key.pem", 0o600)
    for user in users:
        subprocess.run([program, "user", "add", "--users", directory + "/users", user],
                       input=b"secret\n", check=True, stdout=subprocess.DEVNULL)


def main():
    options = argparse.ArgumentParser(description="Attacks a server, and measures it.")
    options.add_argument("program")
    options.add_argument("--short", action="store_true")
    options.add_argument("--memory", type=float)
    options.add_argument("--latency", type=float)
    options.add_argument("--only", default="")
    given = options.parse_args()
    _, most = resource.getrlimit(resource.RLIMIT_NOFILE)
    resource.setrlimit(resource.RLIMIT_NOFILE, (min(SOCKETS, most), most))
    seconds = 0.4 if given.short else 10
    ok = True
    attacks = [attack for attack in ATTACKS if given.only in attack.name]
    with tempfile.TemporaryDirectory() as directory:
        prepare(given.program, directory,
                ["ada", "eve"] + ["new%d" % number for number in range(len(attacks))])
        print("| attack | connections | requests | median | 99 % | most | new user | memory: most, "
              "then |\n|---|---|---|---|---|---|---|---|")
        for number, attack in enumerate(attacks):
            server = Server(given.program, directory, "TLS" in attack.name or attack.tls)
            connections = min(200, attack.connections) if given.short else attack.connections
            try:
                result = run(attack, server, "new%d" % number, seconds, connections)
            finally:
                server.end()
            print("| %s | %d | %d | %.1f ms | %.1f ms | %.1f ms | %.1f ms | %.0f MiB, %.0f MiB |" % (
                attack.name, connections, result["requests"], result["median"] * 1000,
                result["late"] * 1000, result["most"] * 1000, result["first"] * 1000,
                result["peak"], result["rest"]), flush=True)
            for failure in result["failures"][:5]:
                print("FAILED: %s" % failure, file=sys.stderr)
            ok = ok and not result["failures"]
            if given.memory is not None and result["peak"] > given.memory:
                print("FAILED: %.0f MiB of memory" % result["peak"], file=sys.stderr)
                ok = False
            if given.latency is not None and result["most"] * 1000 > given.latency:
                print("FAILED: %.0f ms" % (result["most"] * 1000), file=sys.stderr)
                ok = False
    return 0 if ok else 1


if __name__ == "__main__":
    sys.exit(main())
