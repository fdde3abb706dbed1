// SPDX-License-Identifier: Apache-2.0
// The places of the operations in the virtual table. Hosts built elsewhere call by place.
#include <gtest/gtest.h>

#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <new>
#include <string>
#include <type_traits>
#include <vector>

#include "vexa/vexa.h"

namespace {

constexpr int kFirstOperation = 2;
constexpr int kOperations = 111;

int g_complete_destructions = 0;
int g_releases = 0;

/// Notes the name and the arguments of the operation that was reached.
template <typename Device>
class Recorder : public Device {
 public:
  ~Recorder() override { ++g_complete_destructions; }

  static void* operator new(std::size_t size) { return ::operator new(size); }
  static void* operator new(std::size_t, void* place) { return place; }
  static void operator delete(void* object) {
    ++g_releases;
    ::operator delete(object);
  }
  static void operator delete(void*, void*) {}

#define OPERATION(slot, result, name, parameters, answer) \
  result name parameters override {                       \
    reached_ = #name #parameters;                         \
    return {};                                            \
  }
#include "operations.inc"
#undef OPERATION

  std::string take_reached() { return std::exchange(reached_, {}); }

 private:
  std::string reached_;
};

struct SlotRow {
  int slot;
  const char* operation;
};

constexpr SlotRow kSlots[] = {
#define OPERATION(slot, result, name, parameters, answer) {slot, #name #parameters},
#include "operations.inc"
#undef OPERATION
};

/// The `slot`th entry of the object's virtual table.
void* entry_of(const void* object, int slot) {
  void* const* table = nullptr;
  std::memcpy(&table, object, sizeof table);
  return table[slot];
}

/// Calls as a host does that knows nothing but the place; arguments beyond those that are declared go unread.
void call_slot(void* object, int slot) {
  using Entry = int (*)(void*, void*, void*, void*, void*, void*);
  void* const code = entry_of(object, slot);
  Entry entry = nullptr;
  std::memcpy(&entry, &code, sizeof entry);
  entry(object, nullptr, nullptr, nullptr, nullptr, nullptr);
}

/// The place a pointer to a virtual member names: its first word is one more than the place's offset in the table.
template <typename Operation>
int slot_of(Operation operation) {
  std::ptrdiff_t word = 0;
  static_assert(sizeof operation == 2 * sizeof word);
  std::memcpy(&word, &operation, sizeof word);
  return (word & 1) != 0 ? static_cast<int>((word - 1) / static_cast<std::ptrdiff_t>(sizeof(void*))) : -1;
}

template <typename Device>
class Slots : public testing::Test {};
using Devices = testing::Types<CLibraryDevice, CVexaCommon, CVexaHeronCommon, CVexaMarlinCommon, CVexaSimpleHDCommon,
                               CVexaSimplePTZCommon>;
TYPED_TEST_SUITE(Slots, Devices);

TYPED_TEST(Slots, EveryOperationIsReachedThroughItsPlace) {
  Recorder<TypeParam> device;
  for (const SlotRow& row : kSlots) {
    call_slot(&device, row.slot);
    EXPECT_EQ(device.take_reached(), row.operation) << "slot " << row.slot;
  }
}

TYPED_TEST(Slots, TheFirstDestructorLeavesTheMemoryAndTheSecondReleasesIt) {
  using Device = Recorder<TypeParam>;
  g_complete_destructions = 0;
  g_releases = 0;
  auto* first = new Device;
  call_slot(first, 0);
  EXPECT_EQ(g_complete_destructions, 1);
  EXPECT_EQ(g_releases, 0);
  Device::operator delete(first);

  g_releases = 0;
  auto* second = new Device;
  call_slot(second, 1);
  EXPECT_EQ(g_complete_destructions, 2);
  EXPECT_EQ(g_releases, 1);
}

TEST(SlotTable, ListsEveryPlaceOnceAndInOrder) {
  ASSERT_EQ(std::size(kSlots), static_cast<std::size_t>(kOperations));
  for (int i = 0; i < kOperations; ++i) EXPECT_EQ(kSlots[i].slot, kFirstOperation + i);
}

TEST(SlotTable, PointersToOperationsNameTheSamePlaces) {
#define OPERATION(slot, result, name, parameters, answer) \
  EXPECT_EQ(slot_of(static_cast<result(CLibraryDevice::*) parameters>(&CLibraryDevice::name)), slot) << #name;
#include "operations.inc"
#undef OPERATION
}

TEST(SlotTable, TheContractEndsWithSlot112) {
  struct OneMore : CLibraryDevice {
    virtual void Next() {}
  };
  EXPECT_EQ(slot_of(&OneMore::Next), 113);
}

TEST(SlotTable, TheDriverAddsOneOperationInSlot113) {
  struct OneMore : CVexaCommon {
    virtual void Next() {}
  };
  EXPECT_EQ(slot_of(&CVexaCommon::InitializeFixedVideoParams), 113);
  EXPECT_EQ(slot_of(&OneMore::Next), 114);
}

template <typename Variant>
class VariantSlots : public testing::Test {};
using Variants = testing::Types<CVexaHeronCommon, CVexaMarlinCommon, CVexaSimpleHDCommon, CVexaSimplePTZCommon>;
TYPED_TEST_SUITE(VariantSlots, Variants);

TYPED_TEST(VariantSlots, AVariantAddsNoOperation) {
  struct OneMore : TypeParam {
    virtual void Next() {}
  };
  EXPECT_EQ(slot_of(&OneMore::Next), 114);
}

TEST(SlotTable, TheDriversOwnOperationIsReachedThroughSlot113) {
  struct Model : CVexaCommon {
    ELibDReturnCode InitializeFixedVideoParams(ELibDVideoStandard, int, int) override {
      ++calls;
      return LIBD_OK;
    }
    int calls = 0;
  } model;
  call_slot(&model, 113);
  EXPECT_EQ(model.calls, 1);
}

TEST(SlotTable, TheSinkOfFramesHasWriteInItsFirstPlace) {
  struct Sink final : CDataSink {
    void Write(const unsigned char*, unsigned int) override { ++writes; }
    int writes = 0;
  } sink;
  call_slot(&sink, 0);
  EXPECT_EQ(sink.writes, 1);
  EXPECT_EQ(slot_of(&CDataSink::Write), 0);
}

static_assert(sizeof(CLibraryDevice) == sizeof(void*), "the contract has no data members");
static_assert(std::is_base_of_v<CLibraryDevice, CVexaCommon> && std::is_convertible_v<CVexaCommon*, CLibraryDevice*>);

}  // namespace
