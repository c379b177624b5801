// The messages of a capture, decoded one by one in order as a reader takes
// them: a thread reads and decodes ahead of the reader, a bounded number of
// messages at most.
#pragma once

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <exception>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "cli/capture_input.h"
#include "python/native/decoded_message.h"

namespace rnsap::python {

// Why a capture could not be read, in the words rnsap-decode uses.
class CaptureError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

class CaptureStream {
 public:
  CaptureStream(std::string path, cli::Pass pass);
  // Stops the reading thread where it is.
  ~CaptureStream();
  CaptureStream(const CaptureStream&) = delete;
  CaptureStream& operator=(const CaptureStream&) = delete;

  // The next message, waiting for it to be decoded; none at the end. Throws
  // CaptureError at the end of a file that could not be read to its end, and
  // what the decoding threw where it threw it.
  std::optional<DecodedMessage> Next();

  // Valid from the end on.
  const cli::CaptureOutcome& outcome() const { return outcome_; }
  const std::vector<cli::CaptureNote>& notes() const { return notes_; }

 private:
  // Messages decoded ahead of the reader at most, and how many the reader
  // takes at once, so that the two threads seldom wake each other.
  static constexpr size_t kAhead = 512;
  static constexpr size_t kBatch = 64;
  struct Cancelled {};

  void Read(const std::string& path, cli::Pass pass);
  void Push(DecodedMessage message);
  void Finish(cli::CaptureOutcome outcome, std::exception_ptr failure);

  std::mutex mutex_;
  std::condition_variable changed_;
  std::deque<DecodedMessage> queue_;  // guarded, with the members up to taken_
  std::vector<cli::CaptureNote> pendingNotes_;
  cli::CaptureOutcome finalOutcome_;
  std::exception_ptr failure_;
  bool finished_ = false;
  bool cancelled_ = false;

  std::deque<DecodedMessage> taken_;  // the reader's, taken from the queue in one go
  cli::CaptureOutcome outcome_;
  std::vector<cli::CaptureNote> notes_;
  bool ended_ = false;
  std::string path_;
  std::thread thread_;
};

}  // namespace rnsap::python
