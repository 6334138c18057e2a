// Streams, with a script in place of the page's that makes no requests.
#include <glib.h>
#include <glib/gstdio.h>

#include "bridge/Streams.h"
#include "tests/bridge/ScriptHost.h"

using namespace bridge;

namespace {

class BridgeStreams : public ScriptHost {
protected:
    BridgeStreams() {
        // Logs the calls.
        const OwnedVariant functions =
            evaluated("var calls = []; ({ request: function () { calls.push([].slice.call(arguments)); },"
                      " next: function (number) { calls.push('next ' + number); },"
                      " cancel: function (number) { calls.push('cancel ' + number); } })");
        page->attachScript(objectOf(functions.get()));
        script("plugin.clear(); 0");
    }

    uint32_t instance = addInstance("plugin");

    std::string journal() { return script("plugin.journal.replace(/\\n/g, ';')"); }
    std::string calls() { return script("var last = calls.join(';'); calls = []; last"); }
    void respond(uint32_t length = 0) {
        page->streams().onResponse(1, {"http://x/y", "a/b", "HTTP/1.1 200 OK\n", length, 0});
    }
};

INSTANTIATE_TEST_SUITE_P(Engines, BridgeStreams, testing::Values(EngineKind::CApi, EngineKind::GObject),
                         nameOf);

TEST_P(BridgeStreams, ARequestReachesThePageScript) {
    EXPECT_EQ(script("plugin.getNotify('u', '')"), "0");
    EXPECT_EQ(calls(), "1,u,,GET,,");
    EXPECT_EQ(script("plugin.get('v', 'frame')"), "0");
    EXPECT_EQ(calls(), "2,v,frame,GET,,");
}

TEST_P(BridgeStreams, PostedDataIsBytesAndMayHaveHeaders) {
    script("plugin.post('u', 'A: 1\\r\\n\\r\\n\\u00e4')");
    EXPECT_EQ(script("calls[0][4] + '|' + calls[0][5] + '|' + calls[0][5].length"),
              "|A: 1\r\n\r\n\u00c3\u00a4|10");
    script("plugin.postNotify('u', 'A: 1\\r\\nB: 2\\r\\n\\r\\nbody')");
    EXPECT_EQ(script("calls[1][4] + '|' + calls[1][5]"), "A: 1\r\nB: 2|body");
    script("plugin.postNotify('u', '\\nbody')");
    EXPECT_EQ(script("calls[2][4] + '|' + calls[2][5]"), "|body");
    script("plugin.postNotify('u', 'body alone')");
    EXPECT_EQ(script("calls[3][4] + '|' + calls[3][5]"), "|body alone");
}

TEST_P(BridgeStreams, AFileIsPostedWithItsHeaders) {
    gchar* name = nullptr;
    g_close(g_file_open_tmp("telix-post-XXXXXX", &name, nullptr), nullptr);
    ASSERT_TRUE(g_file_set_contents(name, "A: 1\n\nbody", -1, nullptr));
    const std::string file(name);
    const auto length = static_cast<uint32_t>(file.size());
    const NPError posted =
        browser.posturl(npp(instance), "u", nullptr, length, (file + "more").c_str(), true);
    g_unlink(name);
    g_free(name);
    EXPECT_EQ(posted, NPERR_NO_ERROR);
    EXPECT_EQ(calls(), "1,u,,POST,A: 1,body");
    EXPECT_EQ(browser.posturl(npp(instance), "u", nullptr, length, file.c_str(), true), NPERR_FILE_NOT_FOUND);
    EXPECT_EQ(browser.posturl(npp(instance), "u", nullptr, length, nullptr, true), NPERR_FILE_NOT_FOUND);
    EXPECT_EQ(calls(), "");
}

TEST_P(BridgeStreams, DataComesAPieceAtATime) {
    script("plugin.getNotify('u', '')");
    respond(5);
    page->streams().onData(1, "abc");
    page->streams().onData(1, "de");
    page->streams().onEnd(1, NPRES_DONE);
    EXPECT_EQ(calls(), "1,u,,GET,,;next 1;next 1;next 1");
    EXPECT_EQ(journal(), "stream http://x/y a/b 5;end 0 5;notify u 0;");
    EXPECT_EQ(script("plugin.content"), "abcde");
    EXPECT_EQ(script("plugin.headers"), "HTTP/1.1 200 OK\n");
}

TEST_P(BridgeStreams, APluginThatTakesNothingIsAskedAgain) {
    script("plugin.streams(1, false, 3); plugin.get('u', '')");
    respond();
    page->streams().onData(1, "abc");
    page->streams().onEnd(1, NPRES_DONE);
    EXPECT_EQ(journal().find("end"), std::string::npos);
    EXPECT_TRUE(runUntil([this] { return journal().find("end 0 3") != std::string::npos; }));
    EXPECT_EQ(journal(), "stream http://x/y a/b 0;end 0 3;");
}

TEST_P(BridgeStreams, WhatAWriteDoesNotTakeIsWrittenAgain) {
    script("plugin.writeResults(2, 0, 1); plugin.get('u', '')");
    respond();
    page->streams().onData(1, "abcde");
    EXPECT_EQ(script("plugin.content"), "ab");
    EXPECT_TRUE(runUntil([this] { return script("plugin.content") == "abcde"; }));
    page->streams().onEnd(1, NPRES_DONE);
    EXPECT_EQ(journal(), "stream http://x/y a/b 0;end 0 5;");
}

TEST_P(BridgeStreams, APluginThatIsNotReadyIsNotAskedForEachPieceOfData) {
    script("plugin.readyResults(0); plugin.get('u', '')");
    respond();
    page->streams().onData(1, "abc");
    page->streams().onData(1, "de");
    EXPECT_EQ(script("plugin.content"), "");
    EXPECT_TRUE(runUntil([this] { return script("plugin.content") == "abcde"; }));
}

TEST_P(BridgeStreams, APluginGetsAsMuchAsItIsReadyFor) {
    script("plugin.readyResults(1, 2, -1); plugin.get('u', '')");
    respond();
    page->streams().onData(1, "abcde");
    EXPECT_EQ(script("plugin.content"), "abc");
    EXPECT_TRUE(runUntil([this] { return script("plugin.content") == "abcde"; }));
    page->streams().onEnd(1, NPRES_DONE);
    EXPECT_EQ(journal(), "stream http://x/y a/b 0;end 0 5;");
}

TEST_P(BridgeStreams, AWriteThatFailsEndsTheStream) {
    script("plugin.writeResults(-1); plugin.getNotify('u', '')");
    respond();
    page->streams().onData(1, "abc");
    EXPECT_EQ(journal(), "stream http://x/y a/b 0;end 1 0;notify u 1;");
    EXPECT_EQ(calls(), "1,u,,GET,,;next 1;cancel 1");
}

TEST_P(BridgeStreams, AnErrorBeforeTheHeadIsNoStream) {
    script("plugin.getNotify('u', '')");
    page->streams().onEnd(1, NPRES_NETWORK_ERR);
    EXPECT_EQ(journal(), "notify u 1;");
}

TEST_P(BridgeStreams, AStreamThatIsRefusedEndsSilently) {
    script("plugin.streams(1, true); plugin.getNotify('u', '')");
    respond();
    EXPECT_EQ(journal(), "stream http://x/y a/b 0;notify u 0;");
    EXPECT_EQ(calls(), "1,u,,GET,,;cancel 1");
    page->streams().onData(1, "late");
    page->streams().onEnd(1, NPRES_DONE);
    EXPECT_EQ(journal(), "stream http://x/y a/b 0;notify u 0;");
}

TEST_P(BridgeStreams, AStreamThatIsDroppedInAWriteEndsThere) {
    script("plugin.streams(1, false, 0, 1); plugin.getNotify('u', '')");
    respond();
    page->streams().onData(1, std::string(5000, 'x'));
    EXPECT_EQ(journal(), "stream http://x/y a/b 0;end 2 1000;notify u 2;");
    EXPECT_EQ(calls(), "1,u,,GET,,;next 1;cancel 1");
}

TEST_P(BridgeStreams, FilesAreThereDuringTheCall) {
    script("plugin.streams(3); plugin.getNotify('u', '')");
    respond();
    page->streams().onData(1, "abc");
    page->streams().onEnd(1, NPRES_DONE);
    EXPECT_EQ(journal(), "stream http://x/y a/b 0;file given;end 0 3;notify u 0;");
    EXPECT_EQ(script("plugin.fileContent"), "abc");
    EXPECT_FALSE(g_file_test(script("plugin.file").c_str(), G_FILE_TEST_EXISTS));
}

TEST_P(BridgeStreams, AStreamThatFailsGivesNoFile) {
    script("plugin.streams(3); plugin.getNotify('u', '')");
    respond();
    page->streams().onData(1, "abc");
    page->streams().onEnd(1, NPRES_NETWORK_ERR);
    EXPECT_EQ(journal(), "stream http://x/y a/b 0;end 1 3;notify u 1;");
}

TEST_P(BridgeStreams, TheyEndWithTheirInstance) {
    addInstance("other");
    script("plugin.streams(1, false, 1000000); plugin.getNotify('u', ''); plugin.getNotify('v', '')");
    respond();
    page->streams().onData(1, "abc");
    script("other.clear(); 0");
    page->endInstance(instance);
    EXPECT_EQ(script("other.journal.replace(/\\n/g, ';').replace(/destroy .*/, 'destroy')"),
              "end 2 0;notify u 2;notify v 2;destroy");
    page->streams().onData(1, "late");
    page->streams().onResponse(2, {});
    g_usleep(20000);
    runMainLoop();
}

TEST_P(BridgeStreams, TheyAreTheInstancesOwn) {
    const uint32_t other = addInstance("other");
    script("plugin.get('u', '')");
    NPStream stranger = {};
    EXPECT_NE(browser.destroystream(npp(instance), &stranger, NPRES_DONE), NPERR_NO_ERROR);
    EXPECT_NE(browser.destroystream(npp(other), &stranger, NPRES_DONE), NPERR_NO_ERROR);
}

} // namespace
