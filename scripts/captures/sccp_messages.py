"""SCCP (ITU Q.713) and M3UA messages built byte by byte, with the SCTP DATA
chunk that carries them, for the golden captures and the speed capture."""
import os

SAMPLES = os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', '..', 'samples', 'messages.hex')
RNSAP_SSN = 143


def read_samples():
    with open(SAMPLES) as lines:
        return [bytes.fromhex(line) for line in lines if line.strip() and not line.startswith('#')]


def party(ssn, point_code=None):
    """A called or calling party address: routed on SSN, with a point code if given."""
    if point_code is None:
        return bytes([0x42, ssn])
    return bytes([0x43]) + point_code.to_bytes(2, 'little') + bytes([ssn])


def variable(octets):
    return bytes([len(octets)]) + octets


def reference(value):
    return value.to_bytes(3, 'big')


def udt(data, ssn=RNSAP_SSN):
    called, calling = variable(party(ssn)), variable(party(ssn, 1001))
    return bytes([0x09, 0x00, 3, 2 + len(called), 1 + len(called) + len(calling)]) + called + calling + variable(data)


def segmentation(first, remaining, ref):
    return bytes([0x10, 4, (0x80 if first else 0) | remaining]) + reference(ref) + b'\x00'


def xudt(data, segment=None, ssn=RNSAP_SSN):
    called, calling = variable(party(ssn)), variable(party(ssn, 1001))
    body = called + calling + variable(data)
    optional = 4 + len(body) - 3 if segment else 0
    pointers = bytes([4, 3 + len(called), 2 + len(called) + len(calling), optional])
    return bytes([0x11, 0x00, 15]) + pointers + body + (segment or b'')


def ludt(data, segment=None, ssn=RNSAP_SSN):
    """Two-octet pointers, least significant first, each counting from its second octet."""
    called, calling = variable(party(ssn)), variable(party(ssn, 1001))
    long_data = len(data).to_bytes(2, 'little') + data
    starts = [11, 11 + len(called), 11 + len(called) + len(calling)]
    starts.append(starts[2] + len(long_data) if segment else None)
    pointers = b''.join((start - (4 + 2 * index)).to_bytes(2, 'little') if start else b'\x00\x00'
                        for index, start in enumerate(starts))
    return bytes([0x13, 0x00, 15]) + pointers + called + calling + long_data + (segment or b'')


def cr(source, data, ssn=RNSAP_SSN):
    called = variable(party(ssn))
    optional = bytes([0x0F]) + variable(data) + b'\x00'
    return bytes([0x01]) + reference(source) + bytes([0x02, 2, 1 + len(called)]) + called + optional


def cc(destination, source, data):
    optional = bytes([0x0F]) + variable(data) + b'\x00'
    return bytes([0x02]) + reference(destination) + reference(source) + bytes([0x02, 1]) + optional


def dt1(destination, data, more=False):
    return bytes([0x06]) + reference(destination) + bytes([1 if more else 0, 1]) + variable(data)


def rlsd(destination, source):
    return bytes([0x04]) + reference(destination) + reference(source) + bytes([0x03, 0])


def rlc(destination, source):
    return bytes([0x05]) + reference(destination) + reference(source)


def m3ua(sccp, opc=1001, dpc=1002):
    """An M3UA DATA message: its Protocol Data parameter carries the SCCP message."""
    protocol_data = opc.to_bytes(4, 'big') + dpc.to_bytes(4, 'big') + bytes([3, 2, 0, 5]) + sccp
    parameter = (0x0210).to_bytes(2, 'big') + (4 + len(protocol_data)).to_bytes(2, 'big') + protocol_data
    parameter += bytes(-len(parameter) % 4)
    return bytes([1, 0, 1, 1]) + (8 + len(parameter)).to_bytes(4, 'big') + parameter


def pieces(octets, count):
    size = -(-len(octets) // count)
    return [octets[at:at + size] for at in range(0, len(octets), size)]


def data_chunk(tsn, payload, flags=0x03, stream=1, sequence=0):
    """An SCTP DATA chunk of M3UA (payload protocol 3), padded to 4 octets."""
    header = bytes([0, flags]) + (16 + len(payload)).to_bytes(2, 'big') + tsn.to_bytes(4, 'big')
    chunk = header + stream.to_bytes(2, 'big') + sequence.to_bytes(2, 'big') + (3).to_bytes(4, 'big')
    return chunk + payload + bytes(-len(payload) % 4)
