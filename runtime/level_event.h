// An event that others wait for by a descriptor.
#pragma once

namespace vexa {

/// Readable from raise() to lower(). Costs a system call for each, and none while it is closed. Threads: the owner's
/// lock.
class LevelEvent {
 public:
  LevelEvent() = default;
  LevelEvent(const LevelEvent&) = delete;
  LevelEvent& operator=(const LevelEvent&) = delete;
  ~LevelEvent() { close(); }

  /// Makes the descriptor, which is close-on-exec, raised or not, unless it is there: the descriptor, or -1 with errno.
  int open(bool raised);
  void close();
  int descriptor() const { return descriptor_; }

  void raise() const;
  void lower() const;

 private:
  int descriptor_ = -1;
};

}  // namespace vexa
