// A change that is taken back unless it is kept.
#pragma once

#include <utility>

namespace vexa {

/// Puts `place` back as it was at the beginning, without allocating, unless the change is kept. What guards the place
/// is held for the undo's life.
template <typename Value>
class Undo {
 public:
  explicit Undo(Value& place) : place_(place), before_(place) {}
  ~Undo() {
    if (!kept_) std::swap(place_, before_);
  }
  Undo(const Undo&) = delete;
  Undo& operator=(const Undo&) = delete;

  void keep() { kept_ = true; }

 private:
  Value& place_;
  Value before_;
  bool kept_ = false;
};

/// Puts `value` into `place`; a copy that memory is too short for is missed before the place has changed.
template <typename Value>
void put_whole(Value& place, Value value) {
  place = std::move(value);
}

}  // namespace vexa
