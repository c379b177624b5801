// Test support: pcap and pcapng captures for the capture reader of
// rnsap-decode, each frame written from a description of its layers.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace rnsap::testing {

using Octets = std::vector<uint8_t>;

struct Frame {
  Octets octets;
  uint32_t wireLength = 0;  // on the wire, if more than captured
};

// A frame described by words, outermost layer first, each layer wrapping
// what follows it: "eth ipv4 sctp data/tsn=2 m3ua udt #0". Options follow a
// layer's name after slashes, numbers in C notation (0x for hex):
//   #N                  sample message N;  HEX  the octets themselves, ':' between
//                       them allowed
//   udt, xudt, ludt     SCCP to ssn=N (143); gt: by point code and global title
//   m3ua, mtp3          service indicator si=N (3);  mtp2
//   data                SCTP DATA chunk: tsn=N (1), stream=N (1), seq=N (0),
//                       ppi=N (3), first, middle or last (else whole)
//   sctp                all that follows as chunks; sport=N, dport=N (2905),
//                       tag=N, the verification tag (0x01020304)
//   udt, xudt, ludt     with rest=N the Segmentation parameter: N segments to
//                       come, first, reference ref=N (7)
//   cr (ssn=N, src=N), cc (dst=N, src=N), rlsd, rlc, dt1 (dst=N, more): SCCP
//                       connection-oriented, what follows as their data
//   m3ua                opc=N (1001), dpc=N (1002)
//   ipv4 (src=N, dst=N), ipv6 (src=N); with frag=N/of=M (id=N) the Nth of M fragments
//   eth, sll, sll2, null (type=N, else by the IP version)
//   part/n=N/of=M       the Nth of M pieces of what follows
//   set/at=N/to=HEX     what follows with octets overwritten at offset N
//   cut/by=N            the frame captured N octets short of its length
// A layer with nothing behind it wraps nothing (an MTP2 FISU).
Frame DescribedFrame(std::string_view description, const std::vector<Octets>& samples);

// A capture of format "pcap", "pcapns" (nanosecond stamps) or "pcapng" and
// link type null, ethernet, raw, sll, sll2, mtp2, mtp3 or ieee802_11. Frame i
// (from 0) is stamped 1700000000 + i seconds and i milliseconds, and with
// nanosecond stamps i nanoseconds more.
std::string Capture(std::string_view format, std::string_view linkType,
                    const std::vector<Frame>& frames);

// The capture shipped in samples/, of the sample messages.
std::string SampleCapture(const std::vector<Octets>& samples);

// A capture of `frames` frames of the sample messages in turn, over SCTP on
// IPv4 and IPv6 in UDT, XUDT and LUDT, each frame a message but every
// thousandth, which is cut short.
std::string CorpusCapture(const std::vector<Octets>& samples, size_t frames);

// The messages of a hex file such as samples/messages.hex; none if it cannot
// be read or has a bad line.
std::vector<Octets> HexMessages(const std::string& path);

}  // namespace rnsap::testing
