"""A DHCPv6 server (RFC 8415) whose leases soon end: dnsmasq and its like lease for two minutes
at the least.

Usage: dhcp6-short-server.py LINK ADDRESS SECONDS
It gives the one address to whoever asks on the link. Ends when it is killed.
"""

import socket
import struct
import sys

SERVER_PORT = 547
ALL_AGENTS_AND_SERVERS = "ff02::1:2"

# Messages
SOLICIT, ADVERTISE, REQUEST, CONFIRM, RENEW, REBIND, REPLY, RELEASE, DECLINE = range(1, 10)
# Options
CLIENT_ID, SERVER_ID, IA_NA, IA_ADDRESS, STATUS = 1, 2, 3, 5, 13


def option(code, payload):
    return struct.pack("!HH", code, len(payload)) + payload


def options_in(payload):
    while len(payload) >= 4:
        code, size = struct.unpack("!HH", payload[:4])
        yield code, payload[4 : 4 + size]
        payload = payload[4 + size :]


def association(identity, address, seconds):
    leased = option(
        IA_ADDRESS,
        socket.inet_pton(socket.AF_INET6, address) + struct.pack("!II", seconds, seconds),
    )
    return option(
        IA_NA, identity + struct.pack("!II", seconds // 2, seconds * 4 // 5) + leased
    )


def response(message, server_id, address, seconds):
    """What goes back; nothing where the message asks for nothing that is given here."""
    kind, transaction = message[0], message[1:4]
    asked = dict(options_in(message[4:]))
    if asked.get(SERVER_ID, server_id) != server_id or CLIENT_ID not in asked:
        return None
    if kind == SOLICIT:
        kind_back = ADVERTISE
    elif kind in (REQUEST, CONFIRM, RENEW, REBIND, RELEASE, DECLINE):
        kind_back = REPLY
    else:
        return None
    found = option(CLIENT_ID, asked[CLIENT_ID]) + option(SERVER_ID, server_id)
    if kind in (SOLICIT, REQUEST, RENEW, REBIND) and IA_NA in asked:
        found += association(asked[IA_NA][:4], address, seconds)
    elif kind in (CONFIRM, RELEASE, DECLINE):
        found += option(STATUS, struct.pack("!H", 0))
    return bytes([kind_back]) + transaction + found


def main():
    link, address, seconds = sys.argv[1], sys.argv[2], int(sys.argv[3])
    # A DUID of the maker's own choice (RFC 8415, section 11.5): type 3, Ethernet.
    server_id = struct.pack("!HH", 3, 1) + bytes.fromhex("020000000001")
    own = socket.socket(socket.AF_INET6, socket.SOCK_DGRAM)
    own.setsockopt(socket.SOL_SOCKET, socket.SO_BINDTODEVICE, link.encode())
    own.bind(("::", SERVER_PORT))
    group = socket.inet_pton(socket.AF_INET6, ALL_AGENTS_AND_SERVERS)
    own.setsockopt(
        socket.IPPROTO_IPV6,
        socket.IPV6_JOIN_GROUP,
        group + struct.pack("@I", socket.if_nametoindex(link)),
    )
    while True:
        message, sender = own.recvfrom(4096)
        back = response(message, server_id, address, seconds) if len(message) >= 4 else None
        if back:
            own.sendto(back, sender)


if __name__ == "__main__":
    main()
