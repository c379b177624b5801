// libFuzzer target over whole capture files: the bytes of a pcap or pcapng
// file through the capture reader of rnsap-decode (pcap and pcapng files, the
// frame dissector, IP and SCTP reassembly, SCCP connections and segments), every
// message it hands on read to its last octet.
#include <sys/mman.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <string>

#include "cli/capture_input.h"

namespace {

// Captures are opened by name: each input is written to one file in memory.
class MemoryFile {
 public:
  MemoryFile() : descriptor_(memfd_create("capture", 0)) {
    if (descriptor_ < 0) std::abort();
  }

  std::string Holding(const uint8_t* data, size_t size) const {
    if (ftruncate(descriptor_, 0) != 0) std::abort();
    for (size_t written = 0; written < size;) {
      const ssize_t count = pwrite(descriptor_, data + written, size - written, written);
      if (count <= 0) std::abort();
      written += static_cast<size_t>(count);
    }
    return "/proc/self/fd/" + std::to_string(descriptor_);
  }

 private:
  int descriptor_;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static const MemoryFile file;
  volatile uint8_t sink = 0;
  const rnsap::cli::CaptureHandlers handlers{[&](const rnsap::cli::CapturedMessage& message) {
                                               for (const uint8_t octet : message.octets)
                                                 sink = sink ^ octet;
                                             },
                                             [](const rnsap::cli::CaptureNote&) {}};
  rnsap::cli::ReadCapture(file.Holding(data, size), handlers);
  return 0;
}
