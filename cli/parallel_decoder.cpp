#include "cli/parallel_decoder.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <string_view>
#include <thread>
#include <type_traits>

namespace rnsap::cli {
namespace {

// Messages per batch: enough that the pipe traffic costs little beside the
// decoding, few enough that their printed lines usually fit a slot.
constexpr uint32_t kBatchMessages = 256;
// Batches a worker holds at once, each with its slot: the worker goes on
// decoding while the reading process writes out what it printed before.
constexpr size_t kBatchesPerWorker = 4;
constexpr size_t kSlotSize = 8 << 20;
// Room in each pipe for several batches' requests.
constexpr int kPipeSize = 1 << 20;

[[noreturn]] void Fail(std::string_view what) {
  throw std::runtime_error(std::string(what) + ": " + std::strerror(errno));
}

void WriteAll(int fd, const void* data, size_t size) {
  const auto* bytes = static_cast<const uint8_t*>(data);
  while (size != 0) {
    const ssize_t written = write(fd, bytes, size);
    if (written < 0 && errno == EINTR) continue;
    if (written <= 0) Fail("a decoding worker is gone");
    bytes += written;
    size -= static_cast<size_t>(written);
  }
}

// Whether all `size` bytes came before the pipe's end.
bool ReadAll(int fd, void* data, size_t size) {
  auto* bytes = static_cast<uint8_t*>(data);
  for (size_t done = 0; done < size;) {
    const ssize_t got = read(fd, bytes + done, size - done);
    if (got < 0 && errno == EINTR) continue;
    if (got <= 0) return false;
    done += static_cast<size_t>(got);
  }
  return true;
}

template <typename Value>
requires std::is_trivially_copyable_v<Value>
void Append(std::vector<uint8_t>& out, const Value& value) {
  const auto* bytes = reinterpret_cast<const uint8_t*>(&value);
  out.insert(out.end(), bytes, bytes + sizeof value);
}

// The messages of a batch as the reading process packed them.
class BatchReader {
 public:
  explicit BatchReader(std::span<const uint8_t> bytes) : bytes_(bytes) {}

  bool AtEnd() const { return bytes_.empty(); }

  template <typename Value>
  Value Take() {
    Value value{};
    std::memcpy(&value, TakeSpan(sizeof value).data(), sizeof value);
    return value;
  }

  std::span<const uint8_t> TakeSpan(size_t size) {
    if (size > bytes_.size()) throw std::runtime_error("a batch ends in the middle of a message");
    const std::span<const uint8_t> taken = bytes_.first(size);
    bytes_ = bytes_.subspan(size);
    return taken;
  }

 private:
  std::span<const uint8_t> bytes_;
};

// A batch's printed lines as the worker hands them over: into its slot while
// there is room, the rest kept for the pipe.
class BatchOutput {
 public:
  explicit BatchOutput(std::span<char> slot) : slot_(slot) {}

  void Add(const fmt::memory_buffer& lines) {
    const size_t fitting = std::min(lines.size(), slot_.size() - inSlot_);
    std::memcpy(slot_.data() + inSlot_, lines.data(), fitting);
    inSlot_ += fitting;
    overflow_.insert(overflow_.end(), lines.data() + fitting, lines.data() + lines.size());
  }

  void Send(int output) const {
    const ParallelDecoder::ResultHead head{inSlot_, overflow_.size()};
    WriteAll(output, &head, sizeof head);
    WriteAll(output, overflow_.data(), overflow_.size());
  }

 private:
  std::span<char> slot_;
  size_t inSlot_ = 0;
  std::vector<char> overflow_;
};

// A worker's life: reads batches until the reading process closes its pipe,
// prints each into the next of its slots and reports what it printed.
[[noreturn]] void ServeBatches(int input, int output, std::span<char> slots,
                               const std::string& path, const CapturePrinting& printing,
                               const PrinterFactory& makePrinter) {
  try {
    fmt::memory_buffer lines;
    const std::unique_ptr<MessagePrinter> printer = makePrinter(lines);
    std::vector<uint8_t> batch;
    uint64_t size = 0;
    for (size_t number = 0; ReadAll(input, &size, sizeof size); ++number) {
      batch.resize(size);
      if (!ReadAll(input, batch.data(), batch.size())) break;
      BatchOutput out(slots.subspan(number % kBatchesPerWorker * kSlotSize, kSlotSize));
      for (BatchReader reader(batch); !reader.AtEnd();) {
        const auto index = reader.Take<uint64_t>();
        const auto frame = reader.Take<FrameStamp>();
        const auto origin = reader.Take<MessageOrigin>();
        const auto octets = reader.TakeSpan(reader.Take<uint32_t>());
        const auto size = static_cast<uint32_t>(octets.size());
        PrintMessage({index, path, &frame, &origin, size, printing.pass}, octets, printing.decode,
                     *printer);
        out.Add(lines);
        lines.clear();
      }
      out.Send(output);
    }
    _exit(0);
  } catch (...) {
    _exit(1);
  }
}

std::span<char> MapSlots() {
  void* slots = mmap(nullptr, kBatchesPerWorker * kSlotSize, PROT_READ | PROT_WRITE,
                     MAP_SHARED | MAP_ANONYMOUS, -1, 0);
  if (slots == MAP_FAILED) Fail("cannot map memory for a decoding worker");
  return {static_cast<char*>(slots), kBatchesPerWorker * kSlotSize};
}

void OpenPipe(int (&ends)[2]) {
  if (pipe(ends) != 0) Fail("cannot start a decoding worker");
  // A smaller pipe only means more turns; the default serves.
  fcntl(ends[1], F_SETPIPE_SZ, kPipeSize);
}

}  // namespace

unsigned WorkerCount(unsigned requested) {
  return requested != 0 ? requested : std::max(1u, std::thread::hardware_concurrency());
}

ParallelDecoder::ParallelDecoder(unsigned workers, const std::string& path,
                                 const CapturePrinting& printing, const PrinterFactory& makePrinter)
    : writer_(printing.writer) {
  workers_.reserve(workers);
  for (unsigned started = 0; started < workers; ++started) Start(path, printing, makePrinter);
}

void ParallelDecoder::Start(const std::string& path, const CapturePrinting& printing,
                            const PrinterFactory& makePrinter) {
  const std::span<char> slots = MapSlots();
  int toWorker[2];
  int fromWorker[2];
  OpenPipe(toWorker);
  OpenPipe(fromWorker);
  const pid_t pid = fork();
  if (pid < 0) Fail("cannot start a decoding worker");
  if (pid == 0) {
    // The pipes of the workers started before belong to the reading process.
    for (const Worker& earlier : workers_) {
      close(earlier.toWorker);
      close(earlier.fromWorker);
    }
    close(toWorker[1]);
    close(fromWorker[0]);
    ServeBatches(toWorker[0], fromWorker[1], slots, path, printing, makePrinter);
  }
  close(toWorker[0]);
  close(fromWorker[1]);
  fcntl(toWorker[1], F_SETFL, O_NONBLOCK);
  fcntl(fromWorker[0], F_SETFL, O_NONBLOCK);
  Worker& worker = workers_.emplace_back();
  worker.pid = pid;
  worker.toWorker = toWorker[1];
  worker.fromWorker = fromWorker[0];
  worker.slots = slots;
}

ParallelDecoder::~ParallelDecoder() {
  for (const Worker& worker : workers_) {
    close(worker.toWorker);
    close(worker.fromWorker);
  }
  for (const Worker& worker : workers_) {
    waitpid(worker.pid, nullptr, 0);
    munmap(worker.slots.data(), worker.slots.size());
  }
}

void ParallelDecoder::Message(size_t index, const CapturedMessage& message) {
  Append(batch_, uint64_t{index});
  Append(batch_, message.frame);
  Append(batch_, message.origin);
  Append(batch_, static_cast<uint32_t>(message.octets.size()));
  batch_.insert(batch_.end(), message.octets.begin(), message.octets.end());
  if (++batchMessages_ == kBatchMessages) SendBatch();
}

void ParallelDecoder::Drain() {
  if (batchMessages_ != 0) SendBatch();
  while (!batches_.empty()) Pump();
}

void ParallelDecoder::SendBatch() {
  Worker& worker = LeastBusyWorker();
  const size_t slot = worker.batchesSent++ % kBatchesPerWorker * kSlotSize;
  Batch& batch = batches_.emplace_back();
  batch.worker = static_cast<size_t>(&worker - workers_.data());
  batch.slot = worker.slots.subspan(slot, kSlotSize);
  worker.awaited.push_back(firstBatch_ + batches_.size() - 1);
  ++worker.unwritten;
  Append(worker.requests, uint64_t{batch_.size()});
  worker.requests.insert(worker.requests.end(), batch_.begin(), batch_.end());
  SendRequests(worker);
  batch_.clear();
  batchMessages_ = 0;
}

// The worker with the fewest batches, once one has a free slot.
ParallelDecoder::Worker& ParallelDecoder::LeastBusyWorker() {
  for (;;) {
    Worker& least = *std::min_element(
        workers_.begin(), workers_.end(),
        [](const Worker& a, const Worker& b) { return a.unwritten < b.unwritten; });
    if (least.unwritten < kBatchesPerWorker) return least;
    Pump();
  }
}

// Waits until a pipe is ready, moves what it can and writes the batches
// finished in turn.
void ParallelDecoder::Pump() {
  polled_.clear();
  for (const Worker& worker : workers_) {
    if (!worker.awaited.empty()) polled_.push_back({worker.fromWorker, POLLIN, 0});
    if (worker.requestsTaken < worker.requests.size()) {
      polled_.push_back({worker.toWorker, POLLOUT, 0});
    }
  }
  if (poll(polled_.data(), polled_.size(), -1) < 0 && errno != EINTR)
    Fail("cannot wait on the decoding workers");
  for (Worker& worker : workers_) {
    SendRequests(worker);
    TakeResults(worker);
  }
  WriteFinishedBatches();
}

void ParallelDecoder::SendRequests(Worker& worker) {
  while (worker.requestsTaken < worker.requests.size()) {
    const ssize_t written = write(worker.toWorker, worker.requests.data() + worker.requestsTaken,
                                  worker.requests.size() - worker.requestsTaken);
    if (written < 0 && errno == EINTR) continue;
    if (written < 0 && errno == EAGAIN) return;
    if (written < 0) Fail("a decoding worker is gone");
    worker.requestsTaken += static_cast<size_t>(written);
  }
  worker.requests.clear();
  worker.requestsTaken = 0;
}

// Reads the results that have come, as far as they have come.
void ParallelDecoder::TakeResults(Worker& worker) {
  while (!worker.awaited.empty()) {
    Batch& batch = batches_[worker.awaited.front() - firstBatch_];
    if (!ReadSome(worker.fromWorker, &worker.head, sizeof worker.head, worker.headRead)) return;
    batch.inSlot = worker.head.inSlot;
    batch.overflow.resize(worker.head.inPipe);
    if (!ReadSome(worker.fromWorker, batch.overflow.data(), batch.overflow.size(),
                  worker.overflowRead)) {
      return;
    }
    batch.done = true;
    worker.awaited.pop_front();
    worker.headRead = worker.overflowRead = 0;
  }
}

// Reads on towards `size` bytes; whether all have come.
bool ParallelDecoder::ReadSome(int fd, void* data, size_t size, size_t& done) {
  while (done < size) {
    const ssize_t got = read(fd, static_cast<char*>(data) + done, size - done);
    if (got < 0 && errno == EINTR) continue;
    if (got < 0 && errno == EAGAIN) return false;
    if (got <= 0) throw std::runtime_error("a decoding worker ended before its batch was done");
    done += static_cast<size_t>(got);
  }
  return true;
}

void ParallelDecoder::WriteFinishedBatches() {
  while (!batches_.empty() && batches_.front().done) {
    const Batch& batch = batches_.front();
    writer_.Write({batch.slot.data(), batch.inSlot});
    writer_.Write({batch.overflow.data(), batch.overflow.size()});
    // Where the workers' partial results of the batch (statistics, traces)
    // join the reading process's, in capture order.
    writer_.EndMessage();
    --workers_[batch.worker].unwritten;
    batches_.pop_front();
    ++firstBatch_;
  }
}

}  // namespace rnsap::cli
