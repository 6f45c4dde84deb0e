#pragma once
// The sample catalogue: a realistic, deterministic catalogue for the demo,
// the tests and the benchmarks. The same options always give the same rows.
// Enciphered values are enciphered under the field key in force on the
// calling thread.

#include <cstdint>
#include <map>
#include <string>

namespace belvane::data::tools {

class CatalogueWriter;

struct SampleOptions {
  std::uint64_t seed = 1;
  int models = 8;         // vehicle models, spread over four makes
  int partsPerModel = 80; // vehicle part rows per model (a left and right pair is two)
  int labourItems = 30;   // labour items per schedule of each model, before body items
};

// Rows written, by table.
using SampleSummary = std::map<std::string, long>;

// Writes the sample rows through `writer`. Raises error 5 for options out
// of range (models 1 to 10,000, parts 0 to 1,000,000, labour items 0 to the
// size of the operation list).
SampleSummary WriteSampleCatalogue(CatalogueWriter& writer, const SampleOptions& options);

// Writes a new SQLite sample catalogue at `path`, replacing any file there
// only once it is complete.
SampleSummary WriteSampleCatalogueFile(const std::string& path, const SampleOptions& options);

// How many labour operations the generator knows (the upper bound of
// labourItems).
int SampleLabourOperationCount();

} // namespace belvane::data::tools
