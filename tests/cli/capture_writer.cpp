#include "tests/cli/capture_writer.h"

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

// Pointers count from their own first octet; LUDT has two-octet pointers
// and data length. The called party routes on the subsystem number, or with
// "gt" on point code 1234 and global title 4 as well.
Octets Sccp(const Layer& layer, const Octets& data) {
  const bool udt = layer.name == "udt", ludt = layer.name == "ludt";
  const int width = ludt ? 2 : 1, pointers = udt ? 3 : 4;
  const uint64_t ssn = layer.Number("ssn", 143);
  const Octets called = layer.Has("gt") ? Be(0x13d204, 3) + Be(ssn, 1) + Be(0x0012042143, 5)
                                        : Be(0x42, 1) + Be(ssn, 1);
  const Octets calling = Be(0x432c018f, 4);  // subsystem 143 at point code 300
  const Octets parts[] = {called, calling, data};
  Octets out = Be(udt ? 0x0900 : ludt ? 0x13000f : 0x11000f, udt ? 2 : 3), variable;
  for (int part = 0; part < 3; ++part) {
    out = out + Le(pointers * width - part * width + variable.size(), width);
    variable = variable + Le(parts[part].size(), part == 2 ? width : 1) + parts[part];
  }
  return out + Be(0, (pointers - 3) * width) + variable;  // no optional part
}

// DATA with a Protocol Data parameter: OPC 1001, DPC 1002, SI, NI 2, MP 0, SLS 5.
Octets M3ua(const Octets& data, uint64_t si) {
  const Octets parameter = Pad(Be(0x0210, 2) + Be(16 + data.size(), 2) + Be(1001, 4) + Be(1002, 4) +
                               Be(si, 1) + Be(0x020005, 3) + data);
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
Octets Ip(const Layer& layer, const Octets& payload) {
  if (layer.name == "ipv4") {
    return Be(0x4500, 2) + Be(20 + payload.size(), 2) + Be(0x0001400040840000, 8) +
           Be(0x0a000000 | layer.Number("src", 1), 4) + Be(0x0a000002, 4) + payload;
  }
  const Octets network = Be(0x20010db8, 4) + Be(0, 11);
  return Be(0x60000000, 4) + Be(payload.size(), 2) + Be(0x8440, 2) + network + Be(1, 1) + network +
         Be(2, 1) + payload;
}

// Ethernet from 02:00:00:00:00:01 to ...:02; Linux cooked (v2 on interface
// 3) sent to us from the same address. The EtherType by the IP version, if
// not given.
Octets Link(const Layer& layer, const Octets& payload) {
  const uint64_t type =
      layer.Number("type", !payload.empty() && payload[0] >> 4 == 6 ? 0x86dd : 0x0800);
  const Octets address = Be(0x020000000001, 6);
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
  if (name == "udt" || name == "xudt" || name == "ludt") return Sccp(layer, inner);
  if (name == "m3ua") return M3ua(inner, layer.Number("si", 3));
  // SIO of the national network; DPC, OPC and SLS.
  if (name == "mtp3")
    return Be(0x80 | layer.Number("si", 3), 1) + Le(1002 | 1001u << 14 | 5u << 28, 4) + inner;
  // BSN, FSN and the length indicator.
  if (name == "mtp2") return Be(0x8182, 2) + Be(std::min<size_t>(inner.size(), 63), 1) + inner;
  if (name == "data") return Chunk(layer, inner);
  if (name == "ipv4" || name == "ipv6") return Ip(layer, inner);
  if (name == "eth" || name == "sll" || name == "sll2") return Link(layer, inner);
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
               Be(0x01020304, 4) + Be(0, 4);
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
      {"ethernet", 1}, {"raw", 101}, {"sll", 113}, {"mtp2", 140}, {"mtp3", 141}, {"sll2", 276}};
  const uint32_t link = kLinkTypes.at(linkType);
  const bool pcap = format == "pcap";
  // Version 2.4 and microsecond stamps; or a section and an interface.
  Octets out = pcap ? Le(0xa1b2c3d4, 4) + Le(0x00040002, 4) + Le(0, 8) + Le(65535, 4) + Le(link, 4)
                    : Block(0x0a0d0d0a, Le(0x1a2b3c4d, 4) + Le(1, 4) + Le(~0ull, 8)) +
                          Block(1, Le(link, 4) + Le(65535, 4));
  for (size_t index = 0; index < frames.size(); ++index) {
    const Frame& frame = frames[index];
    const uint64_t seconds = 1700000000 + index, microseconds = index % 1000 * 1000;
    const uint64_t stamp = seconds * 1000000 + microseconds, captured = frame.octets.size();
    const Octets record = (pcap ? Le(seconds, 4) + Le(microseconds, 4)
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
      "eth ipv6 sctp data m3ua xudt/gt #1",
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
