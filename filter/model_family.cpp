#include "filter/model_family.h"

namespace vexa::filter {
namespace {

const ModelFamily* const kFamilies[] = {&kHeronFamily, &kMarlinFamily, &kPtzFamily, &kSimpleHdFamily,
                                        &kSimplePtzFamily};

}  // namespace

const ModelFamily& family_of(std::string_view model) {
  for (const ModelFamily* family : kFamilies) {
    if (model.substr(0, family->prefix.size()) == family->prefix) return *family;
  }
  return kGeneralFamily;
}

}  // namespace vexa::filter
