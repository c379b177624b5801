// Speed of each pass over the same messages. The Validation pass costs the
// walk alone; the others add their sinks.
#include <benchmark/benchmark.h>

#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "host/setup.h"
#include "tests/support/bit_writer.h"

namespace rnsap {
namespace {

// A message of `ies` IEs: causes, IMSIs and L3 information in turn.
std::vector<uint8_t> MixedMessage(uint32_t ies) {
  testing::BitWriter w = testing::PublicHeader(0, 8, ies);
  for (uint32_t i = 0; i < ies; ++i) {
    switch (i % 3) {
      case 0:
        testing::PutIeFrame(w, 11, 2).Put(0, 1).Put(0, 2).Put(0, 1).Put(15, 5);
        break;
      case 1:
        testing::PutIeFrame(w, 84, 9).Put(5, 3).Align().Put(0x21436587A9CBEDF0ull, 64);
        break;
      default:
        testing::PutIeFrame(w, 85, 9).Align().Put(0, 1).Put(64, 7).Put(0x0123456789ABCDEFull, 64);
        break;
    }
  }
  return w.bytes();
}

template <typename Pass>
void RunPass(benchmark::State& state, Pass pass) {
  host::HostDecodeContext context;
  context.LoadMessage(MixedMessage(static_cast<uint32_t>(state.range(0))));
  for (auto _ : state) {
    context.Rewind();
    host::ResetHost();
    benchmark::DoNotOptimize(pass(context));
  }
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) *
                          ((context.state().totalBits + 7) / 8));
}

void Validation(benchmark::State& state) {
  RunPass(state, [](host::HostDecodeContext& c) { return vex_PreDecodeMV(&c.decode_request()); });
}
void DecodedField(benchmark::State& state) {
  RunPass(state, [](host::HostDecodeContext& c) { return vex_PreDecodeMD(&c.decode_request()); });
}
void Display(benchmark::State& state) {
  RunPass(state, [](host::HostDecodeContext& c) { return vex_PreDecodeTO(&c.decode_request()); });
}
void KeyField(benchmark::State& state) {
  RunPass(state, [](host::HostDecodeContext& c) { return KFE_vorel_rnsap_04b(&c.key_request()); });
}

BENCHMARK(Validation)->Arg(3)->Arg(60);
BENCHMARK(DecodedField)->Arg(3)->Arg(60);
BENCHMARK(Display)->Arg(3)->Arg(60);
BENCHMARK(KeyField)->Arg(3)->Arg(60);

}  // namespace
}  // namespace rnsap
