#include "python/native/capture_stream.h"

#include <utility>

namespace rnsap::python {

CaptureStream::CaptureStream(std::string path, cli::Pass pass)
    : path_(std::move(path)), thread_([this, pass] { Read(path_, pass); }) {}

CaptureStream::~CaptureStream() {
  {
    const std::lock_guard lock(mutex_);
    cancelled_ = true;
  }
  changed_.notify_all();
  thread_.join();
}

void CaptureStream::Read(const std::string& path, cli::Pass pass) {
  cli::CaptureOutcome outcome;
  std::exception_ptr failure;
  try {
    outcome = cli::ReadCapture(path, {[&](const cli::CapturedMessage& message) {
                                        DecodedMessage decoded =
                                            DecodeMessage(pass, message.octets);
                                        decoded.frame = message.frame;
                                        decoded.origin = message.origin;
                                        Push(std::move(decoded));
                                      },
                                      [&](const cli::CaptureNote& note) {
                                        const std::lock_guard lock(mutex_);
                                        pendingNotes_.push_back(note);
                                      }});
  } catch (const Cancelled&) {
  } catch (...) {
    failure = std::current_exception();
  }
  Finish(std::move(outcome), failure);
}

void CaptureStream::Push(DecodedMessage message) {
  std::unique_lock lock(mutex_);
  changed_.wait(lock, [this] { return cancelled_ || queue_.size() < kAhead; });
  if (cancelled_) throw Cancelled{};
  queue_.push_back(std::move(message));
  const bool batchReady = queue_.size() == kBatch;
  lock.unlock();
  if (batchReady) changed_.notify_all();
}

void CaptureStream::Finish(cli::CaptureOutcome outcome, std::exception_ptr failure) {
  {
    const std::lock_guard lock(mutex_);
    finalOutcome_ = std::move(outcome);
    failure_ = failure;
    finished_ = true;
  }
  changed_.notify_all();
}

std::optional<DecodedMessage> CaptureStream::Next() {
  if (taken_.empty() && !ended_) {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [this] { return finished_ || queue_.size() >= kBatch; });
    taken_.swap(queue_);
    notes_.insert(notes_.end(), pendingNotes_.begin(), pendingNotes_.end());
    pendingNotes_.clear();
    if (taken_.empty()) {
      ended_ = true;
      outcome_ = finalOutcome_;
      if (failure_) std::rethrow_exception(std::exchange(failure_, nullptr));
      if (!outcome_.failure.empty()) {
        throw CaptureError(path_ + ": error: " + outcome_.failure);
      }
    }
    lock.unlock();
    changed_.notify_all();
  }
  if (taken_.empty()) return std::nullopt;
  DecodedMessage message = std::move(taken_.front());
  taken_.pop_front();
  return message;
}

}  // namespace rnsap::python
