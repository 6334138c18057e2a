// Many platform threads at once, while the page makes and drops objects: what is delivered goes to a living
// object, and in the order in which each thread called. TELIX_EVENTS in the environment is the number of
// events of each test; see docs/reliability.md.
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include <glib.h>
#include <gtest/gtest.h>

#include "src/videobroadcast/VideoBroadcastUtils.h"
#include "tests/unit/videobroadcast/BroadcastTest.h"

namespace {

constexpr int kThreads = 8;
constexpr int kDefaultEvents = 1000;
constexpr unsigned int kFirstHandle = 7;

// An event's number as it travels in the places that the events have for a number.
constexpr int kNumbersOfAThread = 1 << 18;

int eventsOfAThread() {
    const char* const events = std::getenv("TELIX_EVENTS");
    return (events ? std::atoi(events) : kDefaultEvents) / kThreads;
}

class EventThreadsTest : public BroadcastTest {
protected:
    EventThreadsTest() {
        platform.TELIX_JS_CM_GetChannelList = [](uint32_t*, TELIX_JS_CM_HANDLE**) { return 1; };
    }

    // Takes the number of an event that was delivered to the object with this handle. The page's side of each
    // event goes through here, on the browser thread.
    void arrived(unsigned int handle, int number) {
        EXPECT_TRUE(living.count(handle)) << "delivered to object " << handle << ", which is gone";
        const int thread = number / kNumbersOfAThread;
        const int event = number % kNumbersOfAThread;
        EXPECT_GT(event, last[thread]) << "of thread " << thread;
        last[thread] = event;
        ++deliveries;
    }

    // An element whose events end in arrived(), whatever their kind.
    EmbeddedObject embedListening() {
        const unsigned int handle = nextHandle;
        const EmbeddedObject vb = embed("tv" + std::to_string(handle));
        living.insert(handle);
        const ScriptFunction error = browser.function("channelChangeError");
        error.does([this, handle](const Values& arguments) {
            arrived(handle, arguments.at(1).integer());
            return Value();
        });
        vb.set("onChannelChangeError", error);
        const ScriptFunction state = browser.function("playStateChange");
        state.does([this, handle](const Values& arguments) {
            arrived(handle, arguments.at(0).integer());
            return Value();
        });
        vb.set("onPlayStateChange", state);
        const ScriptFunction change = browser.function("channelChangeSucceeded");
        change.does([this, handle](const Values& arguments) {
            arrived(handle, std::stoi(arguments.at(0).object().get("ccid").value.string()));
            return Value();
        });
        vb.set("onChannelChangeSucceeded", change);
        return vb;
    }

    // One platform thread: every kind of event that carries a number, to handles that may be anybody's.
    void call(const Callbacks& callbacks, int thread, unsigned int handles) {
        while (!started) {
            std::this_thread::yield();
        }
        for (int event = 1; event <= eventCount; ++event) {
            const int number = thread * kNumbersOfAThread + event;
            const unsigned int handle = kFirstHandle + static_cast<unsigned int>(event) % handles;
            char text[16];
            std::snprintf(text, sizeof text, "%d", number);
            auto* const bytes = reinterpret_cast<___UINT8*>(text);
            switch (event % 4) {
            case 0:
                callbacks.channelChangeError(handle, 0, number);
                break;
            case 1:
                callbacks.playStateChange(handle, 0, number, 200);
                break;
            case 2:
                streamEventHandler(handle, nullptr, nullptr, bytes, nullptr, 0, bytes);
                break;
            default:
                callbacks.channelChangeSucceeded(handle, static_cast<unsigned int>(number));
                break;
            }
        }
        ++finished;
    }

    void startThreads(unsigned int handles) {
        for (int thread = 0; thread < kThreads; ++thread) {
            // With a copy of the callbacks: the platform is given them again whenever a first object comes.
            threads.emplace_back([this, given = callbacks, thread, handles] {
                callbackHeap.during([&] { call(given, thread, handles); });
            });
        }
        started = true;
    }

    void joinThreads() {
        for (std::thread& thread : threads) {
            thread.join();
        }
        browser.pump();
    }

    const int eventCount = eventsOfAThread();
    std::set<unsigned int> living; // handles of the objects that the page has
    std::map<int, int> last;       // the last event of each thread that arrived
    int deliveries = 0;
    std::vector<std::thread> threads;
    std::atomic<bool> started{false};
    std::atomic<int> finished{0};
};

TEST_F(EventThreadsTest, EventsOfSeveralThreadsAllArriveInTheOrderOfTheirThread) {
    anythingMayBeLeft(); // the references of each delivery
    const EmbeddedObject vb = embedListening();
    browser.onEvent("StreamEvent", [this](const DomEvent& event) {
        arrived(kFirstHandle, std::stoi(event.fields.at("name")));
    });
    startThreads(1);
    browser.pumpUntil([this] { return finished == kThreads; }, std::chrono::minutes(10));
    joinThreads();
    EXPECT_EQ(deliveries, kThreads * eventCount);
}

TEST_F(EventThreadsTest, WhileThePageMakesAndDropsObjectsNothingReachesADeadOne) {
    anythingMayBeLeft();
    anyBlocksMayBeLeft(); // of each event whose object went first
    constexpr unsigned int objects = 6;
    std::vector<std::unique_ptr<EmbeddedObject>> page(objects);
    browser.onEvent("StreamEvent", [this](const DomEvent& event) {
        arrived(static_cast<unsigned int>(std::stoi(event.elementId.substr(2))),
                std::stoi(event.fields.at("name")));
    });
    // One that stays, so that the callbacks stay registered.
    const auto make = [&](unsigned int place) {
        nextHandle = kFirstHandle + place;
        page[place] = std::make_unique<EmbeddedObject>(embedListening());
    };
    make(0);
    startThreads(objects);
    unsigned int turn = 0;
    while (finished != kThreads) {
        const unsigned int place = 1 + turn++ % (objects - 1);
        if (page[place]) {
            living.erase(kFirstHandle + place);
            page[place]->destroy();
            page[place].reset();
        } else {
            make(place);
        }
        if (turn % 7 == 0) {
            browser.pump();
        } else {
            g_main_context_iteration(nullptr, FALSE);
        }
    }
    joinThreads();
    EXPECT_GT(deliveries, 0);
    // The object that stays gets every event of its own.
    EXPECT_GE(deliveries, kThreads * (eventCount / static_cast<int>(objects)));
}

TEST_F(EventThreadsTest, ThreadsMayCallWhileTheLastObjectGoesAndTheFirstComes) {
    anythingMayBeLeft();
    anyBlocksMayBeLeft();
    embedListening().destroy(); // so that the platform has the callbacks
    living.clear();
    startThreads(1);
    while (finished != kThreads) {
        nextHandle = kFirstHandle;
        const EmbeddedObject vb = embedListening();
        browser.pump();
        living.erase(kFirstHandle);
        vb.destroy();
        browser.pump();
    }
    joinThreads();
    EXPECT_LE(deliveries, kThreads * eventCount);
}

} // namespace
