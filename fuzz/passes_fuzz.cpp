// Any byte string through all four passes: no crash, the buffer restored
// after every pass that ends normally, and every pass walking to the same end.
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <span>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "host/setup.h"

namespace {

void Require(bool condition) {
  if (!condition) std::abort();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  if (size == 0 || size > 65536) return 0;
  // The first octet cuts 0 to 7 bits off the end of the message, so that
  // lengths which are not whole octets are walked too.
  const uint32_t cutBits = data[0] % 8;
  ++data;
  --size;
  static rnsap::host::HostDecodeContext context;
  const std::span<const uint8_t> message(data, size);
  const uint32_t bits = static_cast<uint32_t>(8 * size);
  context.LoadMessage(message, bits >= cutBits ? bits - cutBits : 0);

  rnsap::host::ResetHost();
  Require(vex_PreDecodeMV(&context.decode_request()));
  const uint32_t position = context.state().position;
  const uint32_t flags = context.state().flags;
  Require(std::memcmp(context.state().buffer, data, size) == 0);

  context.Rewind();
  Require(vex_PreDecodeMD(&context.decode_request()));
  // Only the Validation pass checks loop counts, so it may hold more flags.
  Require(context.state().position == position && (context.state().flags & ~flags) == 0);

  context.Rewind();
  Require(vex_PreDecodeTO(&context.decode_request()));
  Require(context.state().position == position);
  Require(rnsap::host::DisplayLines().size() == rnsap::host::DecodedFields().size());

  context.Rewind();
  const int32_t keys = KFE_vorel_rnsap_04b(&context.key_request());
  Require(keys == 1 || keys == 0);
  if (keys == 1) Require(context.state().position == position);
  return 0;
}
