#include "vexa/resolution_filter.h"

#include <span>
#include <string>
#include <utility>

#include "filter/model_family.h"
#include "filter/size_criteria.h"

namespace {

using vexa::filter::CodecTable;
using vexa::filter::ModelFamily;
using vexa::filter::Size;
using vexa::filter::SizeCriteria;

SLibDResolutionInfo resolution_of(Size size) {
  SLibDResolutionInfo info;
  info.text = std::to_string(size.width) + "x" + std::to_string(size.height);
  info.width = size.width;
  info.height = size.height;
  return info;
}

struct LabelText {
  const char* before;
  const char* behind;
};

std::vector<SLibDCommonParameterInt> labelled(std::span<const int> values, LabelText label) {
  std::vector<SLibDCommonParameterInt> items;
  items.reserve(values.size());
  for (const int value : values) items.emplace_back(label.before + std::to_string(value) + label.behind, value);
  return items;
}

SLibDVideoCodecInfo codec_of(const CodecTable& table, const SizeCriteria& criteria) {
  SLibDVideoCodecInfo codec;
  codec.name = table.name;
  for (const Size size : table.sizes) {
    if (criteria.admits(size)) codec.resolutions.push_back(resolution_of(size));
  }
  codec.frameRates = labelled(table.frame_rates, {"", "fps"});
  codec.qualities = labelled(table.qualities, {"Level ", ""});
  codec.bitRates = labelled(table.bit_rates, {"", "kbit/s"});
  return codec;
}

}  // namespace

struct CResolutionFilterFacade::Criteria {
  const ModelFamily* family = &vexa::filter::family_of({});
  SizeCriteria sizes{family->largest_moving};
};

CResolutionFilterFacade::CResolutionFilterFacade() : criteria_(std::make_unique<Criteria>()) {}

CResolutionFilterFacade::~CResolutionFilterFacade() = default;

void CResolutionFilterFacade::Initialize(const std::string& model) {
  criteria_->family = &vexa::filter::family_of(model);
  criteria_->sizes = SizeCriteria(criteria_->family->largest_moving);
}

void CResolutionFilterFacade::SetFilterItemCriteria(const std::string& item, const std::string& value) {
  criteria_->sizes.set(item, value);
}

void CResolutionFilterFacade::GetFilteredResolutionList(std::vector<SLibDVideoCodecInfo>& out) {
  out.clear();
  for (const CodecTable& table : criteria_->family->codecs) {
    SLibDVideoCodecInfo codec = codec_of(table, criteria_->sizes);
    if (!codec.resolutions.empty()) out.push_back(std::move(codec));
  }
}
