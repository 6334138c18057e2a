// The file of the test multiplex.
#include <gtest/gtest.h>

#include <fstream>
#include <set>

#include "desktop/platform/Multiplex.h"
#include "desktop/platform/Platform.h"

using namespace desktop;

TEST(MultiplexTest, CarriesEveryStreamOfEveryService) {
    Platform::instance();
    std::string error;
    const std::string file = makeTestMultiplex(error);
    ASSERT_NE(file, "") << error;
    std::ifstream stream(file, std::ios::binary);
    std::set<uint16_t> pids;
    uint8_t packet[kPacketSize];
    while (stream.read(reinterpret_cast<char*>(packet), kPacketSize)) {
        ASSERT_EQ(packet[0], kSyncByte);
        pids.insert(pidOf(packet));
    }
    for (const TestService& service : testServices()) {
        for (const ElementaryStream& each : service.streams) {
            if (each.type != kStreamTypeDsmccStreamDescriptors) { // injected with the tables
                EXPECT_EQ(pids.count(each.pid), 1U) << service.name << " PID " << each.pid;
            }
        }
    }
}
