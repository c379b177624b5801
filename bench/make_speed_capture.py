#!/usr/bin/env python3
"""Writes a capture for measuring rnsap-decode -r:

    make_speed_capture.py FRAMES OUT.pcap [INCOMPLETE]

FRAMES frames over Ethernet, IPv4, SCTP and M3UA, in rounds of twelve: an
SCCP connection both ways (CR and CC with data, a message over two DT1s, a
DT1 back, RLSD, RLC) and connectionless messages (UDT, XUDT, LUDT, an XUDT
in two segments): eight RNSAP messages a round. INCOMPLETE more frames
follow, each the first part of something the capture never completes, in
turn an SCTP fragment, an IPv4 fragment and an XUDT segment.
"""
import os
import struct
import sys

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', 'scripts', 'captures'))
from sccp_messages import cc, cr, data_chunk, dt1, ludt, m3ua, pieces, read_samples, rlc, rlsd, segmentation, udt, xudt

SAMPLE = read_samples()
ETHERNET = bytes.fromhex('020000000002 020000000001 0800')
ADDRESSES = {True: bytes([10, 0, 0, 1, 10, 0, 0, 2]), False: bytes([10, 0, 0, 2, 10, 0, 0, 1])}
TAGS = {True: 0x11111111, False: 0x22222222}


def frame(chunk, forward=True, ident=0, more_fragments=False):
    sctp = struct.pack('!HHII', 2905, 2905, TAGS[forward], 0) + chunk
    flags = 0x2000 if more_fragments else 0
    ip = struct.pack('!BBHHHBBH', 0x45, 0, 20 + len(sctp), ident & 0xFFFF, flags, 64, 132, 0)
    return ETHERNET + ip + ADDRESSES[forward] + sctp


class Writer:
    def __init__(self, out):
        self.out = out
        self.count = 0
        self.tsn = {True: 1, False: 1}
        out.write(struct.pack('<IHHiIII', 0xA1B2C3D4, 2, 4, 0, 0, 65535, 1))

    def write(self, octets):
        self.out.write(struct.pack('<IIII', 1700000000 + self.count // 1000, self.count % 1000 * 1000,
                                   len(octets), len(octets)) + octets)
        self.count += 1

    def message(self, sccp, forward=True):
        codes = {} if forward else dict(opc=1002, dpc=1001)
        self.write(frame(data_chunk(self.tsn[forward], m3ua(sccp, **codes)), forward))
        self.tsn[forward] += 1


def write_round(writer, index):
    calling, called = (2 * index) % 0xFFFFFF + 1, (2 * index + 1) % 0xFFFFFF + 1
    first, second = pieces(SAMPLE[8], 2)
    front, back = pieces(SAMPLE[9], 2)
    sample = SAMPLE[index % len(SAMPLE)]
    for sccp, forward in [(cr(calling, SAMPLE[0]), True), (cc(calling, called, SAMPLE[2]), False),
                          (dt1(called, first, more=True), True), (dt1(called, second), True),
                          (dt1(calling, SAMPLE[1]), False), (rlsd(called, calling), True),
                          (rlc(calling, called), False), (udt(sample), True), (xudt(sample), True),
                          (ludt(sample), True), (xudt(front, segmentation(True, 1, calling)), True),
                          (xudt(back, segmentation(False, 0, calling)), True)]:
        writer.message(sccp, forward)


def write_incomplete(writer, index):
    kind = index % 3
    if kind == 0:
        writer.write(frame(data_chunk(1 << 30 | index, m3ua(udt(SAMPLE[0])), flags=0x02, sequence=index & 0xFFFF)))
    elif kind == 1:
        writer.write(frame(data_chunk(1, m3ua(udt(SAMPLE[0]))), ident=index, more_fragments=True))
    else:
        writer.message(xudt(SAMPLE[0], segmentation(True, 1, index)))


def main():
    frames, path = int(sys.argv[1]), sys.argv[2]
    incomplete = int(sys.argv[3]) if len(sys.argv) > 3 else 0
    with open(path, 'wb') as out:
        writer = Writer(out)
        for index in range(frames // 12):
            write_round(writer, index)
        for index in range(incomplete):
            write_incomplete(writer, index)


if __name__ == '__main__':
    main()
