// Speed of the four passes over the generated message corpus, beside two
// floors measured in the same run: the bare walk (each field's bits taken at
// the positions and widths the walk reads them, after the host's per-message
// copy) and the formatting floor (that plus one snprintf of a label and a
// number and one call through a function pointer per field). The reporting
// passes run against the counting host, so that the recorder's own cost stays
// out. After the runs, each ratio is printed beside its target.
#include <benchmark/benchmark.h>

#include <cstdio>
#include <fstream>
#include <map>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "engine/bit_access.h"
#include "tests/stand_in/recorder.h"
#include "hostrt/setup.h"
#include "tests/support/bit_writer.h"

namespace rnsap {
namespace {

// A run of bits that a field read takes, as the bare walk repeats it.
struct BitRun {
  uint32_t first;
  uint32_t width;
};

// A field read with its runs, as the formatting floor repeats it.
struct FieldRead {
  std::string label;
  uint32_t firstRun;
  uint32_t runCount;
};

struct BenchMessage {
  std::unique_ptr<host::HostDecodeContext> context;
  std::vector<BitRun> runs;
  std::vector<FieldRead> reads;
};

// Loads `octets` and takes the runs of its field reads from one recorded
// Decoded-field pass, outside any timed loop.
BenchMessage Prepare(const std::vector<uint8_t>& octets) {
  BenchMessage m{std::make_unique<host::HostDecodeContext>(), {}, {}};
  m.context->LoadMessage(octets);
  host::SetReportMode(host::ReportMode::kRecord);
  host::ResetHost();
  vex_PreDecodeMD(&m.context->decode_request());
  for (const host::DecodedFieldReport& f : host::DecodedFields()) {
    m.reads.push_back({f.label, static_cast<uint32_t>(m.runs.size()), 0});
    for (const BitSegment& s : f.segments)
      if (s.lastBit + 1 > s.firstBit) {
        m.runs.push_back({s.firstBit, s.lastBit + 1 - s.firstBit});
        ++m.reads.back().runCount;
      }
  }
  host::ResetHost();
  return m;
}

std::vector<BenchMessage> LoadCorpus() {
  std::vector<BenchMessage> corpus;
  std::ifstream in(RNSAP_MESSAGE_CORPUS);
  std::string line, keyword, hex;
  while (std::getline(in, line)) {
    std::istringstream words(line);
    if (!(words >> keyword >> hex) || keyword != "message") continue;
    std::vector<uint8_t> octets;
    for (size_t i = 0; i + 1 < hex.size(); i += 2)
      octets.push_back(static_cast<uint8_t>(std::stoul(hex.substr(i, 2), nullptr, 16)));
    corpus.push_back(Prepare(octets));
  }
  return corpus;
}

const std::vector<BenchMessage>& Corpus() {
  static const std::vector<BenchMessage> corpus = LoadCorpus();
  return corpus;
}

// A public message of about `bytes` octets: causes, IMSIs and L3 information in turn.
std::vector<BenchMessage> SizedMessage(uint32_t bytes) {
  const auto compose = [](uint32_t ies) {
    testing::BitWriter w = testing::PublicHeader(0, 8, ies);
    for (uint32_t i = 0; i < ies; ++i) {
      if (i % 3 == 0) {
        testing::PutIeFrame(w, 11, 2).Put(0, 1).Put(0, 2).Put(0, 1).Put(15, 5);
      } else if (i % 3 == 1) {
        testing::PutIeFrame(w, 84, 9).Put(5, 3).Align().Put(0x21436587A9CBEDF0ull, 64);
      } else {
        testing::PutIeFrame(w, 85, 9).Align().Put(0, 1).Put(64, 7).Put(0x0123456789ABCDEFull, 64);
      }
    }
    return w.bytes();
  };
  uint32_t ies = 1;
  while (compose(ies).size() < bytes) ++ies;
  std::vector<BenchMessage> one;
  one.push_back(Prepare(compose(ies)));
  return one;
}

// Fields per iteration of each benchmark, for the ratios.
std::map<std::string, double>& FieldsPerIteration() {
  static std::map<std::string, double> fields;
  return fields;
}

template <typename Body>
void OverMessages(benchmark::State& state, const std::string& name,
                  const std::vector<BenchMessage>& messages, Body body) {
  uint64_t fields = 0, bytes = 0;
  for (const BenchMessage& m : messages) {
    fields += m.reads.size();
    bytes += (m.context->state().totalBits + 7) / 8;
  }
  for (auto _ : state)
    for (const BenchMessage& m : messages) {
      m.context->Rewind();
      body(m);
    }
  FieldsPerIteration()[name + "/" + std::to_string(state.range(0))] = static_cast<double>(fields);
  state.SetItemsProcessed(static_cast<int64_t>(state.iterations() * messages.size()));
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * bytes));
  state.counters["ns/bit"] = benchmark::Counter(
      static_cast<double>(8 * bytes) * 1e-9,
      benchmark::Counter::kIsIterationInvariantRate | benchmark::Counter::kInvert);
}

const std::vector<BenchMessage>& MessagesOf(const benchmark::State& state) {
  static std::map<int64_t, std::vector<BenchMessage>> sized;
  if (state.range(0) == 0) return Corpus();
  auto& messages = sized[state.range(0)];
  if (messages.empty()) messages = SizedMessage(static_cast<uint32_t>(state.range(0)));
  return messages;
}

// The bits of runs [first, first + count), joined.
uint32_t RunBits(const BenchMessage& m, uint32_t first, uint32_t count) {
  const DecodeState& s = m.context->state();
  uint32_t bits = 0;
  for (const BitRun* run = &m.runs[first]; count-- > 0; ++run)
    bits = (bits << (run->width & 31)) + ReadMessageBits(s, run->first, run->width);
  return bits;
}

void BareWalkFloor(benchmark::State& state, const std::string& name) {
  OverMessages(state, name, MessagesOf(state), [](const BenchMessage& m) {
    benchmark::DoNotOptimize(RunBits(m, 0, static_cast<uint32_t>(m.runs.size())));
  });
}

// The host end of the formatting floor: takes the text, as a host would.
__attribute__((noinline)) void TakeText(const char* text) { benchmark::DoNotOptimize(text); }
void (*volatile takeText)(const char*) = TakeText;

void FormattingFloor(benchmark::State& state, const std::string& name) {
  OverMessages(state, name, MessagesOf(state), [](const BenchMessage& m) {
    char text[256];
    for (const FieldRead& f : m.reads) {
      std::snprintf(text, sizeof text, "%s=%u", f.label.c_str(),
                    RunBits(m, f.firstRun, f.runCount));
      takeText(text);
    }
  });
}

void Validation(benchmark::State& state, const std::string& name) {
  OverMessages(state, name, MessagesOf(state), [](const BenchMessage& m) {
    benchmark::DoNotOptimize(vex_PreDecodeMV(&m.context->decode_request()));
  });
}

void KeyField(benchmark::State& state, const std::string& name) {
  OverMessages(state, name, MessagesOf(state), [](const BenchMessage& m) {
    benchmark::DoNotOptimize(KFE_vorel_rnsap_04b(&m.context->key_request()));
  });
}

// A reporting pass against the counting or the recording host.
template <uint32_t (*Pass)(DecodeRequest*), host::ReportMode mode>
void Reporting(benchmark::State& state, const std::string& name) {
  host::SetReportMode(mode);
  OverMessages(state, name, MessagesOf(state), [](const BenchMessage& m) {
    if (mode == host::ReportMode::kRecord) host::ResetRecorder();
    benchmark::DoNotOptimize(Pass(&m.context->decode_request()));
  });
  host::SetReportMode(host::ReportMode::kRecord);
}

// Arg 0: the corpus; otherwise one message of about that many octets.
void RegisterAll() {
  using Body = void (*)(benchmark::State&, const std::string&);
  const std::pair<const char*, Body> sized[] = {
      {"BareWalkFloor", BareWalkFloor},
      {"FormattingFloor", FormattingFloor},
      {"Validation", Validation},
      {"DecodedField", Reporting<vex_PreDecodeMD, host::ReportMode::kCount>},
      {"Display", Reporting<vex_PreDecodeTO, host::ReportMode::kCount>},
      {"KeyField", KeyField},
  };
  for (const auto& [name, body] : sized) {
    auto* b = benchmark::RegisterBenchmark(name, body, std::string(name));
    for (int64_t bytes : {0, 100, 1024, 4096, 16384}) b->Arg(bytes);
  }
  benchmark::RegisterBenchmark("DecodedFieldRecorded",
                               Reporting<vex_PreDecodeMD, host::ReportMode::kRecord>,
                               std::string("DecodedFieldRecorded"))
      ->Arg(0);
  benchmark::RegisterBenchmark("DisplayRecorded",
                               Reporting<vex_PreDecodeTO, host::ReportMode::kRecord>,
                               std::string("DisplayRecorded"))
      ->Arg(0);
}

// Prints the console report, then each ratio beside its target.
class RatioReporter : public benchmark::ConsoleReporter {
 public:
  void ReportRuns(const std::vector<Run>& runs) override {
    ConsoleReporter::ReportRuns(runs);
    for (const Run& run : runs)
      if (run.run_type == Run::RT_Iteration && !run.error_occurred)
        runs_[run.benchmark_name()] = run;
  }

  void PrintTargets() const {
    std::printf("\nns per field read over the corpus (CPU time):\n");
    for (const char* name : {"BareWalkFloor", "FormattingFloor", "Validation", "KeyField",
                             "DecodedField", "Display", "DecodedFieldRecorded", "DisplayRecorded"})
      if (const double ns = PerField(std::string(name) + "/0"); ns > 0)
        std::printf("  %-22s %8.2f\n", name, ns);
    std::printf("\nratio                                   measured  target\n");
    Ratio("Validation / bare walk", "Validation", "BareWalkFloor", 2.0);
    Ratio("Decoded-field / formatting floor", "DecodedField", "FormattingFloor", 1.2);
    Ratio("Display / formatting floor", "Display", "FormattingFloor", 1.2);
    Ratio("Key-field / Validation", "KeyField", "Validation", 1.2);
    std::printf("\nns per bit, 16 KiB against 100 B (target 0.8 to 1.2):\n");
    for (const char* name : {"Validation", "KeyField", "DecodedField", "Display"}) {
      const double small = PerBit(std::string(name) + "/100");
      const double large = PerBit(std::string(name) + "/16384");
      if (small > 0 && large > 0)
        std::printf("  %-14s %7.4f %7.4f  %5.2f  %s\n", name, small, large, large / small,
                    large / small >= 0.8 && large / small <= 1.2 ? "met" : "MISSED");
    }
  }

 private:
  double PerField(const std::string& name) const {
    const auto run = runs_.find(name);
    const auto fields = FieldsPerIteration().find(name);
    if (run == runs_.end() || fields == FieldsPerIteration().end() || fields->second == 0) return 0;
    return run->second.GetAdjustedCPUTime() / fields->second;
  }

  double PerBit(const std::string& name) const {
    const auto run = runs_.find(name);
    if (run == runs_.end()) return 0;
    return run->second.counters.at("ns/bit").value;
  }

  void Ratio(const char* title, const char* pass, const char* floor, double target) const {
    const double p = PerField(std::string(pass) + "/0");
    const double f = PerField(std::string(floor) + "/0");
    if (p > 0 && f > 0)
      std::printf("  %-36s %8.2f  <= %.1f  %s\n", title, p / f, target,
                  p / f <= target ? "met" : "MISSED");
  }

  std::map<std::string, Run> runs_;
};

}  // namespace
}  // namespace rnsap

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  rnsap::RegisterAll();
  rnsap::RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);
  reporter.PrintTargets();
  benchmark::Shutdown();
  return 0;
}
