// SPDX-License-Identifier: Apache-2.0
// What CLibraryDevice itself answers, and what it does to records.
#include <gtest/gtest.h>

#include <tuple>
#include <type_traits>
#include <vector>

#include "vexa/library_device.h"

namespace {

/// Calls an operation with arguments of its kinds, each freshly made.
template <typename Result, typename... Arguments>
Result call_fresh(CLibraryDevice& device, Result (CLibraryDevice::*operation)(Arguments...)) {
  std::tuple<std::remove_cv_t<std::remove_reference_t<Arguments>>...> arguments;
  return std::apply([&](auto&... argument) { return (device.*operation)(argument...); }, arguments);
}

TEST(BaseAnswers, EveryOperationReturnsTheTablesResult) {
  CLibraryDevice device;
#define OPERATION(slot, result, name, parameters, answer)                                                         \
  EXPECT_EQ(call_fresh(device, static_cast<result(CLibraryDevice::*) parameters>(&CLibraryDevice::name)), answer) \
      << "slot " #slot ", " #name;
#include "operations.inc"
#undef OPERATION
}

template <typename Item>
std::vector<Item> three() {
  return std::vector<Item>(3);
}

TEST(BaseAnswers, ClearFixedCameraInfoEmptiesTheListsAndKeepsTheRest) {
  SLibDFixedCameraInfo info;
  info.codecs = three<SLibDVideoCodecInfo>();
  info.reserved2 = three<std::string>();
  info.electronicFlip = 1;
  info.reserved4 = three<std::int32_t>();
  info.streamCount1 = 2;
  info.streamCount2 = 3;
  for (bool* flag : {&info.flag1, &info.flag2, &info.flag3, &info.flag4, &info.flag5, &info.flag6}) *flag = true;
  std::int32_t next = 4;
  for (std::int32_t* value : {&info.value1, &info.value2, &info.value3, &info.value4, &info.value5}) *value = next++;

  EXPECT_EQ(CLibraryDevice().ClearFixedCameraInfo(info), LIBD_OK);

  EXPECT_TRUE(info.codecs.empty() && info.reserved2.empty() && info.reserved4.empty());
  EXPECT_EQ(std::tie(info.electronicFlip, info.streamCount1, info.streamCount2), std::make_tuple(1, 2, 3));
  EXPECT_TRUE(info.flag1 && info.flag2 && info.flag3 && info.flag4 && info.flag5 && info.flag6);
  EXPECT_EQ(std::tie(info.value1, info.value2, info.value3, info.value4, info.value5), std::make_tuple(4, 5, 6, 7, 8));
}

TEST(BaseAnswers, ClearFixedAudioInfoEmptiesTheListsAndKeepsTheRest) {
  SLibDFixedAudioInfo info{three<SLibDAudioCodecInfo>(), three<SLibDAudioCodecInfo>(), three<SLibDCommonParameterInt>(),
                           three<SLibDCommonParameterInt>(), 1};
  EXPECT_EQ(CLibraryDevice().ClearFixedAudioInfo(info), LIBD_OK);
  EXPECT_TRUE(info.inputCodecs.empty() && info.outputCodecs.empty());
  EXPECT_TRUE(info.reserved3.empty() && info.reserved4.empty());
  EXPECT_EQ(info.available, 1);
}

TEST(BaseAnswers, ClearFixedPTZControlInfoEmptiesTheListsAndKeepsTheRest) {
  SLibDFixedPTZControlInfo info;
  info.reserved1 = three<SLibDCommonParameterInt>();
  info.zoomSteps = three<SLibDZoomRatioInt>();
  info.brightModes = three<SLibDBrightModeInfo>();
  info.dayNightModes = three<SLibDDayNightModeInfo>();
  info.noMoveSpeed = info.reserved3 = info.reserved12 = info.reserved13 = true;
  std::int32_t* const kept[] = {&info.panTilt.reserved1, &info.panTilt.tiltOffset, &info.reserved5,
                                &info.zoom.minSpeed,     &info.zoom.reserved9,     &info.reserved8,
                                &info.focus.minSpeed,    &info.focus.reserved6,    &info.reserved10,
                                &info.presetCount,       &info.tourCount,          &info.shadowTourCount};
  for (std::size_t i = 0; i < std::size(kept); ++i) *kept[i] = static_cast<std::int32_t>(i) + 1;

  EXPECT_EQ(CLibraryDevice().ClearFixedPTZControlInfo(info), LIBD_OK);

  EXPECT_TRUE(info.reserved1.empty() && info.zoomSteps.empty());
  EXPECT_TRUE(info.brightModes.empty() && info.dayNightModes.empty());
  EXPECT_TRUE(info.noMoveSpeed && info.reserved3 && info.reserved12 && info.reserved13);
  for (std::size_t i = 0; i < std::size(kept); ++i) EXPECT_EQ(*kept[i], static_cast<std::int32_t>(i) + 1) << i;
}

TEST(BaseAnswers, ClearCameraTourInfoEmptiesTheMapAndKeepsTheRest) {
  SLibDCameraTourInfo info{true, 30, {{1, {}}, {2, {}}}};
  EXPECT_EQ(CLibraryDevice().ClearCameraTourInfo(info), LIBD_OK);
  EXPECT_TRUE(info.tours.empty());
  EXPECT_TRUE(info.enabled);
  EXPECT_EQ(info.resumeTime, 30);
}

TEST(BaseAnswers, ClearShadowTourInfoEmptiesTheMapAndKeepsTheRest) {
  SLibDShadowTourInfo info{true, 30, 120, {{1, {}}, {2, {}}}};
  EXPECT_EQ(CLibraryDevice().ClearShadowTourInfo(info), LIBD_OK);
  EXPECT_TRUE(info.tours.empty());
  EXPECT_TRUE(info.enabled);
  EXPECT_EQ(info.resumeTime, 30);
  EXPECT_EQ(info.maxRecordTime, 120);
}

TEST(BaseAnswers, ClearDetectionParamEmptiesEachAreaAndKeepsTheRest) {
  SLibDDetectionParam param;
  param.number = 7;
  param.reserved2 = 8;
  for (int i = 0; i < 4; ++i) {
    SLibDDetectionWindow& window = param.windows[i];
    window.area = {{1, 2}, {3, 4}};
    window.enabled = i;
    window.mode = 10 + i;
    window.minObjectWidth = 20 + i;
    window.minObjectHeight = 30 + i;
    window.maxObjectWidth = 40 + i;
    window.maxObjectHeight = 50 + i;
    window.sensitivity = 60 + i;
  }

  EXPECT_EQ(CLibraryDevice().ClearDetectionParam(param), LIBD_OK);

  EXPECT_EQ(std::tie(param.number, param.reserved2), std::make_tuple(7, 8));
  for (int i = 0; i < 4; ++i) {
    const SLibDDetectionWindow& window = param.windows[i];
    EXPECT_TRUE(window.area.empty()) << i;
    EXPECT_EQ(std::tie(window.enabled, window.mode, window.minObjectWidth, window.minObjectHeight,
                       window.maxObjectWidth, window.maxObjectHeight, window.sensitivity),
              std::make_tuple(i, 10 + i, 20 + i, 30 + i, 40 + i, 50 + i, 60 + i));
  }
}

TEST(BaseAnswers, TheClearingOfWholeListsLeavesThemEmpty) {
  CLibraryDevice device;
  std::vector<SLibDPresetInfo> presets{{0, "gate"}, {1, "yard"}};
  EXPECT_EQ(device.ClearCachedPresets(presets), LIBD_OK);
  EXPECT_TRUE(presets.empty());

  std::vector<SLibDDetectionParam> params(3);
  EXPECT_EQ(device.ClearCachedObjectDetectionSetting(params), LIBD_OK);
  EXPECT_TRUE(params.empty());

  SLibDEdgeStorageRecordList list;
  list.records.resize(3);
  EXPECT_EQ(device.ClearEdgeStorageRecordList(list), LIBD_OK);
  EXPECT_TRUE(list.records.empty());
}

TEST(BaseAnswers, ARefusedOperationLeavesTheCallersRecordAlone) {
  CLibraryDevice device;
  std::string text = "the caller's";
  EXPECT_EQ(device.GetLatestErrorText(text), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(text, "the caller's");
  SLibDSystemInfo info{"a", "b", "c", "d", "e"};
  EXPECT_EQ(device.GetCurrentSystemInfo(info), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(info.maker + info.modelName + info.softwareVersion + info.serialNumber + info.macAddress, "abcde");
}

}  // namespace
