#!/usr/bin/python3
"""Writes the golden captures of tests/captures with text2pcap, mergecap and
scapy, from the messages of samples/messages.hex: run it to write them again
(it needs the Debian packages wireshark-common, for text2pcap and mergecap,
and python3-scapy).

M3UA and SCCP are built byte by byte in sccp_messages.py; text2pcap and scapy
write everything around them: Ethernet, IP and its fragments, SCTP and its
checksum, the capture files. What each capture must decode, frame by frame,
is in its .expect file, read by cli_samples_test.
"""
import os
import subprocess
from decimal import Decimal

from scapy.layers.inet import IP, fragment
from scapy.layers.inet6 import IPv6, IPv6ExtHdrFragment, fragment6
from scapy.layers.l2 import Ether, Loopback
from scapy.layers.sctp import SCTP, SCTPChunkData
from scapy.utils import PcapNgWriter, PcapWriter

from sccp_messages import cc, cr, data_chunk, dt1, ludt, m3ua, pieces, read_samples, rlc, rlsd, segmentation, udt, xudt

HERE = os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', '..', 'tests', 'captures')
START = Decimal(1700000000)  # 2023-11-14 22:13:20 UTC
SAMPLE = read_samples()

# -------------------------------------------------------------- text2pcap


def text2pcap(name, packets, options):
    """Packets as (direction I or O, seconds after START, chunks) through text2pcap."""
    dump = ''
    for direction, seconds, chunks in packets:
        stamp = START + Decimal(seconds)
        clock = '2023-11-14 22:13:%02d.%s' % (20 + int(stamp - START), str(stamp).split('.')[1])
        dump += '%s %s\n000000 %s\n\n' % (direction, clock, chunks.hex(' '))
    subprocess.run(['text2pcap', '-q', '-D', '-t', '%Y-%m-%d %H:%M:%S.%f'] + options +
                   ['-', os.path.join(HERE, name)], input=dump, text=True, check=True, env={'TZ': 'UTC'})


def write_connection():
    """Connection-oriented SCCP both ways: data in CR and CC, a message over three DT1s, release."""
    inbound, outbound = 0x000105, 0x000209
    backward = dict(opc=1002, dpc=1001)
    split = pieces(SAMPLE[8], 3)
    sccp = [('I', cr(inbound, SAMPLE[0]), {}), ('O', cc(inbound, outbound, SAMPLE[2]), backward)]
    sccp += [('I', dt1(outbound, part, more=index < 2), {}) for index, part in enumerate(split)]
    sccp += [('O', dt1(inbound, SAMPLE[1]), backward), ('I', rlsd(outbound, inbound), {}),
             ('O', rlc(inbound, outbound), backward)]
    tsn = {'I': 100, 'O': 500}
    packets = []
    for index, (direction, message, codes) in enumerate(sccp):
        packets.append((direction, '%d.000000%03d' % (index, index), data_chunk(tsn[direction], m3ua(message, **codes))))
        tsn[direction] += 1
    text2pcap('connection.pcapng', packets, ['-4', '10.1.0.1,10.1.0.2', '-s', '2905,2905,77'])


def write_segments():
    """XUDT and LUDT with the Segmentation parameter, LUDT whole, over IPv6 in a microsecond pcap."""
    first, second = pieces(SAMPLE[9], 2)
    messages = [xudt(first, segmentation(True, 1, 0x0A0B0C)), udt(SAMPLE[3]),
                xudt(second, segmentation(False, 0, 0x0A0B0C)), ludt(SAMPLE[47])]
    messages += [ludt(part, segmentation(index == 0, 2 - index, 0x000777)) for index, part in enumerate(pieces(SAMPLE[30], 3))]
    packets = [('I', '%d.%06d' % (index, index), data_chunk(7 + index, m3ua(message)))
               for index, message in enumerate(messages)]
    text2pcap('segments.pcap', packets, ['-F', 'pcap', '-6', 'fd00::1,fd00::2', '-s', '2906,2905,78'])


# ------------------------------------------------------------------ scapy


def stamped(packets, step=Decimal(1)):
    for index, packet in enumerate(packets):
        packet.time = START + index * step
    return packets


def ether():
    return Ether(src='02:00:00:00:00:01', dst='02:00:00:00:00:02')


def association(tag=0x5A5A):
    return SCTP(sport=2905, dport=2905, tag=tag)


def chunk(tsn, message, beginning=1, ending=1):
    return SCTPChunkData(tsn=tsn, stream_id=1, stream_seq=0, proto_id=3, beginning=beginning,
                         ending=ending, data=m3ua(message))


def write_ipv4_reversed():
    """A datagram in four IPv4 fragments written last to first, then one whole."""
    addresses = IP(src='10.2.0.1', dst='10.2.0.2', id=0x4321)
    fragments = fragment(ether() / addresses / association() / chunk(1, udt(SAMPLE[8])), fragsize=40)
    whole = ether() / IP(src='10.2.0.1', dst='10.2.0.2') / association() / chunk(2, udt(SAMPLE[5]))
    PcapWriter(os.path.join(HERE, 'ipv4_reversed.pcap')).write(stamped(fragments[::-1] + [whole]))


def write_ipv6_fragments():
    """IPv6 Fragment headers: a datagram in three fragments out of order, in a pcapng."""
    datagram = IPv6(src='fd00::1', dst='fd00::2') / IPv6ExtHdrFragment(id=0x99) / association() / chunk(
        1, xudt(SAMPLE[9]))
    fragments = [ether() / part for part in fragment6(datagram, 104)]
    writer = PcapNgWriter(os.path.join(HERE, 'ipv6_fragments.pcapng'))
    writer.write(stamped([fragments[1], fragments[0], fragments[2]]))
    writer.close()


def write_multihomed():
    """One association over two address pairs: a message in three SCTP fragments
    over both, a DATA chunk sent again over the other pair, decoded once."""
    paths = [IP(src='10.3.0.1', dst='10.3.1.1'), IP(src='10.3.0.2', dst='10.3.1.2')]
    message = m3ua(udt(SAMPLE[8]))
    parts = pieces(message, 3)
    flags = [(1, 0), (0, 0), (0, 1)]
    packets = []
    for index, part in enumerate(parts):
        data = SCTPChunkData(tsn=40 + index, stream_id=1, stream_seq=3, proto_id=3,
                             beginning=flags[index][0], ending=flags[index][1], data=part)
        packets.append(ether() / paths[index % 2] / association() / data)
    packets += [ether() / paths[0] / association() / chunk(43, udt(SAMPLE[4])),
                ether() / paths[1] / association() / chunk(43, udt(SAMPLE[4])),
                ether() / paths[1] / association() / chunk(44, udt(SAMPLE[6]))]
    PcapWriter(os.path.join(HERE, 'multihomed.pcap')).write(stamped(packets))


def write_loopback_nanoseconds():
    """BSD loopback (link type 0) in a nanosecond pcap, IPv4 and IPv6."""
    packets = [Loopback(type=2) / IP(src='127.0.0.1', dst='127.0.0.1') / association() / chunk(1, udt(SAMPLE[10])),
               Loopback(type=24) / IPv6(src='::1', dst='::1') / association(6) / chunk(1, udt(SAMPLE[11]))]
    PcapWriter(os.path.join(HERE, 'loopback_nanoseconds.pcap'), linktype=0, nano=True).write(
        stamped(packets, Decimal('1.000000007')))


def write_mid_call():
    """A capture that starts mid-call, in a pcapng: a DT1 before its relation is known
    to carry RNSAP, a UDT that makes it known, then DT1s of a connection whose CR is missing."""
    split = pieces(SAMPLE[12], 2)
    messages = [dt1(0x000303, SAMPLE[13]), udt(SAMPLE[14]), dt1(0x000303, split[0], more=True),
                dt1(0x000303, split[1]), dt1(0x000404, SAMPLE[15])]
    packets = [ether() / IP(src='10.4.0.1', dst='10.4.0.2') / association() / chunk(60 + index, message)
               for index, message in enumerate(messages)]
    writer = PcapNgWriter(os.path.join(HERE, 'mid_call.pcapng'))
    writer.write(stamped(packets))
    writer.close()


def write_mixed_link_types():
    """A pcapng of two interfaces, BSD loopback and Ethernet, merged by mergecap."""
    subprocess.run(['mergecap', '-F', 'pcapng', '-w', os.path.join(HERE, 'mixed_link_types.pcapng'),
                    os.path.join(HERE, 'loopback_nanoseconds.pcap'), os.path.join(HERE, 'ipv4_reversed.pcap')],
                   check=True)


if __name__ == '__main__':
    write_connection()
    write_segments()
    write_ipv4_reversed()
    write_ipv6_fragments()
    write_multihomed()
    write_loopback_nanoseconds()
    write_mid_call()
    write_mixed_link_types()
