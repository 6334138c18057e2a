// The test multiplex: three services with moving pictures, two languages and subtitles, made once by ffmpeg
// in the user's cache folder, and the tables that are sent with it.
#ifndef TELIX_DESKTOP_MULTIPLEX_H
#define TELIX_DESKTOP_MULTIPLEX_H

#include "desktop/platform/HeadEnd.h"

#include <memory>
#include <string>
#include <vector>

namespace desktop {

struct TestService {
    uint16_t serviceId;
    uint16_t mapPid;
    const char* name;
    std::vector<ElementaryStream> streams; // the first one is the video, with the clock
    const char* picture;                   // as ffmpeg describes its source
    std::vector<const char*> programmes;   // titles, one after the other
    std::vector<uint8_t> ratings;          // of the programmes, as in EitRating
};

constexpr uint16_t testOriginalNetworkId = 0xFF01; // from those that are free for private use
constexpr uint16_t testTransportStreamId = 1;
constexpr uint8_t testEventTag = 0x1F; // component tag of the stream events of each service
constexpr uint16_t testEventId = 1;

const std::vector<TestService>& testServices();

// The delivery system descriptor of the test multiplex. It holds no zero: it travels as a text.
const Bytes& testDeliveryDescriptor();

// The present programme of a service at a time in seconds since 1970, and the ones before and behind it.
EitEvent testProgramme(const TestService& service, int64_t time, uint32_t programmeSeconds, int distance);

// The file with the elementary streams, made if it is not there yet, which takes seconds; progress and faults
// go to standard error. Empty, with the reason in `error`, if it cannot be made. Needs GStreamer. Any thread,
// one at a time.
std::string makeTestMultiplex(std::string& error);

// The tables of the test multiplex. `streamEventSeconds` 0 means none.
std::unique_ptr<Carousel> makeTestCarousel(uint32_t programmeSeconds, uint32_t streamEventSeconds);

} // namespace desktop

#endif
