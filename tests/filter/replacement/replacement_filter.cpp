// SPDX-License-Identifier: Apache-2.0
// A host's own filter library: it offers back what it was asked, one codec for each question.
#include <string>
#include <utility>
#include <vector>

#include "vexa/resolution_filter.h"

struct CResolutionFilterFacade::Criteria {
  std::vector<SLibDVideoCodecInfo> questions;

  void add(const std::string& item, const std::string& value) {
    SLibDVideoCodecInfo question;
    question.name = item;
    question.resolutions.resize(1);
    question.resolutions[0].text = value;
    questions.push_back(std::move(question));
  }
};

CResolutionFilterFacade::CResolutionFilterFacade() : criteria_(new Criteria) {}

CResolutionFilterFacade::~CResolutionFilterFacade() = default;

void CResolutionFilterFacade::Initialize(const std::string& model) {
  criteria_->questions.clear();
  criteria_->add("model", model);
}

void CResolutionFilterFacade::SetFilterItemCriteria(const std::string& item, const std::string& value) {
  criteria_->add(item, value);
}

void CResolutionFilterFacade::GetFilteredResolutionList(std::vector<SLibDVideoCodecInfo>& out) {
  out = criteria_->questions;
}
