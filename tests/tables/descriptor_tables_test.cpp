// The descriptor tables as a host finds them through vex_DLLGetTable, entry
// for entry against tables.dump. That the passes' reports agree with the rows
// of their fields is the generated messages test's.
#include <gtest/gtest.h>

#include <cstdint>

#include "tests/support/golden_lines.h"
#include "tests/support/table_dump.h"

namespace rnsap::testing {
namespace {

DumpLines TablesDump() {
  DumpLines dump = DumpRows(HostRows());
  for (const DumpLines& part :
       {DumpValues(HostValues()),
        DumpPool(static_cast<const uint32_t*>(HostTable(7)), PoolWords(HostValues())),
        DumpStrings(HostStrings()), DumpLayout(static_cast<const uint8_t*>(HostTable(9)))})
    dump.insert(dump.end(), part.begin(), part.end());
  return dump;
}

TEST(DescriptorTablesTest, TablesAreTheDumpedOnes) {
  ExpectLinesOfFile(TablesDump(), RNSAP_EXPECTED_TABLES);
}

}  // namespace
}  // namespace rnsap::testing
