#include "tests/cli/capture_writer.h"

#include <fmt/format.h>

#include <algorithm>
#include <fstream>
#include <map>
#include <sstream>
#include <stdexcept>

#include "cli/hex_input.h"

namespace rnsap::testing {
namespace {

// `size` octets of `value`, in network order or least significant first.
Octets Be(uint64_t value, int size) {
  Octets out;
  for (int octet = size; octet-- > 0;)
    out.push_back(octet < 8 ? static_cast<uint8_t>(value >> 8 * octet) : 0);
  return out;
}
Octets Le(uint64_t value, int size) {
  Octets out = Be(value, size);
  std::reverse(out.begin(), out.end());
  return out;
}
Octets operator+(Octets head, const Octets& tail) {
  head.insert(head.end(), tail.begin(), tail.end());
  return head;
}
Octets Pad(Octets out) {
  out.resize((out.size() + 3) / 4 * 4, 0);
  return out;
}

// One word of a frame description: "data/tsn=4/first".
struct Layer {
  explicit Layer(const std::string& word) {
    std::istringstream parts(word);
    std::getline(parts, name, '/');
    for (std::string option; std::getline(parts, option, '/');) {
      const size_t equals = option.find('=');
      options[option.substr(0, equals)] = equals == option.npos ? "" : option.substr(equals + 1);
    }
  }
  bool Has(const std::string& flag) const { return options.contains(flag); }
  uint32_t Number(const std::string& key, uint32_t otherwise) const {
    return Has(key) ? static_cast<uint32_t>(std::stoul(options.at(key), nullptr, 0)) : otherwise;
  }

  std::string name;
  std::map<std::string, std::string> options;
};

// Pointers count from their own last octet (LUDT has two-octet pointers and
// data length). The called party routes on the subsystem number, or with
// "gt" on point code 1234 and global title 4 as well. Optional parameters
// (XUDT, LUDT) end with an end of optional parameters.
// With `optionalPart` the last pointer leads to `optional`, or is 0 if that
// is empty.
Octets Pointed(const Octets& fixed, const std::vector<Octets>& variables, bool optionalPart,
               const Octets& optional, int width) {
  const size_t pointers = variables.size() + optionalPart;
  Octets pointerPart, variable;
  for (size_t part = 0; part < pointers; ++part) {
    const bool none = part == variables.size() && optional.empty();
    pointerPart = pointerPart +
                  Le(none ? 0 : (pointers - part) * width + variable.size() - (width - 1), width);
    if (part < variables.size()) variable = variable + variables[part];
  }
  return fixed + pointerPart + variable + optional;
}

Octets Called(const Layer& layer) {
  const uint64_t ssn = layer.Number("ssn", 143);
  const Octets address = layer.Has("gt") ? Be(0x13d204, 3) + Be(ssn, 1) + Be(0x0012042143, 5)
                                         : Be(0x42, 1) + Be(ssn, 1);
  return Be(address.size(), 1) + address;
}

// The Segmentation parameter: first, remaining segments rest=N, reference
// ref=N; then the end of optional parameters.
Octets Segmentation(const Layer& layer) {
  if (!layer.Has("rest")) return {};
  return Be(0x1004, 2) + Be((layer.Has("first") ? 0x80 : 0) | layer.Number("rest", 0), 1) +
         Le(layer.Number("ref", 7), 3) + Be(0, 1);
}

// An optional Data parameter, if there is data, then the end.
Octets OptionalData(const Octets& data) {
  return data.empty() ? Octets{} : Be(0x0f, 1) + Be(data.size(), 1) + data + Be(0, 1);
}

Octets Sccp(const Layer& layer, const Octets& data) {
  const std::string& name = layer.name;
  const Octets source = Le(layer.Number("src", 1), 3), destination = Le(layer.Number("dst", 1), 3);
  if (name == "udt" || name == "xudt" || name == "ludt") {
    const int width = name == "ludt" ? 2 : 1;
    const Octets calling = Be(0x04432c018f, 5);  // subsystem 143 at point code 300
    const std::vector<Octets> variables{Called(layer), calling, Le(data.size(), width) + data};
    if (name == "udt") return Pointed(Be(0x0900, 2), variables, false, {}, 1);
    return Pointed(Be(name == "ludt" ? 0x13000f : 0x11000f, 3), variables, true,
                   Segmentation(layer), width);
  }
  if (name == "cr")
    return Pointed(Be(1, 1) + source + Be(2, 1), {Called(layer)}, true, OptionalData(data), 1);
  if (name == "cc")
    return Pointed(Be(2, 1) + destination + source + Be(2, 1), {}, true, OptionalData(data), 1);
  if (name == "rlsd")
    return Pointed(Be(4, 1) + destination + source + Be(0, 1), {}, true, OptionalData(data), 1);
  if (name == "rlc") return Be(5, 1) + destination + source;
  return Pointed(Be(6, 1) + destination + Be(layer.Has("more") ? 1 : 0, 1),
                 {Be(data.size(), 1) + data}, false, {}, 1);
}

// DATA with a Protocol Data parameter: OPC (1001), DPC (1002), SI, NI 2, MP 0, SLS 5.
Octets M3ua(const Layer& layer, const Octets& data) {
  const Octets parameter =
      Pad(Be(0x0210, 2) + Be(16 + data.size(), 2) + Be(layer.Number("opc", 1001), 4) +
          Be(layer.Number("dpc", 1002), 4) + Be(layer.Number("si", 3), 1) + Be(0x020005, 3) + data);
  return Be(0x01000101, 4) + Be(8 + parameter.size(), 4) + parameter;
}

Octets Chunk(const Layer& layer, const Octets& data) {
  const int flags = layer.Has("first") ? 2 : layer.Has("middle") ? 0 : layer.Has("last") ? 1 : 3;
  return Be(flags, 2) + Be(16 + data.size(), 2) + Be(layer.Number("tsn", 1), 4) +
         Be(layer.Number("stream", 1), 2) + Be(layer.Number("seq", 0), 2) +
         Be(layer.Number("ppi", 3), 4) + data;
}

// IPv4 with identification 1, don't fragment, time to live 64, protocol SCTP
// and no checksum, from 10.0.0.1 (or src) to 10.0.0.2; IPv6 with next header
// SCTP and hop limit 64, from 2001:db8::1 to 2001:db8::2.
// With frag=N/of=M only the Nth of M fragments of the payload, at offsets
// in multiples of 8, under identification id=N (1); IPv6 then adds a
// Fragment header.
Octets Ip(const Layer& layer, const Octets& whole) {
  const size_t n = layer.Number("frag", 1), of = layer.Number("of", 1),
               size = whole.size() / of / 8 * 8;
  const Octets payload(whole.begin() + (n - 1) * size,
                       n == of ? whole.end() : whole.begin() + n * size);
  const uint64_t offsetField = (n - 1) * size | (n < of ? 1 : 0), id = layer.Number("id", 1);
  if (layer.name == "ipv4") {
    const uint64_t fragment = of == 1 ? 0x4000 : offsetField >> 3 | (n < of ? 0x2000 : 0);
    return Be(0x4500, 2) + Be(20 + payload.size(), 2) + Be(id, 2) + Be(fragment, 2) +
           Be(0x40840000, 4) + Be(0x0a000000 | layer.Number("src", 1), 4) +
           Be(0x0a000000 | layer.Number("dst", 2), 4) + payload;
  }
  const Octets network = Be(0x20010db8, 4) + Be(0, 11);
  const Octets fragmentHeader = of == 1 ? Octets{} : Be(0x8400, 2) + Be(offsetField, 2) + Be(id, 4);
  return Be(0x60000000, 4) + Be(fragmentHeader.size() + payload.size(), 2) +
         Be(of == 1 ? 0x8440 : 0x2c40, 2) + network + Be(layer.Number("src", 1), 1) + network +
         Be(2, 1) + fragmentHeader + payload;
}

// Ethernet from 02:00:00:00:00:01 to ...:02; Linux cooked (v2 on interface
// 3) sent to us from the same address. The EtherType by the IP version, if
// not given.
Octets Link(const Layer& layer, const Octets& payload) {
  const uint64_t type =
      layer.Number("type", !payload.empty() && payload[0] >> 4 == 6 ? 0x86dd : 0x0800);
  const Octets address = Be(0x020000000001, 6);
  if (layer.name == "null") return Le(type == 0x86dd ? 30 : 2, 4) + payload;
  if (layer.name == "eth") return Be(0x020000000002, 6) + address + Be(type, 2) + payload;
  if (layer.name == "sll") return Be(1, 4) + Be(6, 2) + address + Be(0, 2) + Be(type, 2) + payload;
  return Be(type, 2) + Be(0, 2) + Be(3, 4) + Be(0x00010006, 4) + address + Be(0, 2) + payload;
}

Octets Piece(const Layer& layer, const Octets& whole) {
  const size_t n = layer.Number("n", 1), of = layer.Number("of", 1), size = whole.size() / of;
  return {whole.begin() + (n - 1) * size, n == of ? whole.end() : whole.begin() + n * size};
}

Octets Wrap(const Layer& layer, Octets inner) {
  const std::string& name = layer.name;
  for (const char* sccp : {"udt", "xudt", "ludt", "cr", "cc", "rlsd", "rlc", "dt1"})
    if (name == sccp) return Sccp(layer, inner);
  if (name == "m3ua") return M3ua(layer, inner);
  // SIO of the national network; DPC, OPC and SLS.
  if (name == "mtp3")
    return Be(0x80 | layer.Number("si", 3), 1) + Le(1002 | 1001u << 14 | 5u << 28, 4) + inner;
  // BSN, FSN and the length indicator.
  if (name == "mtp2") return Be(0x8182, 2) + Be(std::min<size_t>(inner.size(), 63), 1) + inner;
  if (name == "data") return Chunk(layer, inner);
  if (name == "ipv4" || name == "ipv6") return Ip(layer, inner);
  if (name == "eth" || name == "sll" || name == "sll2" || name == "null") return Link(layer, inner);
  if (name == "part") return Piece(layer, inner);
  if (name == "set") {
    const Octets octets = cli::ParseHexMessage(layer.options.at("to")).octets;
    std::copy(octets.begin(), octets.end(), inner.begin() + layer.Number("at", 0));
    return inner;
  }
  throw std::invalid_argument("no layer " + name);
}

// The chunks, last made first, each padded; checksum 0, not checked.
Octets Sctp(const Layer& layer, const std::vector<Octets>& chunks) {
  Octets out = Be(layer.Number("sport", 2905), 2) + Be(layer.Number("dport", 2905), 2) +
               Be(layer.Number("tag", 0x01020304), 4) + Be(0, 4);
  for (auto chunk = chunks.rbegin(); chunk != chunks.rend(); ++chunk) out = Pad(out + *chunk);
  return out;
}

// pcapng blocks: type, total length, body, total length again.
Octets Block(uint32_t type, const Octets& body) {
  const uint64_t length = 12 + Pad(body).size();
  return Le(type, 4) + Le(length, 4) + Pad(body) + Le(length, 4);
}

}  // namespace

// Read from the innermost layer out, on a stack of what the words so far
// make.
Frame DescribedFrame(std::string_view description, const std::vector<Octets>& samples) {
  std::istringstream in{std::string(description)};
  std::vector<std::string> words;
  for (std::string word; in >> word;) words.push_back(word);
  std::vector<Octets> made;
  Frame frame;
  for (auto word = words.rbegin(); word != words.rend(); ++word) {
    const Layer layer(*word);
    if (layer.name.starts_with('#')) {
      made.push_back(samples.at(std::stoul(layer.name.substr(1))));
    } else if (const cli::HexLine hex = cli::ParseHexMessage(*word); !hex.octets.empty()) {
      made.push_back(hex.octets);
    } else if (layer.name == "sctp") {
      made = {Sctp(layer, made)};
    } else if (made.empty()) {
      made.push_back(Wrap(layer, {}));
    } else if (layer.name == "cut") {
      frame.wireLength = static_cast<uint32_t>(made.back().size());
      made.back().resize(made.back().size() - layer.Number("by", 0));
    } else {
      made.back() = Wrap(layer, std::move(made.back()));
    }
  }
  if (made.size() != 1) throw std::invalid_argument("not one frame: " + std::string(description));
  frame.octets = made.back();
  return frame;
}

std::string Capture(std::string_view format, std::string_view linkType,
                    const std::vector<Frame>& frames) {
  static const std::map<std::string_view, uint32_t> kLinkTypes{
      {"null", 0},  {"ethernet", 1}, {"raw", 101},  {"ieee802_11", 105},
      {"sll", 113}, {"mtp2", 140},   {"mtp3", 141}, {"sll2", 276}};
  const uint32_t link = kLinkTypes.at(linkType);
  const bool nanoseconds = format == "pcapns", pcap = format == "pcap" || nanoseconds;
  // Version 2.4 and microsecond (or nanosecond) stamps; or a section and an
  // interface.
  Octets out = pcap ? Le(nanoseconds ? 0xa1b23c4d : 0xa1b2c3d4, 4) + Le(0x00040002, 4) + Le(0, 8) +
                          Le(65535, 4) + Le(link, 4)
                    : Block(0x0a0d0d0a, Le(0x1a2b3c4d, 4) + Le(1, 4) + Le(~0ull, 8)) +
                          Block(1, Le(link, 4) + Le(65535, 4));
  for (size_t index = 0; index < frames.size(); ++index) {
    const Frame& frame = frames[index];
    const uint64_t seconds = 1700000000 + index, microseconds = index % 1000 * 1000;
    const uint64_t stamp = seconds * 1000000 + microseconds, captured = frame.octets.size();
    const uint64_t fraction = nanoseconds ? microseconds * 1000 + index : microseconds;
    const Octets record = (pcap ? Le(seconds, 4) + Le(fraction, 4)
                                : Le(0, 4) + Le(stamp >> 32, 4) + Le(stamp & ~0u, 4)) +
                          Le(captured, 4) + Le(std::max<uint64_t>(frame.wireLength, captured), 4) +
                          frame.octets;
    out = out + (pcap ? record : Block(6, record));
  }
  return {out.begin(), out.end()};
}

// Ethernet throughout: M3UA over SCTP over IPv4 and IPv6, UDT, XUDT and
// LUDT, two messages bundled in one packet, one sent in two fragments, and
// one to subsystem 142 that is skipped.
std::string SampleCapture(const std::vector<Octets>& samples) {
  std::vector<std::string> descriptions{
      "eth ipv4 sctp data/tsn=1 m3ua udt #0",
      "eth ipv6 sctp/tag=5 data m3ua xudt/gt #1",
      "eth ipv4 sctp data/tsn=2 m3ua udt #2 data/tsn=3/seq=1 m3ua ludt/gt #3",
      "eth ipv4 sctp data/tsn=4/seq=2/first part/n=1/of=2 m3ua udt #4",
      "eth ipv4 sctp data/tsn=6 m3ua udt/ssn=142 #5",
      "eth ipv4 sctp data/tsn=5/seq=2/last part/n=2/of=2 m3ua udt #4",
  };
  for (size_t index = 5; index < samples.size(); ++index)
    descriptions.push_back("eth ipv4 sctp data/tsn=" + std::to_string(index + 2) + " m3ua udt #" +
                           std::to_string(index));
  std::vector<Frame> frames;
  for (const std::string& description : descriptions)
    frames.push_back(DescribedFrame(description, samples));
  return Capture("pcap", "ethernet", frames);
}

std::string CorpusCapture(const std::vector<Octets>& samples, size_t frames) {
  static constexpr std::string_view kCarriers[] = {
      "{}eth ipv4 sctp data/tsn={} m3ua udt #{}",
      "{}eth ipv6 sctp/tag=5 data/tsn={} m3ua xudt/gt #{}",
      "{}eth ipv4 sctp/sport=2906 data/tsn={} m3ua ludt/gt #{}",
  };
  constexpr size_t kCutEvery = 1000;
  std::vector<Frame> written;
  for (size_t frame = 0; frame < frames; ++frame) {
    const std::string_view carrier = kCarriers[frame % std::size(kCarriers)];
    const std::string_view cut = frame % kCutEvery == kCutEvery - 1 ? "cut/by=10 " : "";
    written.push_back(
        DescribedFrame(fmt::format(fmt::runtime(carrier), cut, frame / std::size(kCarriers) + 1,
                                   frame % samples.size()),
                       samples));
  }
  return Capture("pcap", "ethernet", written);
}

std::vector<Octets> HexMessages(const std::string& path) {
  std::ifstream file(path);
  std::vector<Octets> messages;
  for (std::string line; std::getline(file, line);) {
    const cli::HexLine parsed = cli::ParseHexLine(line);
    if (parsed.kind == cli::HexLine::Kind::kBad) return {};
    if (parsed.kind == cli::HexLine::Kind::kMessage) messages.push_back(parsed.octets);
  }
  return messages;
}

}  // namespace rnsap::testing
