// Script that a call of the plug-in runs may end the very object that the call is in. Each scenario below is
// run once to count its calls into the page, then again for each of these calls and each thing that a page
// can do there. What the test asks for is that nothing which has gone is used: the accounts of the browser
// see it for script objects, AddressSanitizer for all else.
#include <algorithm>
#include <cstring>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "src/application/ApplicationManager.h"
#include "src/avcontrol/AVControl.h"
#include "src/avcontrol/Asx.h"
#include "src/videobroadcast/VideoBroadcast.h"
#include "src/videobroadcast/VideoBroadcastUtils.h"
#include "tests/support/BorderTest.h"
#include "tests/unit/support/Heap.h"

namespace {

const char* const kAllTypes[] = {"application/oipfapplicationmanager",
                                 "application/oipfconfiguration",
                                 "application/oipfparentalcontrolmanager",
                                 "application/oipfcapabilities",
                                 "application/oipfdrmagent",
                                 "video/broadcast",
                                 "video/mp4"};

const char kPlaylist[] =
    "<asx><entry><ref href=\"http://media.example/1\"/><starttime value=\"00:00:05\"/></entry>"
    "<entry><ref href=\"http://media.example/2\"/></entry></asx>";

unsigned char* bytes(const char* text) {
    return reinterpret_cast<unsigned char*>(const_cast<char*>(text));
}

class ReentrancyTest : public BorderTest {
public:
    using Body = std::function<void(ReentrancyTest& page)>;
    struct Scenario {
        const char* name;
        Body run;
    };
    struct Action {
        const char* name;
        Body run;
    };

protected:
    ReentrancyTest() {
        anythingMayBeLeft(); // what is left on purpose depends on where a scenario stops
        platform.TELIX_JS_AV_CreatePlayer = [this](TELIX_JS_AV_HANDLE* player, int32_t, int32_t, uint32_t) {
            *player = m_nextHandle++;
            m_players.push_back(*player);
            return 0;
        };
        platform.TELIX_JS_AV_DestroyPlayer = [this](TELIX_JS_AV_HANDLE player) {
            m_players.erase(std::remove(m_players.begin(), m_players.end(), player), m_players.end());
            return 0;
        };
        platform.TELIX_JS_AV_Play = [this](TELIX_JS_AV_HANDLE player, auto...) { return use(player); };
        platform.TELIX_JS_AV_Seek = [this](TELIX_JS_AV_HANDLE player, auto...) { return use(player); };
        platform.TELIX_JS_AV_SetDisplayArea = [this](TELIX_JS_AV_HANDLE player, auto...) {
            return use(player);
        };
        platform.TELIX_JS_AV_RegisterOnPlayStateChange = keepsFor(playState);
        platform.TELIX_JS_AV_RegisterOnDRMRightsError = keepsFor(rightsError);
        platform.TELIX_JS_DRM_RegisterOnDRMMessageResult = keeps(drmResult);
        platform.TELIX_JS_VB_GetHandle = [this](TELIX_JS_VB_HANDLE* handle) {
            *handle = vbHandle = m_nextHandle++;
            return 0;
        };
        platform.TELIX_JS_VB_RegisterOnFullScreenChange = keeps(fullScreenChange);
        platform.TELIX_JS_VB_RegisterOnChannelChangeSucceeded = keeps(channelChange);
        platform.TELIX_JS_VB_RegisterOnChannelChangeError = keeps(channelError);
        platform.TELIX_JS_VB_RegisterOnPlayStateChange = keeps(vbPlayState);
        platform.TELIX_JS_VB_RegisterOnProgrammesChanged = keepsFor(programmes);
        platform.TELIX_JS_VB_RegisterOnParentalRatingChange = keepsFor(rating);
        platform.TELIX_JS_CAP_GetXmlCapabilities = [](char** xml) {
            *xml = strdup("<profilelist/>");
            return 0;
        };
        platform.TELIX_JS_SI_GetProgrammeHandles = [](uint32_t* count, TELIX_JS_SI_HANDLE** handles) {
            static TELIX_JS_SI_HANDLE programme = 1;
            *count = 1;
            *handles = &programme;
            return 0;
        };
    }

    // A page as it is before each run.
    void open() {
        g_lastPlayedInstance = nullptr;
        g_lastReceivedMessage = 0;
        asxClear();
        browser.whenEvaluatingTextFrom("window.createHbbTVApplication").gives(true);
        const ScriptObject window = browser.window();
        window.method("parseCapabilityDescString",
                      [this](const Values&) { return Value(browser.scriptObject("Document")); });
        window.method("getEncodedURL", [](const Values&) { return Value("http://media.example/encoded"); });
        window.method("getPlayCountVal", [](const Values&) { return Value("2"); });
    }

    // Runs the scenario with `action` at its call number `at` into the page; the number of calls that there
    // were.
    unsigned runWith(const Scenario& scenario, const Action* action, unsigned at) {
        open();
        unsigned calls = 0;
        browser.onEnteringPage([&] {
            if (++calls == at && action) {
                action->run(*this);
                ++m_actions;
            }
        });
        scenario.run(*this);
        browser.pump();
        browser.onEnteringPage(nullptr);
        browser.closePage();
        return calls;
    }

    void runEverywhere(const Scenario& scenario, const std::vector<Action>& actions) {
        SCOPED_TRACE(scenario.name);
        const size_t leftBefore = callbackHeap.left();
        const unsigned calls = runWith(scenario, nullptr, 0);
        EXPECT_GT(calls, 0U) << "the scenario never enters the page";
        EXPECT_EQ(callbackHeap.left(), leftBefore) << "an event that was delivered has left something";
        for (const Action& action : actions) {
            SCOPED_TRACE(action.name);
            for (unsigned at = 1; at <= calls && !HasFailure(); ++at) {
                SCOPED_TRACE("call into the page " + std::to_string(at));
                const unsigned before = m_actions;
                runWith(scenario, &action, at);
                EXPECT_EQ(m_actions, before + 1) << "the page did nothing";
            }
        }
    }

public:
    // Steps of scenarios and actions. What has left the page is left alone.

    EmbeddedObject make(const std::string& type, const Attributes& more = {}) {
        Attributes attributes{{"id", "object"}, {"src1", "a.mp4"}, {"buffering", "false"}};
        attributes.insert(attributes.end(), more.begin(), more.end());
        EmbeddedObject object = browser.embed(type, attributes);
        if (isThere(object)) {
            object.scriptObject();
        }
        return object;
    }

    static bool isThere(const EmbeddedObject& object) {
        return !object.isDestroyed() && object.error() == NPERR_NO_ERROR;
    }

    static void set(const EmbeddedObject& object, const char* name, const Value& value) {
        if (isThere(object)) {
            object.set(name, value);
        }
    }

    template <class... Arguments>
    static void call(const EmbeddedObject& object, const char* name, const Arguments&... arguments) {
        if (isThere(object)) {
            object.call(name, arguments...);
        }
    }

    EmbeddedObject broadcast() {
        EmbeddedObject object = make("video/broadcast");
        for (const char* handler : {"onFullScreenChange", "onChannelChangeSucceeded", "onChannelChangeError",
                                    "onPlayStateChange", "onProgrammesChanged", "onParentalRatingChange"}) {
            set(object, handler, browser.function(handler));
        }
        return object;
    }

    EmbeddedObject control(const char* type = "video/mp4", const Attributes& more = {}) {
        EmbeddedObject object = make(type, more);
        for (const char* handler : {"onPlayStateChange", "onFullScreenChange", "onPlaySpeedChanged",
                                    "onPlayPositionChanged", "onDRMRightsError"}) {
            set(object, handler, browser.function(handler));
        }
        return object;
    }

    EmbeddedObject playing(const char* type = "video/mp4") {
        EmbeddedObject object = control(type, {{"data", "http://media.example/a.mp4"}});
        call(object, "play", 1);
        send(TELIX_AV_CB_MSG_PLAYSTART);
        return object;
    }

    EmbeddedObject playlist() {
        EmbeddedObject object = browser.embed(
            "video/mp4", {{"id", "object"}, {"src", "http://media.example/list"}, {"buffering", "false"}});
        if (isThere(object)) {
            set(object, "onPlayStateChange", browser.function("onPlayStateChange"));
            BrowserStream& stream = object.newStream("http://media.example/list");
            stream.write(kPlaylist);
            stream.destroy();
        }
        return object;
    }

    // A message of the platform, which is posted to the page.
    void send(TELIX_AV_CB_MSG message) {
        if (playState) {
            callbackHeap.during([&] { playState(7, message); });
            browser.pump();
        }
    }

    template <class Function>
    static void onAnotherThread(Function function) {
        std::thread(function).join();
    }

    TELIX_JS_VB_HANDLE vbHandle = 0;
    TELIX_JS_AV_PLAYSTATE_CB playState = nullptr;
    TELIX_JS_AV_DRM_RIGHTS_CB rightsError = nullptr;
    TELIX_JS_DRM_MESSAGE_RESULT_CB drmResult = nullptr;
    TELIX_JS_VB_FULLSCREEN_CB fullScreenChange = nullptr;
    TELIX_JS_VB_CHANNEL_CHANGE_CB channelChange = nullptr;
    TELIX_JS_VB_CHANNEL_ERROR_CB channelError = nullptr;
    TELIX_JS_VB_PLAYSTATE_CB vbPlayState = nullptr;
    TELIX_JS_VB_PROGRAMMES_CB programmes = nullptr;
    TELIX_JS_VB_PARENTAL_RATING_CB rating = nullptr;
    ScriptedBrowser& page = browser;
    // Of the platform's callbacks. An event whose object the page has removed leaves its record or its
    // payload.
    HeapWatch callbackHeap;

private:
    // A player that has been destroyed is none of the platform's any more.
    int use(TELIX_JS_AV_HANDLE player) {
        EXPECT_NE(std::find(m_players.begin(), m_players.end(), player), m_players.end())
            << "a call for the player " << player << ", which has gone";
        return 0;
    }

    template <class Callback>
    static std::function<TELIX_RETCODE_ENUM_T(Callback)> keeps(Callback& place) {
        return [&place](Callback callback) {
            place = callback;
            return 0;
        };
    }
    template <class Callback>
    static std::function<TELIX_RETCODE_ENUM_T(uint32_t, Callback)> keepsFor(Callback& place) {
        return [&place](uint32_t, Callback callback) {
            place = callback;
            return 0;
        };
    }

    uint32_t m_nextHandle = 7;
    std::vector<TELIX_JS_AV_HANDLE> m_players;
    unsigned m_actions = 0;
};

using Page = ReentrancyTest;

void remove(Page& page) {
    page.page.removeElements();
}

void embedEverything(Page& page) {
    for (const char* type : kAllTypes) {
        page.make(type);
    }
}

const std::vector<Page::Action> kActions = {
    {"remove", remove},
    {"remove and wait, as in alert()",
     [](Page& page) {
         remove(page);
         page.page.pump();
     }},
    {"move",
     [](Page& page) {
         remove(page);
         page.broadcast();
         page.control();
     }},
    {"reload",
     [](Page& page) {
         remove(page);
         embedEverything(page);
         page.page.pump();
     }},
    {"navigate",
     [](Page& page) {
         page.page.setAddress("http://other.example/");
         remove(page);
         page.page.pump();
         page.page.setAddress("http://page.example/app/index.html");
     }},
    {"wait, as in alert()", [](Page& page) { page.page.pump(); }},
};

const std::vector<Page::Scenario> kDeviceScenarios = {
    {"every type is made", embedEverything},
    {"xmlCapabilities",
     [](Page& page) {
         const EmbeddedObject object = page.make("application/oipfcapabilities");
         if (Page::isThere(object)) {
             object.get("xmlCapabilities");
         }
     }},
    {"applications",
     [](Page& page) {
         const EmbeddedObject object = page.make("application/oipfapplicationmanager");
         if (!Page::isThere(object)) {
             return;
         }
         const Outcome owner = object.call("getOwnerApplication", page.page.document());
         if (!owner || !owner.value.isObject()) {
             return;
         }
         const ObjectRef application = owner.object();
         application.call("createApplication", "http://page.example/", false);
         application.call("show");
         application.call("hide");
         application.call("destroyApplication");
     }},
    {"key and load handlers",
     [](Page& page) {
         const EmbeddedObject object = page.make("application/oipfapplicationmanager");
         Page::set(object, "onApplicationLoadError", page.page.function("onApplicationLoadError"));
         if (!Page::isThere(object)) {
             return;
         }
         const Outcome owner = object.call("getOwnerApplication", page.page.document());
         if (!owner || !owner.value.isObject()) {
             return;
         }
         owner.object().set("onKeyDown", page.page.function("onKeyDown"));
         auto* manager = static_cast<ApplicationManager*>(object.model());
         if (Page::isThere(object)) {
             manager->handleKeyDownEvent();
         }
         if (Page::isThere(object)) {
             manager->handleApplicationLoadError();
         }
     }},
    {"DRM result",
     [](Page& page) {
         const EmbeddedObject object = page.make("application/oipfdrmagent");
         Page::set(object, "onDRMMessageResult", page.page.function("onDRMMessageResult"));
         if (page.drmResult) {
             page.drmResult(bytes("1"), bytes("message"), 0);
         }
     }},
};

const std::vector<Page::Scenario> kBroadcastScenarios = {
    {"setWindow",
     [](Page& page) {
         const EmbeddedObject object = page.broadcast();
         object.setRectangle(1, 2, 101, 102);
         object.setWindow(1, 2, 100, 100);
     }},
    {"setWindow without a place", [](Page& page) { page.broadcast().setWindow(0, 0, 0, 0); }},
    {"a stream event listener comes",
     [](Page& page) {
         Page::call(page.broadcast(), "addStreamEventListener", "events.xml", "goal",
                    page.page.function("f"));
     }},
    {"a stream event listener is registered",
     [](Page& page) {
         Page::call(page.broadcast(), "addStreamEventListener", "events.xml", "goal", "5", "7");
     }},
    {"a stream event listener goes",
     [](Page& page) {
         const EmbeddedObject object = page.broadcast();
         Page::call(object, "addStreamEventListener", "a", "b", "5", "7");
         Page::call(object, "removeStreamEventListener", "a", "b", page.page.function("f"));
     }},
    {"setFullScreen", [](Page& page) { Page::call(page.broadcast(), "setFullScreen", true); }},
    {"every event",
     [](Page& page) {
         page.broadcast();
         const TELIX_JS_VB_HANDLE handle = page.vbHandle;
         page.callbackHeap.during([&] {
             page.fullScreenChange(handle);
             page.channelChange(handle, 3);
             page.channelError(handle, 3, 1);
             page.vbPlayState(handle, 0, TELIX_PLAYSTATE_STOPPED, TELIX_ERR_STATE_NONE);
             page.programmes(handle);
             page.rating(handle, bytes("content"), 9, bytes("system"));
             streamEventHandler(handle, nullptr, nullptr, bytes("goal"), bytes("4142"), 4, bytes("trigger"));
         });
     }},
};

const std::vector<Page::Scenario> kControlScenarios = {
    {"data", [](Page& page) { Page::set(page.playing(), "data", "b.mp4"); }},
    {"setWindow",
     [](Page& page) {
         const EmbeddedObject object = page.control();
         object.setRectangle(1, 2, 101, 102);
         object.setWindow(1, 2, 100, 100);
     }},
    {"setWindow without a place", [](Page& page) { page.control().setWindow(0, 0, 0, 0); }},
    {"play, pause, play, stop",
     [](Page& page) {
         const EmbeddedObject object = page.playing();
         Page::call(object, "play", 0);
         Page::call(object, "play", 1);
         Page::call(object, "stop");
     }},
    {"speed",
     [](Page& page) {
         const EmbeddedObject object = page.playing();
         Page::call(object, "play", 2);
         Page::call(object, "play", 2);
     }},
    {"speed of a control at rest",
     [](Page& page) {
         Page::call(page.control("video/mp4", {{"data", "http://media.example/a.mp4"}}), "play", 2);
     }},
    {"seek", [](Page& page) { Page::call(page.playing(), "seek", 1000); }},
    {"seek that starts the stream again",
     [](Page& page) { Page::call(page.playing("audio/mpeg"), "seek", 1000); }},
    {"setFullScreen", [](Page& page) { Page::call(page.control(), "setFullScreen", true); }},
    {"queue", [](Page& page) { Page::call(page.playing(), "queue", "next.mp4"); }},
    {"a short sound",
     [](Page& page) {
         Page::call(page.control("audio/mp4", {{"data", "http://media.example/a.wav"}}), "play", 1);
     }},
    {"a playlist and its clips",
     [](Page& page) {
         const EmbeddedObject object = page.playlist();
         page.send(TELIX_AV_CB_MSG_PLAYSTART);
         Page::call(object, "next");
         Page::call(object, "previous");
         Page::set(object, "currentTrackIndex", 2);
         page.send(TELIX_AV_CB_MSG_PLAYSTART);
         page.send(TELIX_AV_CB_MSG_PLAYEND);
     }},
    {"the end of a clip",
     [](Page& page) {
         page.playing();
         page.send(TELIX_AV_CB_MSG_PLAYEND);
     }},
    {"an error of the platform",
     [](Page& page) {
         page.playing();
         page.send(TELIX_AV_CB_MSG_ERR_NOT_FOUND);
     }},
    {"an error of the network",
     [](Page& page) {
         const EmbeddedObject object = page.playing();
         if (Page::isThere(object)) {
             object.urlNotify("http://media.example/", NPRES_NETWORK_ERR);
         }
     }},
    {"a rights error",
     [](Page& page) {
         page.playing();
         if (page.rightsError) {
             page.callbackHeap.during(
                 [&] { page.rightsError(7, 1, bytes("content"), bytes("system"), bytes("url")); });
         }
     }},
    {"what the monitor posts",
     [](Page& page) {
         const EmbeddedObject object = page.playing();
         if (!Page::isThere(object)) {
             return;
         }
         auto* control = static_cast<AVControl*>(object.model());
         Page::onAnotherThread([control] {
             control->changePlayState(PLAY_STATE_BUFFERING);
             control->handlePlayPositionChanged();
             control->changeReadyState(5);
         });
     }},
};

TEST_F(ReentrancyTest, ObjectsOfTheDeviceOutliveTheCallsIntoThem) {
    for (const Scenario& scenario : kDeviceScenarios) {
        runEverywhere(scenario, kActions);
    }
}

TEST_F(ReentrancyTest, ABroadcastObjectOutlivesTheCallsIntoIt) {
    for (const Scenario& scenario : kBroadcastScenarios) {
        runEverywhere(scenario, kActions);
    }
}

TEST_F(ReentrancyTest, AnAVControlOutlivesTheCallsIntoIt) {
    for (const Scenario& scenario : kControlScenarios) {
        runEverywhere(scenario, kActions);
    }
}

// Script that replaces an element sees the end of the old object before the beginning of the new one.
TEST_F(ReentrancyTest, TheEndOfAnObjectThatACallIsInReachesThePlatformAtOnce) {
    open();
    const EmbeddedObject first = broadcast();
    const TELIX_JS_VB_HANDLE handle = vbHandle;
    const ScriptFunction handler = browser.function("handler");
    handler.does([&](const Values&) {
        first.destroy();
        make("video/broadcast");
        return Value();
    });
    first.set("onFullScreenChange", handler);
    log.clear();
    first.call("setFullScreen", true);
    log.expectInOrder({"TELIX_JS_VB_Release(" + std::to_string(handle) + ")", "TELIX_JS_VB_GetHandle(out)"});
}

// NPP_New of an element that script of its own removes.
TEST_F(ReentrancyTest, AnElementThatLeavesThePageWhileItIsMadeIsNotMade) {
    open();
    browser.onEnteringPage([&] { browser.removeElements(); });
    const EmbeddedObject object = browser.embed("video/mp4", {{"id", "object"}, {"data", "a.mp4"}});
    EXPECT_EQ(object.error(), NPERR_INVALID_INSTANCE_ERROR);
    EXPECT_EQ(object.model(), nullptr);
    EXPECT_TRUE(log.contains("TELIX_JS_AV_DestroyPlayer(7)"));
}

} // namespace
