#include "cli/parallel_decoder.h"

#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <thread>

namespace rnsap::cli {
namespace {

void WriteAll(int fd, const void* data, size_t size) {
  const auto* bytes = static_cast<const uint8_t*>(data);
  while (size != 0) {
    const ssize_t written = write(fd, bytes, size);
    if (written < 0 && errno == EINTR) continue;
    if (written <= 0)
      throw std::runtime_error(std::string("a decoding worker is gone: ") + std::strerror(errno));
    bytes += written;
    size -= static_cast<size_t>(written);
  }
}

// Whether all `size` bytes came; false at an end before the first one.
bool ReadAll(int fd, void* data, size_t size) {
  auto* bytes = static_cast<uint8_t*>(data);
  for (size_t done = 0; done < size;) {
    const ssize_t got = read(fd, bytes + done, size - done);
    if (got < 0 && errno == EINTR) continue;
    if (got <= 0) {
      if (got == 0 && done == 0) return false;
      throw std::runtime_error("a decoding worker ended before its batch was done");
    }
    done += static_cast<size_t>(got);
  }
  return true;
}

template <typename Value>
void Append(std::vector<uint8_t>& out, const Value& value) {
  const auto* bytes = reinterpret_cast<const uint8_t*>(&value);
  out.insert(out.end(), bytes, bytes + sizeof value);
}

void ReadExactly(int fd, void* data, size_t size) {
  if (size != 0 && !ReadAll(fd, data, size)) {
    throw std::runtime_error("a decoding worker ended before its batch was done");
  }
}

template <typename Value>
Value Take(int fd) {
  Value value{};
  ReadExactly(fd, &value, sizeof value);
  return value;
}

// A worker's life: reads batches until the reading process closes its pipe,
// and answers each with what it printed.
[[noreturn]] void ServeBatches(int input, int output, const std::string& path,
                               const CapturePrinting& printing, const PrinterFactory& makePrinter) {
  try {
    fmt::memory_buffer out;
    const std::unique_ptr<MessagePrinter> printer = makePrinter(out);
    std::vector<uint8_t> octets;
    uint32_t count = 0;
    while (ReadAll(input, &count, sizeof count)) {
      for (uint32_t message = 0; message < count; ++message) {
        const auto index = Take<uint64_t>(input);
        const auto frame = Take<FrameStamp>(input);
        octets.resize(Take<uint32_t>(input));
        ReadExactly(input, octets.data(), octets.size());
        PrintMessage({index, path, &frame, static_cast<uint32_t>(octets.size()), printing.pass},
                     octets, printing.decode, *printer);
      }
      const uint64_t size = out.size();
      WriteAll(output, &size, sizeof size);
      WriteAll(output, out.data(), out.size());
      out.clear();
    }
    _exit(0);
  } catch (...) {
    _exit(1);
  }
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
  int toWorker[2];
  int fromWorker[2];
  const pid_t pid = pipe(toWorker) == 0 && pipe(fromWorker) == 0 ? fork() : -1;
  if (pid < 0) {
    throw std::runtime_error(std::string("cannot start a decoding worker: ") +
                             std::strerror(errno));
  }
  if (pid == 0) {
    // The pipes of the workers started before belong to the reading process.
    for (const Worker& earlier : workers_) {
      close(earlier.toWorker);
      close(earlier.fromWorker);
    }
    close(toWorker[1]);
    close(fromWorker[0]);
    ServeBatches(toWorker[0], fromWorker[1], path, printing, makePrinter);
  }
  close(toWorker[0]);
  close(fromWorker[1]);
  workers_.push_back({pid, toWorker[1], fromWorker[0]});
}

ParallelDecoder::~ParallelDecoder() {
  for (const Worker& worker : workers_) {
    close(worker.toWorker);
    close(worker.fromWorker);
  }
  for (const Worker& worker : workers_) waitpid(worker.pid, nullptr, 0);
}

void ParallelDecoder::Message(size_t index, const CapturedMessage& message) {
  Append(batch_, uint64_t{index});
  Append(batch_, message.frame);
  Append(batch_, static_cast<uint32_t>(message.octets.size()));
  batch_.insert(batch_.end(), message.octets.begin(), message.octets.end());
  if (++batchMessages_ == kBatchMessages) SendBatch();
}

void ParallelDecoder::Drain() {
  if (batchMessages_ != 0) SendBatch();
  while (!sent_.empty()) WriteOldestBatch();
}

void ParallelDecoder::SendBatch() {
  // Each worker holds one batch at most; round robin makes the next worker's
  // the oldest, so what it printed is written first.
  if (sent_.size() == workers_.size()) WriteOldestBatch();
  const Worker& worker = workers_[next_];
  WriteAll(worker.toWorker, &batchMessages_, sizeof batchMessages_);
  WriteAll(worker.toWorker, batch_.data(), batch_.size());
  sent_.push_back(next_);
  next_ = (next_ + 1) % workers_.size();
  batch_.clear();
  batchMessages_ = 0;
}

void ParallelDecoder::WriteOldestBatch() {
  const int fromWorker = workers_[sent_.front()].fromWorker;
  sent_.pop_front();
  const auto size = Take<uint64_t>(fromWorker);
  fmt::memory_buffer& out = writer_.buffer();
  const size_t start = out.size();
  out.resize(start + size);
  ReadExactly(fromWorker, out.data() + start, size);
  // Where the workers' partial results of the batch (statistics, traces)
  // join the reading process's, in capture order.
  writer_.EndMessage();
}

}  // namespace rnsap::cli
