// Writes the frames that held selected messages to a new capture file, each
// frame once, with its time (to the nanosecond) and its length on the wire:
// pcapng when the file name ends in ".pcapng", pcap otherwise.
#pragma once

#include <cstdint>
#include <cstdio>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "cli/capture_input.h"

namespace rnsap::cli {

// The saved file could not be written.
struct SaveFailure : std::runtime_error {
  using std::runtime_error::runtime_error;
};

class FrameSaver {
 public:
  explicit FrameSaver(std::string path);
  // Closes the file; a write that failed unnoticed so far is not reported.
  ~FrameSaver();
  FrameSaver(const FrameSaver&) = delete;
  FrameSaver& operator=(const FrameSaver&) = delete;

  // Writes the frame that completed `message` unless it was the last one
  // written, from the capture `source`. Throws std::runtime_error if the
  // file cannot be written, or, in pcap, for a frame of another link type
  // than the first (SaveFailure).
  void Save(std::string_view source, const CapturedMessage& message);
  // Writes what is buffered and closes the file (an empty capture when no
  // frame was saved); throws SaveFailure if that fails.
  void Close();

 private:
  void Open(int linkType);
  uint32_t Interface(int linkType);
  void WritePcapRecord(const FrameStamp& stamp, const CapturedFrame& frame);
  void WritePcapngBlock(const FrameStamp& stamp, const CapturedFrame& frame);
  void Write(const void* data, size_t size);

  std::string path_;
  bool pcapng_ = false;
  std::FILE* file_ = nullptr;
  std::vector<int> interfaces_;  // the link type of each interface written, in order
  bool closed_ = false;
  uint64_t lastFrame_ = 0;
  std::string lastSource_;
};

}  // namespace rnsap::cli
