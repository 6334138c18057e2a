// Playlist parsing, compared with a SAX parser that calls empty handlers on the same bytes, while ours builds
// a list. In the malformed documents each tag could cause a long search ahead; the time per byte must not
// grow with their size.
#include <benchmark/benchmark.h>
#include <expat.h>

#include <string>

#include "src/avcontrol/Asx.h"

namespace {

std::string document(const std::string& head, const std::string& piece, const std::string& tail,
                     size_t size) {
    std::string text = head;
    text.reserve(size + piece.size() + tail.size());
    while (text.size() + tail.size() < size) {
        text += piece;
    }
    return text + tail;
}

// About 100 bytes per clip: 10 MB have 100,000 clips.
std::string playlist(size_t size) {
    return document("<ASX VERSION=\"3.0\">\n<TITLE>Evening</TITLE>\n",
                    "<Entry><TITLE>Clip</TITLE><Ref HREF=\"http://media.example/a/clip.mp4\"/>"
                    "<duration value=\"1:30\"/></Entry>\n",
                    "</ASX>\n", size);
}

std::string timesWithoutColons(size_t size) {
    return document("<ASX><Entry><Ref HREF=\"a\"/>", "<duration value=\"30\"/>", "", size);
}

std::string timesBeforeOneColon(size_t size) {
    return document("<ASX><Entry><Ref HREF=\"a\"/>", "<duration value=\"30\"/>", ":", size);
}

std::string entriesBeforeOneSkip(size_t size) {
    return document("<ASX><Entry><Ref HREF=\"a\"/></Entry>", "<Entry></Entry>", "<Entry clientskip=\"no\">",
                    size);
}

std::string openBrackets(size_t size) {
    return document("<ASX>", "<", "", size);
}

void count(benchmark::State& state, const std::string& text) {
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * static_cast<int64_t>(text.size()));
}

void parseAsx(benchmark::State& state, std::string (*make)(size_t)) {
    const std::string text = make(static_cast<size_t>(state.range(0)));
    const std::string url = "http://media.example/list.asx";
    for ([[maybe_unused]] auto _ : state) {
        asxParseAsx(text.c_str(), url);
    }
    count(state, text);
    state.counters["clips"] = asxGetClipCount();
    asxClear();
}

void parseXml(benchmark::State& state, std::string (*make)(size_t)) {
    const std::string text = make(static_cast<size_t>(state.range(0)));
    for ([[maybe_unused]] auto _ : state) {
        XML_Parser parser = XML_ParserCreate(nullptr);
        XML_SetElementHandler(
            parser, [](void*, const XML_Char*, const XML_Char**) {}, [](void*, const XML_Char*) {});
        XML_SetCharacterDataHandler(parser, [](void*, const XML_Char*, int) {});
        if (XML_Parse(parser, text.data(), static_cast<int>(text.size()), XML_TRUE) != XML_STATUS_OK) {
            state.SkipWithError("the document is not well-formed");
        }
        XML_ParserFree(parser);
    }
    count(state, text);
}

void sizes(benchmark::internal::Benchmark* benchmark) {
    benchmark->Arg(10 << 10)->Arg(1 << 20)->Arg(10 << 20)->Unit(benchmark::kMicrosecond);
}

BENCHMARK_CAPTURE(parseAsx, playlist, playlist)->Apply(sizes);
BENCHMARK_CAPTURE(parseXml, playlist, playlist)->Apply(sizes);
BENCHMARK_CAPTURE(parseAsx, timesWithoutColons, timesWithoutColons)->Apply(sizes);
BENCHMARK_CAPTURE(parseAsx, timesBeforeOneColon, timesBeforeOneColon)->Apply(sizes);
BENCHMARK_CAPTURE(parseAsx, entriesBeforeOneSkip, entriesBeforeOneSkip)->Apply(sizes);
BENCHMARK_CAPTURE(parseAsx, openBrackets, openBrackets)->Apply(sizes);

} // namespace

BENCHMARK_MAIN();
