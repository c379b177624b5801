// What rnsap-decode finds in packet captures: each framing of RNSAP, in
// pcap and pcapng files the tests write, with SCTP bundling and
// reassembly, frames to skip and malformed frames.
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "cli/capture_input.h"
#include "tests/cli/capture_writer.h"
#include "tests/support/scratch_path.h"

namespace rnsap::cli {
namespace {

using namespace rnsap::testing;

// Two RNSAP messages: a bare header and an error indication.
const Octets kHeader{0x00, 0x14, 0x40, 0x50, 0x03, 0x00, 0x00, 0x00};
const Octets kErrorIndication{0x00, 0x08, 0x41, 0x10, 0x16, 0x00, 0x00, 0x02, 0x00,
                              0x0B, 0x00, 0x02, 0x01, 0x80, 0x00, 0x14, 0x00, 0x09,
                              0x78, 0x14, 0x00, 0x50, 0x00, 0x40, 0x00, 0x76, 0x01};

Octets Udt(const Octets& message, uint8_t subsystem = 143) {
  return Sccp(Unitdata::kUdt, {subsystem}, message);
}

Octets Part(const Octets& whole, size_t from, size_t to) {
  return {whole.begin() + from, whole.begin() + to};
}

// A whole message, or a fragment, of SCCP data in one DATA chunk.
Octets DataOf(const Octets& m3ua, uint32_t tsn, uint8_t flags = DataChunk::kWhole,
              uint16_t stream = 1) {
  return Chunk({.tsn = tsn, .stream = stream, .flags = flags, .data = m3ua});
}

Frame OverIpv4(const std::vector<Octets>& chunks, uint8_t sourceHost = 1) {
  return {Ethernet(kIpv4, Ipv4(Sctp(chunks), sourceHost))};
}

struct Found {
  uint64_t frame;
  Octets octets;
  bool operator==(const Found&) const = default;
};

struct Case {
  std::string name;
  LinkType linkType;
  std::vector<Frame> frames;
  std::vector<Found> found;
  CaptureCounts counts;
  std::vector<std::string> notes;  // "FRAME: REASON"
  uint64_t heldFragments = 0;
};

struct Read {
  std::vector<Found> found;
  std::vector<std::string> notes;
  CaptureOutcome outcome;
};

Read ReadFile(const std::string& content) {
  const std::string path = ScratchPath("capture_test.cap");
  WriteFile(path, content);
  Read read;
  read.outcome =
      ReadCapture(path, {[&](const CapturedMessage& message) {
                           read.found.push_back({message.frame.number, message.octets});
                         },
                         [&](const CaptureNote& note) {
                           read.notes.push_back(std::to_string(note.frame) + ": " + note.reason);
                         }});
  return read;
}

std::vector<Case> Cases() {
  const Octets m3ua = M3uaData(Udt(kErrorIndication));
  const size_t third = m3ua.size() / 3;
  Octets cutShort = OverIpv4({DataOf(M3uaData(Udt(kHeader)), 1)}).octets;
  cutShort.resize(cutShort.size() - 10);
  Octets zeroPointer = Udt(kHeader);
  zeroPointer[4] = 0;  // the data pointer
  Octets longM3ua = M3uaData(Udt(kHeader));
  longM3ua[7] += 4;
  return {
      {"Ethernet, IPv4, SCTP, M3UA, UDT; ARP and another subsystem skipped",
       kEthernet,
       {OverIpv4({DataOf(M3uaData(Udt(kHeader)), 1)}),
        {Ethernet(kArp, Octets(28, 0))},
        OverIpv4({DataOf(M3uaData(Udt(kHeader, 142)), 2)})},
       {{1, kHeader}},
       {3, 1, 2, 0},
       {}},
      {"Linux cooked capture: M3UA by payload protocol 0 on port 2905 only",
       kLinuxCooked,
       {{LinuxCooked(kIpv4, Ipv4(Sctp({Chunk({.payloadProtocol = 0, .data = m3ua})}, 4000)))},
        {LinuxCooked(kIpv4, Ipv4(Sctp({Chunk({.payloadProtocol = 0, .data = m3ua})}, 1, 2)))}},
       {{1, kErrorIndication}},
       {2, 1, 1, 0},
       {}},
      {"Linux cooked capture v2, IPv6, XUDT with point code and global title",
       kLinuxCookedV2,
       {{LinuxCookedV2(
           kIpv6, Ipv6(Sctp({DataOf(M3uaData(Sccp(Unitdata::kXudt, {143, true}, kErrorIndication)),
                                    1)})))}},
       {{1, kErrorIndication}},
       {1, 1, 0, 0},
       {}},
      {"raw IPv6 and IPv4, LUDT",
       kRawIp,
       {{Ipv6(Sctp({DataOf(M3uaData(Sccp(Unitdata::kLudt, {}, kHeader)), 1)}))},
        {Ipv4(Sctp({DataOf(M3uaData(Sccp(Unitdata::kLudt, {143, true}, kErrorIndication)), 2)}))}},
       {{1, kHeader}, {2, kErrorIndication}},
       {2, 2, 0, 0},
       {}},
      {"chunks bundled in one packet, a non-DATA chunk and another subsystem among them",
       kEthernet,
       {OverIpv4({DataOf(M3uaData(Udt(kHeader)), 1), Octets{3, 0, 0, 4},
                  DataOf(M3uaData(Udt(kHeader, 142)), 2),
                  DataOf(M3uaData(Udt(kErrorIndication)), 3)})},
       {{1, kHeader}, {1, kErrorIndication}},
       {1, 2, 0, 0},
       {}},
      {"fragments out of order, put together by TSN in the frame that completes them",
       kEthernet,
       {OverIpv4({DataOf(Part(m3ua, 2 * third, m3ua.size()), 12, DataChunk::kLast)}),
        OverIpv4({DataOf(Part(m3ua, 0, third), 10, DataChunk::kFirst)}),
        OverIpv4({DataOf(M3uaData(Udt(kHeader)), 5, DataChunk::kWhole, 2)}),
        OverIpv4({DataOf(Part(m3ua, 0, third), 10, DataChunk::kFirst)}, 9),  // other sender
        OverIpv4({DataOf(Part(m3ua, third, 2 * third), 11, DataChunk::kMiddle)})},
       {{3, kHeader}, {5, kErrorIndication}},
       {5, 2, 0, 0},
       {},
       1},
      {"MTP2: FISU and ISUP skipped",
       kMtp2,
       {{Mtp2({})}, {Mtp2(Mtp3(Udt(kErrorIndication)))}, {Mtp2(Mtp3(Octets(12, 0), 5))}},
       {{2, kErrorIndication}},
       {3, 1, 2, 0},
       {}},
      {"MTP3",
       kMtp3,
       {{Mtp3(Udt(kHeader, 142))}, {Mtp3(Sccp(Unitdata::kXudt, {143, true}, kHeader))}},
       {{2, kHeader}},
       {2, 1, 1, 0},
       {}},
      {"malformed frames are noted and the rest decodes",
       kEthernet,
       {{cutShort, 200},
        OverIpv4({Octets{0, 3, 0, 2}}),
        OverIpv4({DataOf(longM3ua, 3)}),
        OverIpv4({DataOf(M3uaData(zeroPointer), 4)}),
        OverIpv4({DataOf(M3uaData(Udt(kHeader)), 5), Octets{0, 3, 0, 40}}),
        {Ethernet(kIpv4, Octets{0x55})},
        OverIpv4({DataOf(M3uaData(Udt(kErrorIndication)), 6)})},
       {{5, kHeader}, {7, kErrorIndication}},
       {7, 2, 0, 6},
       {"1: IPv4: header length 20 and total length 96 do not fit its 86 octets",
        "2: SCTP: chunk length 2 below 4", "3: M3UA: message length 52 does not fit its 48 octets",
        "4: SCCP: pointer at offset 4 is 0", "5: SCTP: needs 40 octets at offset 76, 4 left",
        "6: IP: version 5"}},
  };
}

TEST(ReadCaptureTest, FindsRnsapInEachFramingOfPcapAndPcapngFiles) {
  for (const Case& test : Cases()) {
    for (const auto& [format, content] :
         {std::pair{"pcap", Pcap(test.linkType, test.frames)},
          std::pair{"pcapng", Pcapng(test.linkType, test.frames)}}) {
      SCOPED_TRACE(test.name + " (" + format + ")");
      const Read read = ReadFile(content);
      EXPECT_EQ(read.outcome.failure, "");
      EXPECT_EQ(read.found, test.found);
      const CaptureCounts& counts = read.outcome.counts;
      EXPECT_EQ((std::vector{counts.frames, counts.rnsap, counts.skipped, counts.malformed}),
                (std::vector{test.counts.frames, test.counts.rnsap, test.counts.skipped,
                             test.counts.malformed}));
      EXPECT_EQ(read.notes, test.notes);
      EXPECT_EQ(read.outcome.heldFragments, test.heldFragments);
    }
  }
}

TEST(ReadCaptureTest, StampsEachMessageWithItsFramesTime) {
  const std::vector<Frame> frames(3, OverIpv4({DataOf(M3uaData(Udt(kHeader)), 1)}));
  const std::string path = ScratchPath("stamps.pcapng");
  WriteFile(path, Pcapng(kEthernet, frames));
  std::vector<std::pair<int64_t, uint32_t>> stamps;
  ReadCapture(path, {[&](const CapturedMessage& message) {
                       stamps.emplace_back(message.frame.seconds, message.frame.microseconds);
                     },
                     [](const CaptureNote&) {}});
  EXPECT_EQ(stamps, (std::vector<std::pair<int64_t, uint32_t>>{
                        {kFirstSecond, 0}, {kFirstSecond + 1, 1000}, {kFirstSecond + 2, 2000}}));
}

TEST(ReadCaptureTest, NamesWhyAFileCannotBeRead) {
  const std::string pcap = Pcap(kEthernet, {OverIpv4({DataOf(M3uaData(Udt(kHeader)), 1)})});
  for (const auto& [content, failure, frames] :
       std::vector<std::tuple<std::string, std::string, uint64_t>>{
           {"00 14 40 50\n", "cannot read the capture: unknown file format", 0},
           {pcap.substr(0, pcap.size() - 5),
            "cannot read the capture after frame 0: truncated dump file; tried to read 110 "
            "captured bytes, only got 105",
            0},
       }) {
    const Read read = ReadFile(content);
    EXPECT_EQ(read.outcome.failure, failure);
    EXPECT_EQ(read.outcome.counts.frames, frames);
  }
}

}  // namespace
}  // namespace rnsap::cli
