// SPDX-License-Identifier: Apache-2.0
// The resolution filter: which codecs and picture sizes a camera model offers under given properties.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "vexa/common_types.h"
#include "vexa/export.h"

/// Narrows a camera model's codecs and sizes by criteria that the camera reports. A library of its own
/// (libVexaCommonFilter.so.1), so that a host can put another in its place. One thread at a time may use an object. No
/// operation blocks or reports a failure; what cannot be used is ignored. Running out of memory throws std::bad_alloc.
class VEXA_API CResolutionFilterFacade {
 public:
  CResolutionFilterFacade();
  ~CResolutionFilterFacade();
  CResolutionFilterFacade(const CResolutionFilterFacade&) = delete;
  CResolutionFilterFacade& operator=(const CResolutionFilterFacade&) = delete;

  /// Forgets all criteria and takes the table of `model`; an unknown model gets the general table.
  void Initialize(const std::string& model);
  /// Sets one criterion: "ImageMaxSizeFilter" and "VideoCapSizeFilter" take "width,height" in pixels,
  /// "SolidPTZFilter" takes "on" or "off". Unknown items and values that cannot be read are ignored.
  void SetFilterItemCriteria(const std::string& item, const std::string& value);
  /// Replaces `out` by the codecs and sizes that all criteria leave, sizes from the largest to the smallest.
  void GetFilteredResolutionList(std::vector<SLibDVideoCodecInfo>& out);

 private:
  struct Criteria;
  std::unique_ptr<Criteria> criteria_;
};
