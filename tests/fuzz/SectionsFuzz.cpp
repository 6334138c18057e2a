// Fuzz target of the table parsers: takes the input as one section of every table. A table that was read and
// can be written again must be read as the same table.
#include <glib.h>

#include <cassert>
#include <cstddef>
#include <cstdint>
#include <string>

#include "desktop/platform/Sections.h"

namespace {

using desktop::Bytes;

bool isUtf8(const std::string& text) {
    return g_utf8_validate(text.data(), static_cast<gssize>(text.size()), nullptr) != FALSE;
}

void checkPat(const Bytes& section) {
    if (const auto pat = desktop::parsePat(section)) {
        const auto again = desktop::parsePat(desktop::pack(*pat));
        assert(again && again->programs == pat->programs && again->version == pat->version);
        assert(again->transportStreamId == pat->transportStreamId);
    }
}

void checkPmt(const Bytes& section) {
    const auto pmt = desktop::parsePmt(section);
    if (!pmt) {
        return;
    }
    const auto again = desktop::parsePmt(desktop::pack(*pmt));
    assert(again && again->pcrPid == pmt->pcrPid && again->descriptors == pmt->descriptors);
    assert(again->streams.size() == pmt->streams.size());
    for (size_t index = 0; index < pmt->streams.size(); ++index) {
        const desktop::ElementaryStream& stream = pmt->streams[index];
        assert(again->streams[index].pid == stream.pid && again->streams[index].type == stream.type);
        assert(again->streams[index].descriptors == stream.descriptors);
    }
}

void checkTexts(const Bytes& section) {
    if (const auto nit = desktop::parseNit(section)) {
        assert(isUtf8(nit->name) && nit->deliveryDescriptor.size() != 1);
    }
    if (const auto sdt = desktop::parseSdt(section)) {
        for (const desktop::SdtService& service : sdt->services) {
            assert(isUtf8(service.name) && isUtf8(service.provider));
        }
    }
    if (const auto eit = desktop::parseEit(section)) {
        for (const desktop::EitEvent& event : eit->events) {
            assert(isUtf8(event.name) && isUtf8(event.text));
        }
    }
    assert(isUtf8(desktop::decodeString(section.data(), section.size())));
}

void checkDescriptors(const Bytes& section) {
    const uint8_t* end = section.data();
    desktop::forEachDescriptor(section, [&](uint8_t tag, const uint8_t* body, size_t length) {
        assert(body == end + 2 && body[-2] == tag && body[-1] == length);
        end = body + length;
        assert(end <= section.data() + section.size());
    });
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    constexpr size_t kMaxSection = 4096;
    const Bytes section(data, data + (size < kMaxSection ? size : kMaxSection));
    checkPat(section);
    checkPmt(section);
    checkTexts(section);
    checkDescriptors(section);
    desktop::parseTime(section);
    for (const desktop::StreamEvent& event : desktop::parseStreamEvents(section)) {
        assert(event.data.size() < section.size());
    }
    return 0;
}
