#include "platform/work_queue.h"

#include "platform/threads.h"

#include <condition_variable>
#include <deque>
#include <mutex>
#include <optional>
#include <thread>
#include <utility>

namespace {

/// What the thread and the handles share. The thread holds its own reference, so that a queue whose
/// last handle is released by one of its own closures ends in good order.
struct Backlog {
  std::mutex mutex;
  std::condition_variable changed;
  std::deque<std::function<void()>> waiting;  ///< Guarded by `mutex`.
  bool closed = false;                        ///< Guarded by `mutex`.
};

/// The next closure, waited for; none once the queue is closed and has run everything.
std::optional<std::function<void()>> takeNext(Backlog& backlog) {
  std::unique_lock lock(backlog.mutex);
  backlog.changed.wait(lock, [&] { return backlog.closed || !backlog.waiting.empty(); });
  if (backlog.waiting.empty()) {
    return std::nullopt;
  }
  auto next = std::move(backlog.waiting.front());
  backlog.waiting.pop_front();
  return next;
}

void runUntilClosed(const std::shared_ptr<Backlog>& backlog) {
  while (const auto work = takeNext(*backlog)) {
    (*work)();
  }
}

}  // namespace

class WorkQueue::Worker {
 public:
  explicit Worker(std::string queueLabel)
      : label(std::move(queueLabel)),
        thread(startThread(label, [shared = backlog] { runUntilClosed(shared); })) {}

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

WorkQueue WorkQueue::create(std::string label) {
  WorkQueue queue;
  queue.worker = std::make_shared<Worker>(std::move(label));
  return queue;
}

const std::string& WorkQueue::label() const {
  return worker->label;
}

void WorkQueue::submit(std::function<void()> work) const {
  // The closure may release this very handle, as soon as it is in.
  const auto backlog = worker->backlog;
  {
    const std::lock_guard lock(backlog->mutex);
    backlog->waiting.push_back(std::move(work));
  }
  backlog->changed.notify_one();
}
