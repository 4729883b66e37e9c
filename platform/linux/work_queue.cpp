#include "platform/work_queue.h"

#include <pthread.h>

#include <condition_variable>
#include <deque>
#include <mutex>
#include <thread>
#include <utility>

namespace {

/// What the thread and the handles share. The thread holds its own reference, so that a queue whose
/// last handle is released by one of its own closures ends in good order.
struct Backlog {
  std::mutex mutex;
  std::condition_variable changed;
  std::deque<std::function<void()>> waiting;  // guarded by mutex
  bool closed = false;                        // guarded by mutex
};

std::function<void()> takeNext(Backlog& backlog) {
  std::unique_lock lock(backlog.mutex);
  backlog.changed.wait(lock, [&] { return backlog.closed || !backlog.waiting.empty(); });
  if (backlog.waiting.empty()) {
    return nullptr;
  }
  auto next = std::move(backlog.waiting.front());
  backlog.waiting.pop_front();
  return next;
}

void runUntilClosed(const std::shared_ptr<Backlog>& backlog) {
  while (const auto work = takeNext(*backlog)) {
    work();
  }
}

constexpr std::size_t kLongestThreadName = 15;

}  // namespace

class WorkQueue::Worker {
 public:
  explicit Worker(std::string queueLabel)
      : label(std::move(queueLabel)), thread(runUntilClosed, backlog) {
    pthread_setname_np(thread.native_handle(), label.substr(0, kLongestThreadName).c_str());
  }

  Worker(const Worker&) = delete;
  Worker& operator=(const Worker&) = delete;

  ~Worker() {
    {
      const std::lock_guard lock(backlog->mutex);
      backlog->closed = true;
    }
    backlog->changed.notify_one();
    if (thread.get_id() == std::this_thread::get_id()) {
      thread.detach();
    } else {
      thread.join();
    }
  }

  const std::string label;
  const std::shared_ptr<Backlog> backlog = std::make_shared<Backlog>();

 private:
  std::thread thread;
};

WorkQueue::WorkQueue(std::string label) : worker(std::make_shared<Worker>(std::move(label))) {}

const std::string& WorkQueue::label() const {
  return worker->label;
}

void WorkQueue::submit(std::function<void()> work) const {
  {
    const std::lock_guard lock(worker->backlog->mutex);
    worker->backlog->waiting.push_back(std::move(work));
  }
  worker->backlog->changed.notify_one();
}
