// The messages of a capture decoded by worker processes, each with its own
// copy of the module and host, since one process runs one pass at a time.
// The reading process hands them complete messages in batches and writes
// what each batch printed in the order the batches were sent, so that the
// output is the same as when one process decodes in turn. A worker prints a
// batch into a slot of memory it shares with the reading process, which
// writes the slot out without copying it; what does not fit the slot comes
// through the worker's result pipe. The reading process never waits on a
// full pipe: it polls the workers' pipes and takes results as they come.
#pragma once

#include <poll.h>
#include <sys/types.h>

#include <cstddef>
#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <span>
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

  // What a worker reports of a batch it printed: the octets in its slot and
  // those that follow through the pipe.
  struct ResultHead {
    uint64_t inSlot = 0;
    uint64_t inPipe = 0;
  };

 private:
  struct Batch {
    size_t worker = 0;
    std::span<const char> slot;
    bool done = false;
    uint64_t inSlot = 0;
    std::vector<char> overflow;
  };

  struct Worker {
    pid_t pid = -1;
    int toWorker = -1;
    int fromWorker = -1;
    std::span<char> slots;          // kBatchesPerWorker slots, shared
    size_t batchesSent = 0;         // picks the slot of the next batch
    size_t unwritten = 0;           // batches sent whose output is not written yet
    std::deque<size_t> awaited;     // positions in batches_ of results to come
    std::vector<uint8_t> requests;  // bytes for the request pipe not yet taken
    size_t requestsTaken = 0;
    ResultHead head;  // of the result being read
    size_t headRead = 0, overflowRead = 0;
  };

  void Start(const std::string& path, const CapturePrinting& printing,
             const PrinterFactory& makePrinter);
  void SendBatch();
  Worker& LeastBusyWorker();
  void Pump();
  void SendRequests(Worker& worker);
  void TakeResults(Worker& worker);
  bool ReadSome(int fd, void* data, size_t size, size_t& done);
  void WriteFinishedBatches();

  std::vector<Worker> workers_;
  std::deque<Batch> batches_;  // sent and not yet written, oldest first
  size_t firstBatch_ = 0;      // the number of batches_.front()
  std::vector<uint8_t> batch_;
  uint32_t batchMessages_ = 0;
  std::vector<pollfd> polled_;
  OutputWriter& writer_;
};

// The worker processes -j asks for: `requested`, or one per core for 0.
unsigned WorkerCount(unsigned requested);

}  // namespace rnsap::cli
