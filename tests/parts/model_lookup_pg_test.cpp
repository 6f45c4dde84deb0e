// The model look-up against a PostgreSQL catalogue: model ids that would
// change the query find nothing and change nothing there either. The
// cluster comes from the ctest fixture (tests/data/pg_cluster.sh) through
// BELVANE_TEST_PG.

#include "data/postgres/pg_db.hpp"
#include "data/tools/pg_catalogue_writer.hpp"
#include "parts_fixture.hpp"

#include <unistd.h>

#include <cstdlib>
#include <stdexcept>

namespace belvane::test {
namespace {

using parts::frmParts;

class PostgresModelLookUpTest : public PartsFixture {
protected:
  void SetUp() override {
    PartsFixture::SetUp();
    const char* server = std::getenv("BELVANE_TEST_PG");
    if (!server || !*server)
      throw std::runtime_error("BELVANE_TEST_PG is not set: run these tests through ctest, "
                               "whose fixture starts the PostgreSQL cluster");
    // A schema of this process's own, so that test processes never meet.
    const std::string schema = "parts_" + std::to_string(getpid());
    data::postgres::Connection(server).Exec("DROP SCHEMA IF EXISTS " + schema +
                                            " CASCADE; CREATE SCHEMA " + schema);
    const std::string uri = std::string(server) + "&options=-csearch_path%3D" + schema;
    data::tools::PostgresCatalogueWriter writer(uri);
    WriteCatalogue(writer, StandardParts(), StandardItems());
    writer.Commit();
    data::SetCatalogueLocation(uri);
  }

  long Models() {
    return data::Catalogue()->OpenRecordset("SELECT * FROM ALLMODEL", 0, 0)->RecordCount();
  }
};

TEST_F(PostgresModelLookUpTest, OnlyAWholeNumberFindsAModel) {
  auto catNoOf = [&](const std::string& id) {
    modelId = id;
    std::string catNo = "<not opened>";
    int available = 0;
    Open(eEdit, [&](frmParts& f) {
      catNo = f.CatNo();
      available = f.FGParts.Rows() - 1;
    });
    return catNo + " " + std::to_string(available);
  };
  EXPECT_EQ(catNoOf("12"), "FA1 8"); // six vehicle parts, two general items
  EXPECT_EQ(catNoOf("13"), "FO1 3");
  for (const std::string id : {"1 OR 1=1", "1; DELETE FROM ALLMODEL", "", "12 OR MODEL_ID = 13",
                               "12); DROP TABLE allmodel; --"}) {
    EXPECT_EQ(catNoOf(id), " 2") << id;
    EXPECT_EQ(Models(), 2) << id;
  }
  EXPECT_TRUE(runtime.Messages().empty());
}

} // namespace
} // namespace belvane::test
