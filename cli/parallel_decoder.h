// The messages of a capture decoded by worker processes, each with its own
// copy of the module and host, since one process runs one pass at a time.
// The reading process hands them complete messages in batches, round robin,
// and writes what each batch printed in the order the batches were sent, so
// that the output is the same as when one process decodes in turn.
#pragma once

#include <sys/types.h>

#include <cstddef>
#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "cli/capture_run.h"
#include "cli/output_writer.h"

namespace rnsap::cli {

using PrinterFactory = std::function<std::unique_ptr<MessagePrinter>(fmt::memory_buffer&)>;

class ParallelDecoder final : public MessageDispatch {
 public:
  // Starts `workers` processes for the capture at `path`; each prints with a
  // printer from `makePrinter` what `decode` reports.
  ParallelDecoder(unsigned workers, const std::string& path, const CapturePrinting& printing,
                  const PrinterFactory& makePrinter);
  // Ends the workers; what they still held is lost (Drain first).
  ~ParallelDecoder() override;
  ParallelDecoder(const ParallelDecoder&) = delete;
  ParallelDecoder& operator=(const ParallelDecoder&) = delete;

  void Message(size_t index, const CapturedMessage& message) override;
  void Drain() override;

 private:
  static constexpr uint32_t kBatchMessages = 256;

  struct Worker {
    pid_t pid = -1;
    int toWorker = -1;
    int fromWorker = -1;
  };

  void Start(const std::string& path, const CapturePrinting& printing,
             const PrinterFactory& makePrinter);
  void SendBatch();
  void WriteOldestBatch();

  std::vector<Worker> workers_;
  std::deque<size_t> sent_;  // the workers holding a batch, oldest first
  size_t next_ = 0;          // the worker of the next batch
  std::vector<uint8_t> batch_;
  uint32_t batchMessages_ = 0;
  OutputWriter& writer_;
};

// The worker processes -j asks for: `requested`, or one per core for 0.
unsigned WorkerCount(unsigned requested);

}  // namespace rnsap::cli
