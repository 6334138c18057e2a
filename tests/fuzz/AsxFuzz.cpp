// Fuzz target of the playlist parser: parses arbitrary bytes and walks through the resulting list. The
// assertions check invariants of every list.
#include <cassert>
#include <cstddef>
#include <cstdint>
#include <string>

#include "src/avcontrol/Asx.h"

namespace {

void readClip(unsigned index) {
    assert(asxGetCurrentClipIndex() == index);
    asxShowClipFileName();
    asxShowClipTitle();
    asxShowClipAuthor();
    asxShowClipCopyRight();
    asxShowClipDescription();
    assert(asxShowClipRating().empty());
    assert(asxGetClientSkip() <= 1);
    asxGetStartTime();
    asxGetDuration();
    for (unsigned n = 1; !asxGetParamName(index, n).empty(); ++n) {
        assert(asxGetParam(index, asxGetParamName(index, n)).empty());
    }
}

void walk(unsigned count) {
    assert(asxGetCurrentClipIndex() == 1);
    for (unsigned index = 1; index <= count; ++index) {
        readClip(index);
        assert(asxNextClip() == (index < count ? index + 1 : 0));
    }
    for (unsigned index = count; index >= 1; --index) {
        assert(asxGetCurrentClipIndex() == index);
        assert(asxPrevClip() == index - 1);
    }
}

// Playback either reaches the last clip or loops in one repeat section.
void play(unsigned count) {
    unsigned start = 0;
    unsigned end = 0;
    for (unsigned steps = 0; steps < 2 * count + 100; ++steps) {
        const unsigned current = asxGetCurrentClipIndex();
        if (asxIsEndofRepeat()) {
            asxGotoStartofRepeat();
            assert(asxGetCurrentClipIndex() <= current);
            assert(end == 0 || (end == current && start == asxGetCurrentClipIndex()));
            start = asxGetCurrentClipIndex();
            end = current;
        } else if (!asxNextClip()) {
            assert(current == count);
            return;
        }
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    // By design a parse keeps the header elements of the previous list; this one clears them, so that inputs
    // are independent of each other.
    asxParseAsx("<ASX><BASE HREF=\"\"/><TITLE></TITLE><Author></Author><Copyright></Copyright>"
                "<ABSTRACT></ABSTRACT>",
                "");

    const std::string text(reinterpret_cast<const char*>(data), size);
    const std::string recognised = asxIsAsxfile(text.c_str(), static_cast<unsigned>(size));
    assert(recognised.empty() || recognised == std::string(text, 0, text.find(char())));

    assert(asxParseAsx(text.c_str(), "http://host/list.asx") == 0);
    assert(asxShowFileName() == "http://host/list.asx");
    const unsigned count = asxGetClipCount();
    assert(count == 0 || !recognised.empty());
    assert(!asxSetCurrentClipIndex(0) && !asxSetCurrentClipIndex(count + 1));
    if (count == 0) {
        assert(asxGetCurrentClipIndex() == 0 && !asxNextClip() && !asxPrevClip() && !asxIsEndofRepeat());
        assert(asxGetParamName(0, 1).empty());
        return 0;
    }
    walk(count);
    asxPrintAsxData();
    assert(asxGetCurrentClipIndex() == 1);
    play(count);
    return 0;
}
