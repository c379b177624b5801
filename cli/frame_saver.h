// Writes the frames that held selected messages to a new pcap file, each
// frame once, with its time and its length on the wire.
#pragma once

#include <pcap/pcap.h>

#include <cstdint>
#include <string>
#include <string_view>

#include "cli/capture_input.h"

namespace rnsap::cli {

class FrameSaver {
 public:
  explicit FrameSaver(std::string path) : path_(std::move(path)) {}
  ~FrameSaver();
  FrameSaver(const FrameSaver&) = delete;
  FrameSaver& operator=(const FrameSaver&) = delete;

  // Writes the frame that carried `message` unless it was the last one
  // written, from the capture `source`. Throws std::runtime_error if the file
  // cannot be written, or for a frame of another link type than the first.
  void Save(std::string_view source, const CapturedMessage& message);

 private:
  void Open(int linkType);

  std::string path_;
  pcap_t* dead_ = nullptr;
  pcap_dumper_t* dumper_ = nullptr;
  int linkType_ = -1;
  uint64_t lastFrame_ = 0;
  std::string lastSource_;
};

}  // namespace rnsap::cli
