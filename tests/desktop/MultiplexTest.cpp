// The file of the test multiplex.
#include <gtest/gtest.h>

#include <fstream>
#include <set>
#include <vector>

#include "desktop/platform/Multiplex.h"
#include "desktop/platform/Platform.h"

using namespace desktop;

namespace {

// The PES packets of a PID in the file, each with its header.
std::vector<Bytes> pesPacketsOf(const std::string& file, uint16_t pid) {
    std::vector<Bytes> found;
    std::ifstream stream(file, std::ios::binary);
    uint8_t packet[kPacketSize];
    while (stream.read(reinterpret_cast<char*>(packet), kPacketSize)) {
        if (pidOf(packet) != pid || (packet[3] & kPayloadFlag) == 0) {
            continue;
        }
        const bool hasAdaptationField = (packet[3] & kAdaptationFieldFlag) != 0;
        const size_t payload = kPacketHeaderSize + (hasAdaptationField ? 1 + size_t{packet[4]} : 0);
        if ((packet[1] & kPayloadUnitStartIndicator) != 0) {
            found.emplace_back();
        }
        if (!found.empty()) {
            found.back().insert(found.back().end(), packet + payload, packet + kPacketSize);
        }
    }
    return found;
}

// The widths of the regions of subtitles in a PES packet, in pixels.
std::vector<unsigned int> regionWidthsOf(const Bytes& pes) {
    std::vector<unsigned int> widths;
    size_t at = kPesFixedHeaderSize + pes[kPesFixedHeaderSize - 1] + kSubtitlingDataHeaderSize;
    while (at + kSubtitlingSegmentHeaderSize <= pes.size() && pes[at] == kSubtitlingSegmentSync) {
        const size_t body = at + kSubtitlingSegmentHeaderSize;
        if (pes[at + 1] == kRegionCompositionSegment) {
            const uint8_t* width = pes.data() + body + kRegionWidthOffset;
            widths.push_back(static_cast<unsigned int>(width[0] << 8 | width[1]));
        }
        at = body + static_cast<size_t>(pes[at + 4] << 8 | pes[at + 5]);
    }
    return widths;
}

class MultiplexTest : public testing::Test {
protected:
    static void SetUpTestSuite() {
        Platform::instance(); // initialises GStreamer
        std::string error;
        file = makeTestMultiplex(error);
        ASSERT_NE(file, "") << error;
    }

    static std::string file;
};

std::string MultiplexTest::file;

TEST_F(MultiplexTest, CarriesEveryStreamOfEveryService) {
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

TEST_F(MultiplexTest, HasSubtitlesAsWideAsTheirTextInBothLanguages) {
    size_t streams = 0;
    for (const ElementaryStream& each : testServices().front().streams) {
        if (each.type != kStreamTypePrivatePes) {
            continue;
        }
        ++streams;
        std::vector<unsigned int> widths;
        for (const Bytes& pes : pesPacketsOf(file, each.pid)) {
            const auto found = regionWidthsOf(pes);
            widths.insert(widths.end(), found.begin(), found.end());
        }
        ASSERT_EQ(widths.size(), 3U) << each.pid; // two texts, and the dot that ends the second
        for (const size_t text : {0, 1}) {
            EXPECT_GT(widths[text], 256U) << each.pid;
            EXPECT_LT(widths[text], 720U) << each.pid;
        }
        EXPECT_LT(widths[2], 20U) << each.pid;
    }
    EXPECT_EQ(streams, 2U);
}

} // namespace
