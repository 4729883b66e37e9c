#pragma once

#include <functional>
#include <memory>
#include <string>

/// A serial work queue: closures run one at a time, in the order of their submission, on a thread
/// of the queue's own.
///
/// A WorkQueue is a handle: copies share one queue. When the last handle is released the closures
/// already submitted still run, then the thread ends; the release waits for that unless it happens
/// on the queue's own thread. Every operation may be called from any thread.
class WorkQueue {
 public:
  /// Starts a queue. `label` names it for people, in the list of threads, too.
  static WorkQueue create(std::string label);

  /// The label given at the start.
  [[nodiscard]] const std::string& label() const;

  /// Submits `work`, which is not empty, and returns at once. The closure is destroyed on the
  /// queue's thread as soon as it has run.
  void submit(std::function<void()> work) const;

 private:
  class Worker;

  WorkQueue() = default;

  std::shared_ptr<Worker> worker;
};
