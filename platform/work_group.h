#pragma once

#include <chrono>
#include <memory>

/// A counter of outstanding work that a thread can wait on.
///
/// A WorkGroup is a handle: copies share one counter. A default-made handle is absent (it has no
/// counter); only `operator bool` and destruction may be used on it. Every operation may be called
/// from any thread.
class WorkGroup {
 public:
  class Membership;

  /// An absent group.
  WorkGroup() = default;

  /// A new group with nothing outstanding; an absent one when the platform has none to give. The
  /// one that ships always has.
  static WorkGroup create();

  /// Whether this handle has a counter.
  explicit operator bool() const { return state != nullptr; }

  /// Counts one piece of work in. Each call is matched by exactly one `leave`.
  void enter() const;

  /// Counts one piece of work out; the last one releases every waiter.
  void leave() const;

  /// Blocks until nothing is outstanding; returns at once when nothing is.
  void wait() const;

  /// As `wait`, but gives up after `timeout`, measured on the monotonic clock from the call.
  /// Returns false when the time ran out with work still outstanding.
  [[nodiscard]] bool waitFor(std::chrono::nanoseconds timeout) const;

 private:
  struct State;

  std::shared_ptr<State> state;
};

/// One piece of outstanding work that counts itself: the group is entered when a membership is made
/// and once more for each copy, and left when each is destroyed. A closure that captures one keeps
/// the group entered for as long as any copy of the closure lives. A moved-from membership counts
/// nothing. May be made and destroyed on any thread.
class WorkGroup::Membership {
 public:
  /// Enters `joined`, which must not be absent.
  explicit Membership(WorkGroup joined);
  Membership(const Membership& other);
  Membership(Membership&& other) noexcept = default;
  Membership& operator=(const Membership&) = delete;
  Membership& operator=(Membership&&) = delete;
  ~Membership();

 private:
  WorkGroup group;
};
