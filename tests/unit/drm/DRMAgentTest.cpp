// The DRM agent: messages to the platform, and the results from the platform's threads to the page.
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <map>
#include <memory>

#include "src/drm/DRMAgent.h"
#include "tests/support/BorderTest.h"
#include "tests/unit/support/Heap.h"
#include "tests/unit/support/SameAddress.h"

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

namespace {

const char* const kType = "application/oipfdrmagent";
constexpr std::chrono::seconds kBound(50); // for what comes at once unless it never comes

class DRMAgentTest : public BorderTest {
protected:
    // What the platform does when a result has come. The strings are gone when the callback returns.
    void platformReports(const std::string& messageId, const std::string& message, int32_t code) const {
        std::vector<unsigned char> id(messageId.begin(), messageId.end());
        std::vector<unsigned char> text(message.begin(), message.end());
        id.push_back(0);
        text.push_back(0);
        EXPECT_EQ(callback.load()(id.data(), text.data(), code), 0);
        std::fill(id.begin(), id.end(), 'x');
        std::fill(text.begin(), text.end(), 'x');
    }

    void reportFromAnotherThread(const std::string& messageId, const std::string& message,
                                 int32_t code) const {
        onPlatformThread([&] { platformReports(messageId, message, code); });
    }

    void sendsGetTheId(const char* id, TELIX_RETCODE_ENUM_T result = TELIX_RETCODE_SUCCESS) {
        platform.TELIX_JS_DRM_SendDRMMessage = [id, result](const char*, const char*, const char*,
                                                            char** out) {
            *out = id ? strdup(id) : nullptr;
            return result;
        };
    }

    void sendsAreRefused() {
        platform.TELIX_JS_DRM_SendDRMMessage = [](const char*, const char*, const char*, char**) {
            return 1;
        };
    }

    Outcome send() const { return agent.call("sendDRMMessage", "type", "message", "system"); }

    // What each call of a handler leaves: its reference and the blocks of both strings.
    void callsLeave(const ScriptFunction& handler, int calls) {
        leftBehind(handler, calls);
        memoryLeftBehind(2 * static_cast<size_t>(calls));
    }

    std::atomic<TELIX_JS_DRM_MESSAGE_RESULT_CB> callback{nullptr};
    EmbeddedObject agent = firstAgent();

private:
    EmbeddedObject firstAgent() {
        platform.TELIX_JS_DRM_RegisterOnDRMMessageResult = [this](TELIX_JS_DRM_MESSAGE_RESULT_CB given) {
            callback = given;
            return TELIX_RETCODE_SUCCESS;
        };
        return browser.embed(kType, {{"id", "drm"}});
    }
};

// Life.

TEST_F(DRMAgentTest, IsMadeForItsTypeInAnyCase) {
    EXPECT_EQ(static_cast<PluginBase*>(agent.model())->getObjectId(), 800);
    const EmbeddedObject other = browser.embed("application/OIPFdrmAgent");
    EXPECT_EQ(static_cast<PluginBase*>(other.model())->getObjectId(), 800);
}

TEST_F(DRMAgentTest, RegistersItsCallbackBeforeAnythingElseAndGivesItUpFirst) {
    EXPECT_EQ(callback.load(), DRMAgent::onDRMMessageResultCb);
    log.expectInOrder({"TELIX_JS_DRM_RegisterOnDRMMessageResult(callback)", "NPN_SetValue 3 0"});
    agent.set("onDRMMessageResult", browser.function("handler"));
    agent.dropScriptObject();
    TELIX_JS_DRM_MESSAGE_RESULT_CB givenUp = nullptr;
    platform.TELIX_JS_DRM_UnregisterOnDRMMessageResult = [&](TELIX_JS_DRM_MESSAGE_RESULT_CB given) {
        givenUp = given;
        return 1; // not looked at
    };
    log.clear();
    EXPECT_EQ(agent.destroy(), NPERR_NO_ERROR);
    EXPECT_EQ(givenUp, DRMAgent::onDRMMessageResultCb);
    EXPECT_THAT(log.everything(), ElementsAre("TELIX_JS_DRM_UnregisterOnDRMMessageResult(callback)",
                                              "NPN_ReleaseObject JSDRMAgent", "NPN_ReleaseObject handler",
                                              "NPN_ReleaseObject drm"));
}

TEST_F(DRMAgentTest, IsMadeAlsoIfThePlatformRefusesTheCallback) {
    platform.TELIX_JS_DRM_RegisterOnDRMMessageResult = [](TELIX_JS_DRM_MESSAGE_RESULT_CB) { return 1; };
    const EmbeddedObject other = browser.embed(kType);
    EXPECT_NE(other.model(), nullptr);
}

TEST_F(DRMAgentTest, EveryAgentRegistersAndGivesUpTheOneCallback) {
    const EmbeddedObject other = browser.embed(kType);
    EXPECT_EQ(platform.TELIX_JS_DRM_RegisterOnDRMMessageResult.count(), 2U);
    other.destroy();
    EXPECT_EQ(platform.TELIX_JS_DRM_UnregisterOnDRMMessageResult.count(), 1U);
    agent.destroy();
    EXPECT_EQ(platform.TELIX_JS_DRM_UnregisterOnDRMMessageResult.count(), 2U);
}

TEST_F(DRMAgentTest, TheYoungestAgentIsTheOneForResultsAndStaysItWhenItHasGone) {
    EXPECT_EQ(static_cast<PluginBase*>(drmAgentInst.address()), agent.model());
    const EmbeddedObject other = browser.embed(kType);
    const void* youngest = other.model();
    EXPECT_EQ(static_cast<PluginBase*>(drmAgentInst.address()), youngest);
    other.destroy();
    EXPECT_EQ(static_cast<PluginBase*>(drmAgentInst.address()), youngest);
}

TEST_F(DRMAgentTest, HandsOutOneScriptObject) {
    const ObjectRef script = agent.scriptObject();
    EXPECT_EQ(browser.classNameOf(script.object()), "JSDRMAgent");
    EXPECT_EQ(script.pluginReferences(), 1);
    agent.dropScriptObject();
    EXPECT_EQ(agent.scriptObject(), script);
    EXPECT_EQ(script.pluginReferences(), 1);
}

TEST_F(DRMAgentTest, FetchesItsNamesInTheirOrder) {
    log.clear();
    agent.scriptObject();
    EXPECT_THAT(log.startingWith("NPN_GetStringIdentifier"),
                ElementsAre("NPN_GetStringIdentifier \"onDRMMessageResult\"",
                            "NPN_GetStringIdentifier \"sendDRMMessage\""));
}

TEST_F(DRMAgentTest, TellsOfItsEndInTheLog) {
    char line[100];
    std::snprintf(line, sizeof line, "DRMAGENT_OBJ_ID delete :: %p \n", agent.model());
    EXPECT_THAT(logOf(1, [&] { agent.destroy(); }), HasSubstr(line));
}

// The table.

TEST_F(DRMAgentTest, HasOnePropertyAndOneMethod) {
    EXPECT_TRUE(agent.hasProperty("onDRMMessageResult"));
    EXPECT_TRUE(agent.hasMethod("sendDRMMessage"));
    EXPECT_FALSE(agent.hasMethod("onDRMMessageResult"));
    EXPECT_FALSE(agent.hasProperty("sendDRMMessage"));
    EXPECT_FALSE(agent.call("onDRMMessageResult", "a", "b", "c").succeeded);
    EXPECT_FALSE(agent.get("sendDRMMessage").succeeded);
    EXPECT_FALSE(agent.set("sendDRMMessage", nullptr).succeeded);
    EXPECT_FALSE(agent.hasProperty("onDRMMessageresult"));
    EXPECT_FALSE(agent.set("other", nullptr).succeeded);
    EXPECT_FALSE(agent.call("other", "a", "b", "c").succeeded);
    EXPECT_FALSE(agent.scriptObject().callDefault());
    EXPECT_EQ(platform.TELIX_JS_DRM_SendDRMMessage.count(), 0U);
    NPVariant result{};
    result.type = NPVariantType_Int32;
    NPObject* script = agent.scriptObject().object();
    EXPECT_FALSE(script->_class->getProperty(script, Name("other").identifier(), &result));
    EXPECT_EQ(result.type, NPVariantType_Void);
}

TEST_F(DRMAgentTest, ItsScriptObjectIsDeadWithoutItAndSaysSo) {
    agent.scriptObject();
    agent.destroy();
    EXPECT_FALSE(send().succeeded);
    EXPECT_FALSE(agent.get("onDRMMessageResult").succeeded);
    EXPECT_FALSE(agent.set("onDRMMessageResult", browser.function("handler")).succeeded);
    EXPECT_EQ(platform.TELIX_JS_DRM_SendDRMMessage.count(), 0U);
    EXPECT_EQ(logOf(12, [&] { send(); }), logLine("DRMAGENT", "Invoke", " Can't find plugin pointer\n"));
}

// The handler.

TEST_F(DRMAgentTest, AHandlerIsKeptReadBackAndReplaced) {
    EXPECT_EQ(agent.get("onDRMMessageResult"), Value(nullptr));
    const ScriptFunction first = browser.function("first");
    const ScriptFunction second = browser.function("second");
    EXPECT_TRUE(agent.set("onDRMMessageResult", first));
    EXPECT_EQ(agent.get("onDRMMessageResult"), Value(first));
    EXPECT_EQ(first.pluginReferences(), 1);
    EXPECT_TRUE(agent.set("onDRMMessageResult", second));
    EXPECT_EQ(agent.get("onDRMMessageResult"), Value(second));
    EXPECT_EQ(first.pluginReferences(), 0);
    EXPECT_EQ(second.pluginReferences(), 1);
}

TEST_F(DRMAgentTest, NullClearsTheHandlerAndOtherValuesChangeNothing) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    for (const Value& value : Values{1, 1.5, true, "text", undefined}) {
        EXPECT_TRUE(agent.set("onDRMMessageResult", value)) << value;
        EXPECT_EQ(agent.get("onDRMMessageResult"), Value(handler)) << value;
    }
    EXPECT_TRUE(agent.set("onDRMMessageResult", nullptr));
    EXPECT_EQ(agent.get("onDRMMessageResult"), Value(nullptr));
    EXPECT_EQ(handler.pluginReferences(), 0);
    EXPECT_TRUE(agent.set("onDRMMessageResult", nullptr));
}

TEST_F(DRMAgentTest, TheHandlerMayBeSetToItself) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    EXPECT_TRUE(agent.set("onDRMMessageResult", handler));
    EXPECT_EQ(handler.pluginReferences(), 1);
}

// Sending.

TEST_F(DRMAgentTest, AMessageGoesToThePlatformAndItsIdToScript) {
    sendsGetTheId("id-1");
    log.clear();
    const Outcome sent =
        agent.call("sendDRMMessage", "application/x", "<message a='\"'/>", "urn:dvb:casystemid:1");
    EXPECT_EQ(sent, Value("id-1"));
    EXPECT_TRUE(sent.inBrowserMemory);
    EXPECT_THAT(log.startingWith("TELIX"),
                ElementsAre("TELIX_JS_DRM_SendDRMMessage(\"application/x\", \"<message a='\"'/>\", "
                            "\"urn:dvb:casystemid:1\", out)"));
    EXPECT_THAT(browser.events(), IsEmpty());
}

TEST_F(DRMAgentTest, EmptyTextsAreSentToo) {
    sendsGetTheId("id-1");
    EXPECT_EQ(agent.call("sendDRMMessage", "", "", ""), Value("id-1"));
    EXPECT_TRUE(log.contains("TELIX_JS_DRM_SendDRMMessage(\"\", \"\", \"\", out)"));
}

TEST_F(DRMAgentTest, AFailedSendGivesTheIdOfTheMessageBefore) {
    sendsGetTheId("id-1");
    send();
    sendsAreRefused();
    EXPECT_EQ(send(), Value("id-1"));
    sendsGetTheId("id-2");
    EXPECT_EQ(send(), Value("id-2"));
}

TEST_F(DRMAgentTest, AnIdThatThePlatformWritesAlthoughItRefusesIsNeitherUsedNorFreed) {
    char* const written = strdup("id-9");
    platform.TELIX_JS_DRM_SendDRMMessage = [written](const char*, const char*, const char*, char** out) {
        *out = written;
        return 1;
    };
    EXPECT_EQ(send(), Value(nullptr));
    EXPECT_STREQ(written, "id-9"); // AddressSanitizer would report a block that is freed twice
    std::free(written);
}

TEST_F(DRMAgentTest, AFailedSendWithoutOneBeforeGivesNull) {
    sendsAreRefused();
    EXPECT_EQ(send(), Value(nullptr));
}

TEST_F(DRMAgentTest, SuccessWithoutAnIdGivesTheIdOfTheMessageBefore) {
    sendsGetTheId(nullptr);
    EXPECT_EQ(send(), Value(nullptr));
    sendsGetTheId("id-1");
    send();
    sendsGetTheId(nullptr);
    EXPECT_EQ(send(), Value("id-1"));
}

TEST_F(DRMAgentTest, AnEmptyIdIsNullAndTakesThePlaceOfTheOneBefore) {
    sendsGetTheId("id-1");
    send();
    sendsGetTheId("");
    EXPECT_EQ(send(), Value(nullptr));
    sendsAreRefused();
    EXPECT_EQ(send(), Value(nullptr));
}

TEST_F(DRMAgentTest, TheIdIsNullIfTheBrowserHasNoMemoryAndKeptAllTheSame) {
    sendsGetTheId("id-1");
    browser.refuse("NPN_MemAlloc", 1);
    EXPECT_EQ(send(), Value(nullptr));
    sendsAreRefused();
    EXPECT_EQ(send(), Value("id-1"));
}

TEST_F(DRMAgentTest, EachAgentKeepsItsOwnLastId) {
    const EmbeddedObject other = browser.embed(kType);
    sendsGetTheId("id-1");
    send();
    sendsAreRefused();
    EXPECT_EQ(other.call("sendDRMMessage", "type", "message", "system"), Value(nullptr));
}

TEST_F(DRMAgentTest, AnyArgumentThatIsNoTextIsRefused) {
    sendsGetTheId("id-1");
    for (size_t place = 0; place < 3; ++place) {
        for (const Value& value :
             Values{1, 1.5, true, nullptr, undefined, Value(browser.scriptObject("o"))}) {
            Values arguments{"type", "message", "system"};
            arguments[place] = value;
            EXPECT_FALSE(agent.scriptObject().callWith("sendDRMMessage", arguments)) << listOf(arguments);
        }
    }
    EXPECT_FALSE(agent.call("sendDRMMessage"));
    EXPECT_FALSE(agent.call("sendDRMMessage", "type", "message"));
    EXPECT_EQ(platform.TELIX_JS_DRM_SendDRMMessage.count(), 0U);
}

TEST_F(DRMAgentTest, FurtherArgumentsAreNotLookedAt) {
    sendsGetTheId("id-1");
    EXPECT_EQ(agent.call("sendDRMMessage", "type", "message", "system", nullptr), Value("id-1"));
}

TEST_F(DRMAgentTest, LogsASend) {
    sendsGetTheId("id-1");
    agent.scriptObject();
    const std::string text = logOf(12, [&] { send(); });
    EXPECT_THAT(text, HasSubstr(logLine("DRMAGENT", "Invoke", " mId_sendDRMMessage\n")));
    EXPECT_THAT(text, HasSubstr(" PLUGIN >>> DRMAGENT :: sendDRMMessage :: "));
    EXPECT_THAT(text, HasSubstr(logLine("DRMAGENT", "sendDRMMessage",
                                        " Message Id value returned from IF API = ( id-1 ) \n")));
    EXPECT_THAT(text, HasSubstr(logLine("DRMAGENT", "Invoke", " msgID == id-1\n")));
    sendsAreRefused();
    EXPECT_THAT(logOf(12, [&] { send(); }), Not(HasSubstr("IF API")));
    EXPECT_THAT(logOf(12, [&] { send(); }), HasSubstr(logLine("DRMAGENT", "Invoke", " msgID == \n")));
}

// Results.

TEST_F(DRMAgentTest, AResultWaitsForTheBrowsersThread) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    log.clear();
    reportFromAnotherThread("id-1", "<answer/>", 2);
    EXPECT_THAT(log.everything(), IsEmpty());
    browser.pump();
    EXPECT_EQ(handler.count(), 1U);
    callsLeave(handler, 1);
}

TEST_F(DRMAgentTest, AResultIsADomEventAndThenACallOfTheHandler) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    log.clear();
    reportFromAnotherThread("id-1", "<answer/>", 2);
    browser.pump();
    EXPECT_EQ(
        browser.scripts(),
        std::vector<std::string>{
            "var objElement=document.getElementById(\"drm\"); newEvent=document.createEvent(\"Event\");"
            "newEvent.initEvent(\"DRMMessageResult\", false,false); objElement.dispatchEvent(newEvent);"});
    EXPECT_EQ(browser.events(),
              std::vector<DomEvent>{(DomEvent{"DRMMessageResult", "drm", false, false, {}})});
    log.expectInOrder(
        {"event DRMMessageResult at drm", "NPN_InvokeDefault handler(\"id-1\", \"<answer/>\", 2)"});
    EXPECT_EQ(handler.calls(), (std::vector<Values>{{"id-1", "<answer/>", 2}}));
    callsLeave(handler, 1);
}

TEST_F(DRMAgentTest, EachResultIsDeliveredOnce) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    reportFromAnotherThread("id-1", "a", 0);
    browser.pump();
    browser.pump();
    EXPECT_EQ(handler.count(), 1U);
    EXPECT_EQ(browser.events().size(), 1U);
    callsLeave(handler, 1);
}

TEST_F(DRMAgentTest, EveryCallLeavesTheHandlersReferenceAndTwoTexts) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    for (int i = 0; i < 3; ++i) {
        reportFromAnotherThread("id", "a", i);
    }
    browser.pump();
    EXPECT_EQ(handler.pluginReferences(), 1 + 3);
    callsLeave(handler, 3);
}

TEST_F(DRMAgentTest, ResultCodesReachTheHandlerUnchanged) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    const std::vector<int32_t> codes{
        0, 1, -1, 4711, std::numeric_limits<int32_t>::min(), std::numeric_limits<int32_t>::max()};
    for (const int32_t code : codes) {
        reportFromAnotherThread("id", "a", code);
    }
    browser.pump();
    ASSERT_EQ(handler.count(), codes.size());
    for (size_t i = 0; i < codes.size(); ++i) {
        EXPECT_EQ(handler.calls()[i][2], Value(codes[i]));
    }
    callsLeave(handler, static_cast<int>(codes.size()));
}

TEST_F(DRMAgentTest, AnEmptyTextIsAStringOfNoLength) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    reportFromAnotherThread("id-1", "", 0);
    browser.pump();
    EXPECT_EQ(handler.last(), (Values{"id-1", "", 0}));
    callsLeave(handler, 1);
}

TEST_F(DRMAgentTest, AnEmptyTextIsNullIfTheBrowserGivesNoBlockForIt) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    browser.refuse("NPN_MemAlloc", 1, 1);
    reportFromAnotherThread("id-1", "", 0);
    browser.pump();
    EXPECT_EQ(handler.last(), (Values{"id-1", nullptr, 0}));
    EXPECT_TRUE(log.contains("NPN_MemAlloc 0"));
    leftBehind(handler);
    memoryLeftBehind(1);
}

TEST_F(DRMAgentTest, TextsAreNullWithoutTheBrowsersMemory) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    browser.refuse("NPN_MemAlloc");
    reportFromAnotherThread("id-1", "text", 3);
    browser.pump();
    EXPECT_EQ(handler.last(), (Values{nullptr, nullptr, 3}));
    leftBehind(handler);
}

TEST_F(DRMAgentTest, ARecordCopiesItsTexts) {
    unsigned char id[] = "id-1";
    unsigned char message[] = "text";
    const DRMMsgEventData record(id, message, 5);
    id[0] = message[0] = 'x';
    EXPECT_STREQ(record.messageId, "id-1");
    EXPECT_STREQ(record.resultMessage, "text");
    EXPECT_EQ(record.resultCode, 5);
}

TEST_F(DRMAgentTest, TextsThatTheRecordCouldNotCopyAreNull) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    unsigned char text[] = "text";
    auto* record = new DRMMsgEventData(text, text, 5);
    for (char** copy : {&record->messageId, &record->resultMessage}) {
        std::free(*copy);
        *copy = nullptr;
    }
    EXPECT_EQ(handleDRMMessageResultEvent(record), 0);
    EXPECT_EQ(handler.last(), (Values{nullptr, nullptr, 5}));
    leftBehind(handler);
}

TEST_F(DRMAgentTest, WithoutMemoryForTheFirstTextTheSecondIsNotCopiedEither) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    const auto reportWithoutMemoryAfter = [this](unsigned texts) {
        unsigned char id[] = "id-1";
        unsigned char message[] = "text";
        onPlatformThread([&] {
            const MemoryShortage shortage(1, texts);
            callback.load()(id, message, 5);
        });
        browser.pump();
    };
    reportWithoutMemoryAfter(0);
    EXPECT_EQ(handler.last(), (Values{nullptr, nullptr, 5}));
    reportWithoutMemoryAfter(1);
    EXPECT_EQ(handler.last(), (Values{"id-1", nullptr, 5}));
    EXPECT_EQ(handler.count(), 2U);
    leftBehind(handler, 2);
    memoryLeftBehind(1);
}

TEST_F(DRMAgentTest, NoRecordIsNoResult) {
    log.clear();
    EXPECT_EQ(handleDRMMessageResultEvent(nullptr), 0);
    EXPECT_THAT(log.everything(), IsEmpty());
}

TEST_F(DRMAgentTest, WithoutAHandlerAResultIsADomEventAlone) {
    log.clear();
    reportFromAnotherThread("id-1", "a", 0);
    browser.pump();
    EXPECT_THAT(browser.eventTypes(), ElementsAre("DRMMessageResult"));
    EXPECT_EQ(log.count("NPN_InvokeDefault"), 0U);
}

TEST_F(DRMAgentTest, SettingTheHandlerToNullStopsTheCallsButNotTheEvent) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    reportFromAnotherThread("id-1", "a", 0);
    browser.pump();
    agent.set("onDRMMessageResult", nullptr);
    reportFromAnotherThread("id-2", "b", 0);
    browser.pump();
    EXPECT_EQ(handler.count(), 1U);
    EXPECT_EQ(browser.events().size(), 2U);
    callsLeave(handler, 1);
}

TEST_F(DRMAgentTest, AListenerOfTheEventMayChangeTheHandlerThatIsCalledNext) {
    const ScriptFunction first = browser.function("first");
    const ScriptFunction second = browser.function("second");
    agent.set("onDRMMessageResult", first);
    browser.onEvent("DRMMessageResult", [&](const DomEvent&) { agent.set("onDRMMessageResult", second); });
    reportFromAnotherThread("id-1", "a", 0);
    browser.pump();
    EXPECT_EQ(first.count(), 0U);
    EXPECT_EQ(second.count(), 1U);
    callsLeave(second, 1);
}

TEST_F(DRMAgentTest, AHandlerThatThrowsIsCalledAgain) {
    const ScriptFunction handler = browser.function("handler");
    handler.throws();
    agent.set("onDRMMessageResult", handler);
    reportFromAnotherThread("id-1", "a", 0);
    reportFromAnotherThread("id-2", "b", 0);
    browser.pump();
    EXPECT_EQ(handler.count(), 2U);
    callsLeave(handler, 2);
}

TEST_F(DRMAgentTest, TheHandlerMaySendTheNextMessage) {
    const ScriptFunction handler = browser.function("handler");
    handler.does([this](const Values&) { return send().value; });
    agent.set("onDRMMessageResult", handler);
    sendsGetTheId("id-2");
    reportFromAnotherThread("id-1", "a", 0);
    browser.pump();
    EXPECT_EQ(platform.TELIX_JS_DRM_SendDRMMessage.count(), 1U);
    callsLeave(handler, 1);
}

TEST_F(DRMAgentTest, LogsAResultWhereItArrives) {
    EXPECT_THAT(logOf(12, [&] { platformReports("id-1", "answer", 3); }),
                HasSubstr(" PLUGIN >>> DRMAGENT :: onDRMMessageResultCb :: "));
}

TEST_F(DRMAgentTest, AResultForAnElementWithoutAnIdStopsTheProcess) {
    browser.embed(kType);
    platformReports("id-1", "a", 0);
    EXPECT_DEATH(browser.pump(), "common/PluginUtils.*!id\\.empty\\(\\)");
    // A younger agent with an id takes the result over.
    browser.embed(kType, {{"id", "other"}});
    browser.pump();
    EXPECT_EQ(browser.events().size(), 1U);
}

// Several agents.

TEST_F(DRMAgentTest, AResultForTheFirstOfTwoAgentsIsDeliveredToTheSecond) {
    const ScriptFunction first = browser.function("first");
    const ScriptFunction second = browser.function("second");
    const EmbeddedObject other = browser.embed(kType, {{"id", "other"}});
    agent.set("onDRMMessageResult", first);
    other.set("onDRMMessageResult", second);
    sendsGetTheId("id-1");
    EXPECT_EQ(send(), Value("id-1"));
    reportFromAnotherThread("id-1", "a", 0);
    browser.pump();
    ASSERT_EQ(browser.events().size(), 1U);
    EXPECT_EQ(browser.events()[0].elementId, "other");
    EXPECT_EQ(first.count(), 0U);
    EXPECT_EQ(second.calls(), (std::vector<Values>{{"id-1", "a", 0}}));
    callsLeave(second, 1);
}

TEST_F(DRMAgentTest, ResultsGoToTheSecondAlsoWhenTheFirstHasGone) {
    const ScriptFunction handler = browser.function("handler");
    const EmbeddedObject other = browser.embed(kType, {{"id", "other"}});
    other.set("onDRMMessageResult", handler);
    agent.destroy();
    reportFromAnotherThread("id-1", "a", 0);
    browser.pump();
    EXPECT_EQ(handler.count(), 1U);
    callsLeave(handler, 1);
}

TEST_F(DRMAgentTest, ResultsForAYoungestAgentThatHasGoneAreDropped) {
    const ScriptFunction handler = browser.function("handler");
    const EmbeddedObject other = browser.embed(kType, {{"id", "other"}});
    agent.set("onDRMMessageResult", handler);
    other.set("onDRMMessageResult", handler);
    reportFromAnotherThread("id-1", "queued before the end", 0);
    other.destroy();
    reportFromAnotherThread("id-2", "reported after it", 0);
    log.clear();
    browser.pump();
    EXPECT_THAT(log.everything(), IsEmpty());
    EXPECT_EQ(handler.count(), 0U);
}

TEST_F(DRMAgentTest, ANewAgentTakesOverWhatIsStillOnItsWay) {
    const ScriptFunction handler = browser.function("handler");
    reportFromAnotherThread("id-1", "a", 0);
    agent.destroy();
    const EmbeddedObject other = browser.embed(kType, {{"id", "other"}});
    other.set("onDRMMessageResult", handler);
    browser.pump();
    EXPECT_EQ(handler.count(), 1U);
    callsLeave(handler, 1);
}

TEST_F(DRMAgentTest, AListenerOfTheEventMayEndTheAgent) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    browser.onEvent("DRMMessageResult", [&](const DomEvent&) { agent.destroy(); });
    reportFromAnotherThread("id-1", "a", 0);
    reportFromAnotherThread("id-2", "b", 0);
    browser.pump();
    EXPECT_EQ(browser.events().size(), 1U);
    EXPECT_EQ(handler.count(), 0U);
}

TEST_F(DRMAgentTest, AListenerOfTheEventMayPutAnotherAgentInItsPlace) {
    const ScriptFunction handler = browser.function("handler");
    const SameAddress place(sizeof(DRMAgent));
    const EmbeddedObject first = browser.embed(kType, {{"id", "drm"}});
    std::unique_ptr<EmbeddedObject> second;
    browser.onEvent("DRMMessageResult", [&](const DomEvent&) {
        first.destroy();
        second = std::make_unique<EmbeddedObject>(browser.embed(kType, {{"id", "drm"}}));
        ASSERT_NE(second->model(), place.address()); // where the first one still stands for its event
        second->set("onDRMMessageResult", handler);
    });
    reportFromAnotherThread("id-1", "a", 0);
    browser.pump();
    EXPECT_EQ(browser.events().size(), 1U);
    EXPECT_EQ(handler.count(), 0U);
}

TEST_F(DRMAgentTest, TheHandlerMayEndTheAgent) {
    const ScriptFunction handler = browser.function("handler");
    handler.does([this](const Values&) {
        agent.destroy();
        return undefined;
    });
    agent.set("onDRMMessageResult", handler);
    reportFromAnotherThread("id-1", "a", 0);
    reportFromAnotherThread("id-2", "b", 0);
    browser.pump();
    EXPECT_EQ(handler.count(), 1U);
    callsLeave(handler, 1);
}

// Several threads.

TEST_F(DRMAgentTest, ResultsReachThePageInTheOrderOfThePlatformsCalls) {
    const ScriptFunction handler = browser.function("handler");
    agent.set("onDRMMessageResult", handler);
    constexpr int results = 50;
    for (int i = 0; i < results; ++i) {
        // From changing threads, one after the other.
        onPlatformThreads({[&] { platformReports("id-" + std::to_string(i), "a", i); }});
    }
    browser.pump();
    ASSERT_EQ(handler.count(), static_cast<size_t>(results));
    for (int i = 0; i < results; ++i) {
        EXPECT_EQ(handler.calls()[static_cast<size_t>(i)], (Values{"id-" + std::to_string(i), "a", i}));
    }
    callsLeave(handler, results);
}

TEST_F(DRMAgentTest, ResultsOfSeveralThreadsAtOnceAllArriveEachThreadsInOrderEventBeforeHandler) {
    const ScriptFunction first = browser.function("first");
    const ScriptFunction second = browser.function("second");
    const EmbeddedObject other = browser.embed(kType, {{"id", "other"}});
    agent.set("onDRMMessageResult", first);
    other.set("onDRMMessageResult", second);
    constexpr int threads = 4;
    constexpr int results = 100;
    std::vector<std::function<void()>> reporters;
    reporters.reserve(threads);
    std::atomic<int> ended{0};
    for (int thread = 0; thread < threads; ++thread) {
        reporters.emplace_back([this, thread, &ended] {
            for (int i = 0; i < results; ++i) {
                platformReports(std::to_string(thread), "result " + std::to_string(i), i);
            }
            ++ended;
        });
    }
    log.clear();
    // The browser's thread delivers while the others report.
    std::thread platformThreads([&] { onPlatformThreads(reporters); });
    browser.pumpUntil([&] { return second.count() == size_t{threads} * results; }, kBound);
    platformThreads.join();
    EXPECT_EQ(ended, threads);
    EXPECT_EQ(first.count(), 0U);

    std::map<std::string, int> next; // of each thread
    for (const Values& call : second.calls()) {
        ASSERT_EQ(call.size(), 3U);
        const int expected = next[call[0].string()]++;
        EXPECT_EQ(call[1], Value("result " + std::to_string(expected)));
        EXPECT_EQ(call[2], Value(expected));
    }
    EXPECT_EQ(next.size(), static_cast<size_t>(threads));

    BorderLog::Entries steps;
    for (const std::string& entry : log.calls()) {
        if (entry == "event DRMMessageResult at other" || entry.rfind("NPN_InvokeDefault second(", 0) == 0) {
            steps.push_back(entry);
        }
    }
    ASSERT_EQ(steps.size(), 2U * threads * results);
    for (size_t i = 0; i < steps.size(); i += 2) {
        EXPECT_EQ(steps[i], "event DRMMessageResult at other");
        EXPECT_THAT(steps[i + 1], HasSubstr("NPN_InvokeDefault second("));
    }
    callsLeave(second, threads * results);
}

TEST_F(DRMAgentTest, AgentsMayComeAndGoWhileThreadsReport) {
    constexpr int results = 200;
    std::atomic<bool> ended{false};
    std::thread platformThreads([&] {
        const auto report = [this] {
            for (int i = 0; i < results; ++i) {
                platformReports("id", "a", i);
            }
        };
        onPlatformThreads({report, report});
        ended = true;
    });
    int round = 0;
    browser.pumpUntil(
        [&] {
            if (++round % 5 == 0) {
                browser.embed(kType, {{"id", "agent" + std::to_string(round)}}).destroy();
            }
            return ended.load();
        },
        kBound);
    platformThreads.join();
    const EmbeddedObject last = browser.embed(kType, {{"id", "last"}});
    browser.pump();
    EXPECT_LE(browser.events().size(), 2U * results);
}

} // namespace
