// The services and applications of the test multiplex.
#include "desktop/platform/Multiplex.h"

namespace desktop {

namespace {

Bytes operator+(Bytes left, const Bytes& right) {
    left.insert(left.end(), right.begin(), right.end());
    return left;
}

// Video, two audio and two subtitle streams and stream events, on PIDs from `base` on. The component tags
// count from 1.
std::vector<ElementaryStream> makeStreams(uint16_t base, const Bytes& secondAudio,
                                          const Bytes& secondSubtitles) {
    const auto pid = [base](int index) { return static_cast<uint16_t>(base + index); };
    return {
        {kStreamTypeMpeg2Video, pid(0), streamIdentifierDescriptor(1)},
        {kStreamTypeMpeg1Audio, pid(1),
         streamIdentifierDescriptor(2) + iso639LanguageDescriptor("deu", kAudioTypeUndefined)},
        {kStreamTypeMpeg1Audio, pid(2), streamIdentifierDescriptor(3) + secondAudio},
        {kStreamTypePrivatePes, pid(3),
         streamIdentifierDescriptor(4) + subtitlingDescriptor("deu", kSubtitlingTypeNormal)},
        {kStreamTypePrivatePes, pid(4), streamIdentifierDescriptor(5) + secondSubtitles},
        {kStreamTypeDsmccStreamDescriptors, pid(5), streamIdentifierDescriptor(kTestEventTag)},
    };
}

} // namespace

const std::vector<TestService>& testServices() {
    // Never destroyed: the playout thread reads it until the process ends.
    static const auto& services = *new std::vector<TestService>{
        {101,
         0x0101,
         "Telix One",
         makeStreams(0x0110, iso639LanguageDescriptor("eng", kAudioTypeUndefined),
                     subtitlingDescriptor("eng", kSubtitlingTypeNormal)),
         "testsrc2=s=720x576:r=25",
         {"Morning Patterns", "The Colour Hour", "News at the Minute"},
         {0, 3, 9}},
        {102,
         0x0102,
         "Telix Two",
         makeStreams(0x0120, iso639LanguageDescriptor("deu", kAudioTypeVisualImpairedCommentary),
                     subtitlingDescriptor("eng", kSubtitlingTypeNormal)),
         "smptehdbars=s=720x576:r=25,scroll=h=0.004",
         {"Bars of the World", "Night of the Test Card"},
         {1, 13}},
        {103,
         0x0103,
         "Telix Three",
         makeStreams(0x0130, iso639LanguageDescriptor("eng", kAudioTypeUndefined),
                     subtitlingDescriptor("deu", kSubtitlingTypeHardOfHearing)),
         "gradients=s=720x576:r=25:c0=navy:c1=teal:c2=purple:n=3:speed=0.02:seed=1",
         {"Gradients", "Slow Colours", "Fast Colours", "Colours Live"},
         {0, 0, 3, 5}},
    };
    return services;
}

const std::vector<TestApplication>& testApplications() {
    static const auto& applications = *new std::vector<TestApplication>{
        {1, "Demonstration", "demo/index.html", kControlCodeAutostart, 10, false, {101, 102}},
        {2, "Media", "media/index.html", kControlCodePresent, 5, true, {101}},
    };
    return applications;
}

const Bytes& testDeliveryDescriptor() {
    // Satellite: 11.72755 GHz, 19.2 degrees east, horizontal, QPSK, 27.511 megasymbols, inner code 3/4.
    static const auto& descriptor = *new Bytes{
        kTagSatelliteDeliverySystem, 0x0B, 0x11, 0x72, 0x75, 0x51, 0x01, 0x92, 0x81, 0x27, 0x51, 0x11, 0x13};
    return descriptor;
}

EitEvent testProgramme(const TestService& service, int64_t utcSeconds, uint32_t programmeSeconds,
                       int offset) {
    const int64_t slot = utcSeconds / programmeSeconds + offset;
    const size_t index = static_cast<size_t>(slot) % service.programmes.size();
    EitEvent event;
    event.id = static_cast<uint16_t>(slot);
    event.start = slot * programmeSeconds;
    event.duration = programmeSeconds;
    event.name = service.programmes[index];
    event.text = std::string("A programme of ") + service.name + ".";
    if (service.ratings[index] != 0) {
        event.ratings.push_back({"DEU", service.ratings[index]});
    }
    return event;
}

} // namespace desktop
