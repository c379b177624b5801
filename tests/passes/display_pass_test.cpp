// The Display pass names the message by its procedure code under the PDU
// type: tables of its own, which no value list of the dictionary gives. The
// other texts of the pass are checked field by field by the message vectors.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "tests/passes/pass_messages.h"

namespace rnsap::testing {
namespace {

constexpr uint32_t kProcedureLine = 688;

TEST(DisplayPassTest, ProcedureCodeNamesTheMessageByItsPduType) {
  struct Case {
    uint32_t pduType;
    uint32_t code;
    const char* name;
  };
  const Case cases[] = {
      {0, 20, "RadioLinkSetupRequest"},
      {1, 20, "RadioLinkSetupResponse"},
      {2, 20, "RadioLinkSetupFailure"},
      {0, 17, "RadioLinkDeletionRequest"},
      {1, 17, "RadioLinkDeletionResponse"},
      {2, 17, "Unknown"},
      {0, 27, "Unknown"},
      {1, 27, "Unknown"},
      {2, 27, "Unknown"},
      {0, 255, "Unknown"},
      {0, 0, "CommonTransportChannelResourcesRequest"},
      {0, 6, "DL-PowerControlRequest"},
      {0, 26, "UplinkSignallingTransferIndication"},
      {1, 2, "Unknown"},
      {1, 8, "DedicatedMeasurementInitiationResponse"},
      {1, 10, "DedicatedMeasurementInitiationRequest"},
      {2, 10, "DedicatedMeasurementInitiationRequest"},
      {1, 12, "PhysicalChannelReconfigurationCommand"},
      {2, 12, "PhysicalChannelReconfigurationFailure"},
      {2, 14, "PhysicalChannelReconfigurationCommand"},
      {1, 19, "RadioLinkSetupResponse"},
      {2, 25, "RadioLinkReconfigurationFailure"},
  };
  PassHost host;
  ASSERT_TRUE(host.ready());
  for (const Case& c : cases) {
    SCOPED_TRACE("PDU type " + std::to_string(c.pduType) + ", code " + std::to_string(c.code));
    host.Load(PublicHeader(c.pduType, c.code, 0));
    ASSERT_TRUE(vex_PreDecodeTO(&host.request()));
    std::vector<std::string> names;
    for (const host::DisplayLine& line : host::DisplayLines())
      if (line.displayId == kProcedureLine) names.push_back(line.text);
    EXPECT_EQ(names, std::vector<std::string>{c.name});
  }
}

}  // namespace
}  // namespace rnsap::testing
