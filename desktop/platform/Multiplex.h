// The test multiplex: three services with moving pictures, two languages and subtitles.
//   Multiplex.cpp       its services and programmes
//   MultiplexFile.cpp   its file, made once by ffmpeg in the user's cache folder
//   MultiplexTables.cpp the tables that playout injects
#ifndef TELIX_DESKTOP_PLATFORM_MULTIPLEX_H
#define TELIX_DESKTOP_PLATFORM_MULTIPLEX_H

#include <memory>
#include <string>
#include <vector>

#include "desktop/platform/TableInjector.h"

namespace desktop {

struct TestService {
    uint16_t serviceId;
    uint16_t pmtPid;
    const char* name;
    std::vector<ElementaryStream> streams; // the first one is the video, with the PCR
    const char* picture;                   // a source of ffmpeg's lavfi
    std::vector<const char*> programmes;   // titles, in broadcast order
    std::vector<uint8_t> ratings;          // of the programmes, as EitRating::value; 0: none
};

// An application that some of the services signal.
struct TestApplication {
    uint16_t applicationId;
    const char* name;
    const char* path; // relative to the URL of the configuration
    uint8_t controlCode;
    uint8_t priority;
    bool isServiceBound;
    std::vector<uint16_t> serviceIds;
};

constexpr uint16_t kTestOriginalNetworkId = kFirstPrivateNetworkId;
constexpr uint16_t kTestTransportStreamId = 1;
constexpr uint8_t kTestEventTag = 0x1F; // component tag of the stream events of each service
constexpr uint16_t kTestEventId = 1;

const std::vector<TestService>& testServices();

constexpr uint32_t kTestOrganisationId = 0x7E11; // of the applications
const std::vector<TestApplication>& testApplications();

// The delivery system descriptor of the test multiplex. It has no zero byte, because pages get it as a
// string.
const Bytes& testDeliveryDescriptor();

// The programme of a service at `utcSeconds` since 1970, or so many programmes after (or before) it. Each
// lasts `programmeSeconds`.
EitEvent testProgramme(const TestService& service, int64_t utcSeconds, uint32_t programmeSeconds, int offset);

// The file with the elementary streams. Makes it if it does not exist, which takes seconds and prints
// progress and errors of ffmpeg to standard error. Empty, with the reason in `error`, if that fails.
// GStreamer must be initialised. Any thread, one at a time.
std::string makeTestMultiplex(std::string& error);

// The tables of the test multiplex. A period of stream events of 0 seconds means none. The services signal
// applications if the URL of the folder that they are in is not empty.
std::unique_ptr<TableInjector> makeTestTableInjector(uint32_t programmeSeconds, uint32_t streamEventSeconds,
                                                     const std::string& applicationsUrl);

} // namespace desktop

#endif
