// SPDX-License-Identifier: Apache-2.0
// A text of JSON for nlohmann's parser, which says no lines itself.
#ifndef MODELS_COUNTED_TEXT_H_
#define MODELS_COUNTED_TEXT_H_

#include <cstddef>
#include <iterator>

namespace vexa::models {

// Lets the parser read characters and counts the lines up to the last one.
class CountedText {
 public:
  using iterator_category = std::input_iterator_tag;
  using value_type = char;
  using difference_type = std::ptrdiff_t;
  using pointer = const char*;
  using reference = const char&;

  CountedText(const char* at, int* line) : at_(at), line_(line) {}

  reference operator*() const { return *at_; }
  // A line ends when what follows its end is read, not when its end is.
  CountedText& operator++() {
    if (ended_line_) ++*line_;
    ended_line_ = *at_ == '\n';
    ++at_;
    return *this;
  }
  bool operator==(const CountedText& other) const { return at_ == other.at_; }
  bool operator!=(const CountedText& other) const { return at_ != other.at_; }

 private:
  const char* at_;
  int* line_;
  bool ended_line_ = false;
};

}  // namespace vexa::models

#endif  // MODELS_COUNTED_TEXT_H_
