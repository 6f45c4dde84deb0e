#pragma once
// The contract every catalogue data service backend meets. A backend runs
// the same tests by instantiating CatalogueContract with a CatalogueBackend
// that can build a catalogue from rows and fail to open a missing one:
//
//   INSTANTIATE_TEST_SUITE_P(MyBackend, CatalogueContract,
//                            ::testing::Values(MyBackendFactory()), BackendName);

#include "data/catalogue.hpp"
#include "data/tools/catalogue_writer.hpp"

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace belvane::test {

using FillCatalogue = std::function<void(data::tools::CatalogueWriter&)>;

struct CatalogueBackend {
  std::string name;
  // A new catalogue with every table but those in `omit`, filled by `fill`,
  // and the service over it.
  std::function<std::shared_ptr<data::CatalogueDataObject>(const FillCatalogue& fill,
                                                           const std::vector<std::string>& omit)>
      build;
  // Opens a catalogue that does not exist: must raise.
  std::function<std::shared_ptr<data::CatalogueDataObject>()> openMissing;
};

inline std::string BackendName(const ::testing::TestParamInfo<CatalogueBackend>& info) {
  return info.param.name;
}

class CatalogueContract : public ::testing::TestWithParam<CatalogueBackend> {
protected:
  void SetUp() override { cat_ = Build(); }
  // The test catalogue of catalogue_contract_test.cpp on this backend.
  std::shared_ptr<data::CatalogueDataObject> Build(const std::vector<std::string>& omit = {});
  std::shared_ptr<data::CatalogueDataObject> cat_;
};

} // namespace belvane::test
