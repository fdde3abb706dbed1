// How a record's fields are looked at: their order, their kinds and what a new record holds.
#pragma once

#include <gtest/gtest.h>

#include <cstddef>
#include <cstring>
#include <map>
#include <new>
#include <string>
#include <type_traits>
#include <vector>

#include "vexa/vexa.h"

namespace contract {

// How a value is written in the tables below; the kind shows too.
inline std::string show(bool value) { return value ? "true" : "false"; }
inline std::string show(const std::string& value) { return '"' + value + '"'; }
template <typename Number, typename = std::enable_if_t<std::is_integral_v<Number>>>
std::string show(Number value) {
  const std::string sign = std::is_signed_v<Number> ? "i" : "u";
  return sign + std::to_string(8 * sizeof value) + " " + std::to_string(value);
}
template <typename Target>
std::string show(Target* value) {
  return value == nullptr ? "null" : "set";
}
template <typename Item>
std::string show(const std::vector<Item>& value) {
  return "list of " + std::to_string(value.size());
}
template <typename Key, typename Item>
std::string show(const std::map<Key, Item>& value) {
  return "map of " + std::to_string(value.size());
}
inline std::string show(const SLibDFixedPanTiltInfo&) { return "block of 27"; }
inline std::string show(const SLibDFixedZoomInfo&) { return "block of 9"; }
inline std::string show(const SLibDFixedFocusInfo&) { return "block of 6"; }
inline std::string show(const SLibDDetectionWindow (&)[4]) { return "4 windows"; }

struct Field {
  const char* name;
  const void* address;
  std::size_t size;
  std::size_t alignment;
  std::string actual;
  std::string expected;
};

#define FIELD(name, expected)                                                                                      \
  contract::Field {                                                                                                \
#name, &record.name, sizeof record.name, alignof(decltype(record.name)), contract::show(record.name), expected \
  }

/// A record made in memory that holds other bytes, so that a field nobody sets is seen.
template <typename Record>
class Made {
 public:
  Made() {
    std::memset(memory_, 0xA5, sizeof memory_);
    keep_bytes();
    record_ = new (memory_) Record;
    keep_bytes();
  }
  ~Made() { record_->~Record(); }
  Made(const Made&) = delete;
  Made& operator=(const Made&) = delete;

  const Record& operator*() const { return *record_; }

 private:
  // The compiler may not take the bytes for dead before the constructor, nor for unknown after it.
  void keep_bytes() { asm volatile("" : : "r"(memory_) : "memory"); }

  alignas(Record) unsigned char memory_[sizeof(Record)];
  Record* record_ = nullptr;
};

inline std::size_t rounded_up(std::size_t offset, std::size_t alignment) {
  return (offset + alignment - 1) / alignment * alignment;
}

/// The fields are all that the record has, in the order given, with the values of the table.
template <typename Record>
void expect_fields(const Record& record, const std::vector<Field>& fields) {
  const auto* begin = reinterpret_cast<const unsigned char*>(&record);
  std::size_t end = 0;
  for (const Field& field : fields) {
    EXPECT_EQ(field.actual, field.expected) << field.name;
    const auto offset = static_cast<std::size_t>(static_cast<const unsigned char*>(field.address) - begin);
    EXPECT_EQ(offset, rounded_up(end, field.alignment)) << field.name << " is not where the field before it ends";
    end = offset + field.size;
  }
  EXPECT_EQ(rounded_up(end, alignof(Record)), sizeof(Record)) << "fields behind the last one listed";
}

constexpr const char* kZero = "i32 0";
constexpr const char* kUnsignedZero = "u32 0";
constexpr const char* kFalse = "false";
constexpr const char* kTrue = "true";
constexpr const char* kEmpty = "\"\"";
constexpr const char* kNone = "\"none\"";
constexpr const char* kUnknown = "\"Unknown\"";
constexpr const char* kNull = "null";
constexpr const char* kNoItems = "list of 0";
constexpr const char* kNoEntries = "map of 0";

}  // namespace contract
