// Streams of the browser: what is kept of them, what they say about the media, and playlists that play as
// soon as they are read.
#include "src/avcontrol/StreamBody.h"
#include "tests/unit/avcontrol/AVControlTest.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace avcontrol {
namespace {

const char kList[] = "http://media.example/list.asx";

class AVControlStreams : public AVControlTest {
protected:
    EmbeddedObject fetching(const std::string& url = kList, const std::string& mimeType = "video/mp4") {
        const EmbeddedObject object = element(mimeType, {{"id", "video"}, {"src", url}});
        browser.pump();
        log.clear();
        return object;
    }
    BorderLog::Entries destroyed() const { return log.startingWith("NPN_DestroyStream"); }
};

TEST_F(AVControlStreams, PlainMediaIsDroppedAfterItsFirstChunk) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    EXPECT_EQ(stream.error(), NPERR_NO_ERROR);
    EXPECT_EQ(stream.mode(), NP_NORMAL);
    EXPECT_EQ(stream.writeReady(), 1024);
    EXPECT_EQ(stream.write("media"), 5);
    EXPECT_TRUE(stream.wasDestroyedByPlugin());
    EXPECT_THAT(destroyed(), ElementsAre("NPN_DestroyStream \"http://media.example/list.asx\" 0"));
    EXPECT_EQ(stream.destroy(), NPERR_NO_ERROR);
    EXPECT_EQ(state(object), Stopped);
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlStreams, AnObjectTakesOneStreamInItsLife) {
    const EmbeddedObject object = fetching();
    object.newStream(kList);
    EXPECT_THAT(destroyed(), IsEmpty());
    BrowserStream& second = object.newStream(kList);
    EXPECT_EQ(second.error(), NPERR_NO_ERROR);
    EXPECT_TRUE(second.wasDestroyedByPlugin());
    EXPECT_EQ(second.record().pdata, nullptr);
    EXPECT_EQ(second.writeReady(), 0);
}

TEST_F(AVControlStreams, TheBrowsersSpellingOfTheAddressIsTaken) {
    const EmbeddedObject object = fetching("http://media.example/A.mp4");
    object.newStream("http://MEDIA.example/a.mp4");
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://MEDIA.example/a.mp4")));
}

TEST_F(AVControlStreams, AnotherAddressIsNot) {
    const EmbeddedObject object = fetching("http://media.example/a.mp4");
    object.newStream("http://media.example/b.mp4");
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/a.mp4")));
}

TEST_F(AVControlStreams, AFullPageObjectDestroysTheStreamAtTheFirstQuestion) {
    const EmbeddedObject object = browser.embed("video/mp4", {{"src", kList}}, NP_FULL);
    BrowserStream& stream = object.newStream(kList);
    EXPECT_FALSE(stream.wasDestroyedByPlugin());
    EXPECT_EQ(stream.writeReady(), 0);
    EXPECT_TRUE(stream.wasDestroyedByPlugin());
}

// Headers

TEST_F(AVControlStreams, AudioMpegIsRecognisedByTheHeadersOfTheFirstChunk) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream("http://other.example/", "Content-Type: application/x\r\n");
    stream.writeAt(0, "x");
    object.set("data", "http://media.example/a"); // unknown from here on
    stream.record().headers = "Content-Type: audio/mpeg\r\n";
    stream.writeAt(0, "x");
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/a", 7, 1, 6, 2, 1)));
}

TEST_F(AVControlStreams, AudioMpegInTheHeadersKeepsItsCase) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream("http://other.example/", "Content-Type: application/x\r\n");
    stream.writeAt(0, "x");
    object.set("data", "http://media.example/a");
    stream.record().headers = "Content-Type: Audio/MPEG\r\n";
    stream.writeAt(0, "x");
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/a", 7, 1, 6, 1280, 0)));
}

TEST_F(AVControlStreams, HeadersOfAKnownTypeChangeNothing) {
    const EmbeddedObject object = fetching("http://media.example/a.mp4");
    object.newStream("http://media.example/a.mp4", "Content-Type: audio/mpeg\r\n").write("x");
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/a.mp4")));
}

TEST_F(AVControlStreams, HeadersWithoutContentTypeOrOfALaterChunkAreNotTaken) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream("http://other.example/", "Server: audio/mpeg\r\n");
    stream.writeAt(0, "x");
    stream.record().headers = "Content-Type: audio/mpeg\r\n";
    stream.writeAt(1, "x");
    object.set("data", "http://media.example/a");
    object.call("play", 1);
    EXPECT_TRUE(log.contains(playOf("http://media.example/a"))); // still the MIME type's
}

TEST_F(AVControlStreams, NoHeadersCountAsAnEmptyText) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    stream.record().headers = nullptr;
    EXPECT_EQ(stream.write("x"), 1);
    EXPECT_TRUE(stream.wasDestroyedByPlugin());
}

// Playlists

TEST_F(AVControlStreams, APlaylistInOneChunkPlaysWhenTheStreamEnds) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    stream.write(asx({entry("http://media.example/1")}));
    EXPECT_FALSE(stream.wasDestroyedByPlugin());
    EXPECT_THAT(playerCalls(), IsEmpty());
    stream.destroy();
    EXPECT_THAT(playerCalls(), ElementsAre(playOf("http://media.example/1")));
    EXPECT_EQ(object.get("nrTracks"), 1);
}

TEST_F(AVControlStreams, APlaylistIsGatheredChunkByChunk) {
    const EmbeddedObject object = fetching();
    const std::string text = asx({entry("http://media.example/1"), entry("http://media.example/2")});
    BrowserStream& stream = object.newStream(kList);
    for (size_t i = 0; i < text.size(); i += 7) {
        const std::string chunk = text.substr(i, 7);
        EXPECT_EQ(stream.write(chunk), static_cast<int32_t>(chunk.size()));
    }
    stream.destroy();
    EXPECT_EQ(object.get("nrTracks"), 2);
}

TEST_F(AVControlStreams, ATagThatIsNotInTheFirstChunkIsNotRecognised) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    stream.write("<AS");
    EXPECT_TRUE(stream.wasDestroyedByPlugin());
    stream.write("X>" + entry("http://media.example/1") + "</ASX>");
    stream.destroy();
    EXPECT_EQ(object.get("nrTracks"), 0);
    EXPECT_THAT(playerCalls(), IsEmpty());
}

TEST_F(AVControlStreams, TheFirstChunkIsReadToItsFirstZeroByteAndNotBeyondItsEnd) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    const std::string head = "<ASX>" + entry("http://media.example/1");
    // Exactly as long as what is written: whatever follows isn't read.
    std::vector<char> exact(head.begin(), head.end());
    EXPECT_EQ(browser.plugin().write(object.npp(), &stream.record(), 0, static_cast<int32_t>(exact.size()),
                                     exact.data()),
              static_cast<int32_t>(exact.size()));
    stream.writeAt(static_cast<int32_t>(exact.size()), entry("http://media.example/2"));
    stream.destroy();
    EXPECT_EQ(object.get("nrTracks"), 2);
}

TEST_F(AVControlStreams, WhatFollowsAZeroByteInTheFirstChunkIsDropped) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    stream.write("<ASX>" + entry("1") + std::string(1, '\0') + entry("2"));
    stream.write(entry("3"));
    stream.destroy();
    EXPECT_EQ(object.get("nrTracks"), 2);
}

TEST_F(AVControlStreams, WhatHasComeOfABrokenPlaylistPlays) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    stream.write("<ASX>" + entry("http://media.example/1") + "<Entry><Ref HR");
    stream.destroy(NPRES_NETWORK_ERR);
    EXPECT_THAT(playerCalls(), ElementsAre(playOf("http://media.example/1")));
}

TEST_F(AVControlStreams, APlaylistWithoutClipsHasNothingToPlay) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    stream.write("<asx></asx>");
    stream.destroy();
    EXPECT_EQ(object.get("nrTracks"), 0);
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_EQ(state(object), Stopped);
    EXPECT_EQ(object.call("play", 1), false); // it stays a playlist, with an empty URL
}

TEST_F(AVControlStreams, TheSamePlaylistEndsTwiceWithNothingLeft) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    stream.write(asx({entry("http://media.example/1")}));
    stream.destroy();
    stream.destroy(); // the playlist has been read
    EXPECT_EQ(object.get("nrTracks"), 0);
}

TEST_F(AVControlStreams, AnEmptyOrMissingFirstChunkIsPlainMedia) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    EXPECT_EQ(stream.write(""), 0);
    EXPECT_TRUE(stream.wasDestroyedByPlugin());
    EXPECT_EQ(browser.plugin().write(object.npp(), &stream.record(), 0, 10, nullptr), 10);
    EXPECT_EQ(destroyed().size(), 2u);
}

TEST_F(AVControlStreams, AShortSoundsStreamRunsToItsEnd) {
    const EmbeddedObject object = element("video/mp4", {{"id", "video"}});
    object.set("data", "http://media.example/a.wav");
    BrowserStream& stream = object.newStream("http://media.example/a.wav");
    for (int i = 0; i < 5; ++i) {
        EXPECT_EQ(stream.write(std::string(1024, 's')), 1024);
    }
    EXPECT_FALSE(stream.wasDestroyedByPlugin());
    stream.destroy();
}

TEST_F(AVControlStreams, AChunkThatFindsNoMemoryIsDroppedAndTheStreamGoesOn) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    stream.write("<ASX>" + entry("http://media.example/1"));
    {
        const std::string chunk = entry("http://media.example/2");
        const MemoryShortage shortage;
        EXPECT_EQ(stream.write(chunk), static_cast<int32_t>(chunk.size()));
    }
    EXPECT_EQ(stream.write("</ASX>"), 6);
    EXPECT_FALSE(stream.wasDestroyedByPlugin());
    EXPECT_EQ(stream.destroy(), NPERR_NO_ERROR);
    // What had come of the playlist went with its block.
    EXPECT_EQ(object.get("nrTracks"), 0);
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_EQ(state(object), Stopped);
}

TEST_F(AVControlStreams, AClipOfTheNetworkWaitsForTheStreamOfItsPlaylist) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    stream.write(asx({entry("http://media.example/1")}));
    object.set("data", kList); // asks for another stream, which is never taken
    log.clear();
    stream.destroy();
    EXPECT_THAT(playerCalls(), IsEmpty());
    EXPECT_EQ(object.call("play", 1), false); // the request still runs
    EXPECT_THAT(log.startingWith("NPN_GetURLNotify"), IsEmpty());
    object.newStream(kList);
    EXPECT_EQ(object.call("play", 1), true);
    EXPECT_TRUE(log.contains(playOf("http://media.example/1")));
}

TEST_F(AVControlStreams, AClipOfAnotherSchemeDoesNotWait) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    stream.write(asx({entry("mms://media.example/1")}));
    object.set("data", kList);
    log.clear();
    stream.destroy();
    EXPECT_THAT(playerCalls(), ElementsAre(playOf("mms://media.example/1")));
}

TEST_F(AVControlStreams, ALengthBelowZeroIsNoChunk) {
    const EmbeddedObject object = fetching();
    BrowserStream& stream = object.newStream(kList);
    stream.write("<ASX>" + entry("http://media.example/1"));
    char byte = 0;
    EXPECT_EQ(browser.plugin().write(object.npp(), &stream.record(), 100, -1, &byte), -1);
    EXPECT_EQ(browser.plugin().write(object.npp(), &stream.record(), 100, INT32_MIN, &byte), INT32_MIN);
    stream.destroy();
    EXPECT_EQ(object.get("nrTracks"), 1);
}

// The body of a stream

using Body = ::testing::Test;

std::string textOf(StreamBody& body) {
    const AsxText text = body.take();
    return text ? text.get() : "none";
}

TEST_F(Body, IsWhatWasAppendedInOrder) {
    StreamBody body;
    EXPECT_EQ(textOf(body), "none");
    body.append("one ");
    body.append("");
    body.append("two");
    EXPECT_EQ(body.size(), 7u);
    EXPECT_EQ(textOf(body), "one two");
    EXPECT_EQ(body.size(), 0u);
    body.append("three");
    EXPECT_EQ(textOf(body), "three");
}

TEST_F(Body, ThatGrowsTooLongIsGivenUpWithAllThatFollows) {
    StreamBody body(8);
    body.append("12345678");
    EXPECT_EQ(body.size(), 8u);
    body.append("9");
    EXPECT_EQ(body.size(), 0u);
    body.append("10");
    EXPECT_EQ(textOf(body), "none");
    body.append("next");
    EXPECT_EQ(textOf(body), "next");
}

TEST_F(Body, ChunkThatIsTooLongByItselfIsGivenUpToo) {
    StreamBody body(8);
    body.append("123456789");
    EXPECT_EQ(textOf(body), "none");
}

TEST_F(Body, IsCountedIn32BitsWithItsTerminatingZero) {
    static_assert(StreamBody::kLongest + uint64_t{1} <= UINT32_MAX);
    // Memory for this much can be had, and is never touched. What is too long by one byte asks for none.
    StreamBody body;
    const std::string_view beyond("x", static_cast<size_t>(StreamBody::kLongest) + 1);
    body.append(beyond); // would be read if it were taken
    EXPECT_EQ(textOf(body), "none");
}

// Notices

TEST_F(AVControlStreams, ANetworkErrorIsAnErrorOfTheObject) {
    const EmbeddedObject object = fetching();
    EXPECT_THAT(logOf(5, [&] { object.urlNotify(kList, NPRES_NETWORK_ERR); }),
                HasSubstr("error : AVControl_Connection_Error\n"));
    object.urlNotify(kList, NPRES_NETWORK_ERR);
    EXPECT_EQ(object.get("error"), 1);
    EXPECT_EQ(state(object), Error);
    EXPECT_THAT(events(), ElementsAre("Error", "PlayStateChange"));
}

TEST_F(AVControlStreams, OtherNoticesAreNot) {
    const EmbeddedObject object = fetching();
    object.urlNotify(kList, NPRES_DONE);
    object.urlNotify(kList, NPRES_USER_BREAK);
    EXPECT_EQ(object.get("error"), undefined);
    EXPECT_EQ(state(object), Stopped);
}

} // namespace
} // namespace avcontrol
