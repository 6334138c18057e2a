// The time of a broadcast event from the platform's callback to the page's handler, compared with a bare
// g_idle_add of a record of the same size, alone and with the browser calls of one event; one event after the
// other on one thread, and a burst of 100,000 from another thread, with the heap usage before and after.
#include <benchmark/benchmark.h>
#include <glib.h>
#include <malloc.h>

#include <cstdlib>
#include <string>
#include <thread>

#include "bench/BenchMain.h"
#include "common/PluginExports.h"
#include "common/PluginUtils.h"
#include "src/videobroadcast/VideoBroadcast.h"
#include "src/videobroadcast/VideoBroadcastUtils.h"

namespace {

constexpr int kBurst = 100000;
constexpr unsigned int kHandle = 7;
const std::string kId = "tv";

int delivered = 0;

// ---- The baseline: a g_idle_add with the same memory, without any processing

struct BareRecord {
    unsigned int type;
    void* receiver;
    uint64_t generation; // of the receiver
    void* payload;
};

struct BarePayload {
    unsigned int value;
    int state;
    int error;
};

void deleteRecord(BareRecord* record) {
    delete static_cast<BarePayload*>(record->payload);
    delete record;
    ++delivered;
}

gboolean bareHandler(gpointer data) {
    deleteRecord(static_cast<BareRecord*>(data));
    return G_SOURCE_REMOVE;
}

// The same with the browser calls of one event: a script evaluation and a function call.
gboolean callingHandler(gpointer data) {
    auto* record = static_cast<BareRecord*>(data);
    const auto* payload = static_cast<const BarePayload*>(record->payload);
    NPNetscapeFuncs& browser = benchBrowserTable();
    static NPObject object{nullptr, 1};
    static const std::string script = domEventScript(kId, "PlayStateChange", false, false);
    NPString text{script.data(), static_cast<uint32_t>(script.size())};
    NPVariant result{};
    browser.evaluate(nullptr, nullptr, &text, &result);
    browser.releasevariantvalue(&result);
    browser.retainobject(&object);
    NPVariant args[2]{};
    args[0].type = NPVariantType_Int32;
    args[0].value.intValue = payload->state;
    browser.invokeDefault(nullptr, &object, args, 2, &result);
    browser.releasevariantvalue(&result);
    deleteRecord(record);
    return G_SOURCE_REMOVE;
}

template <GSourceFunc Handler>
void fireBare() {
    g_idle_add(Handler, new BareRecord{1, &delivered, 1, new BarePayload{0, 2, 200}});
}

// ---- Ours

void fireOurs() {
    onPlayStateChangeCb(kHandle, 0, TELIX_PLAYSTATE_PRESENTING, TELIX_ERR_STATE_NONE);
}

// A video/broadcast object with an id and a handler.
class Page {
public:
    Page() : m_object(VideoBroadcast::getInstance(&m_npp, 400)) {
        char name[] = "id";
        std::string id = kId;
        char* names[] = {name};
        char* values[] = {id.data()};
        m_object->init(NP_EMBED, 1, names, values);
        m_object->setHandle(kHandle);
        m_object->setOnPlayStateChange(&m_handler);
        benchBrowserTable().invokeDefault = [](NPP, NPObject*, const NPVariant*, uint32_t,
                                               NPVariant* result) {
            ++delivered;
            result->type = NPVariantType_Void;
            return true;
        };
    }
    Page(const Page&) = delete;
    Page& operator=(const Page&) = delete;
    ~Page() {
        m_object->setOnPlayStateChange(nullptr);
        delete m_object;
    }

private:
    NPP_t m_npp{};
    NPObject m_handler{nullptr, 1};
    VideoBroadcast* m_object;
};

// ---- The measurements

using Fire = void (*)();

void oneByOne(benchmark::State& state, Fire fire) {
    delivered = 0;
    while (state.KeepRunning()) {
        fire();
        g_main_context_iteration(nullptr, FALSE);
    }
    // An iteration that runs a timer may leave events in the queue.
    while (g_main_context_iteration(nullptr, FALSE) == TRUE) {
    }
    if (delivered < state.iterations()) {
        state.SkipWithError("events were lost");
    }
}

void inABurst(benchmark::State& state, Fire fire) {
    size_t before = 0;
    size_t queued = 0;
    size_t after = 0;
    while (state.KeepRunning()) {
        before = mallinfo2().uordblks;
        delivered = 0;
        std::thread platform([fire] {
            for (int i = 0; i < kBurst; ++i) {
                fire();
            }
        });
        platform.join();
        queued = mallinfo2().uordblks;
        while (g_main_context_iteration(nullptr, FALSE) == TRUE) {
        }
        after = mallinfo2().uordblks;
        if (delivered < kBurst) {
            state.SkipWithError("events were lost");
            break;
        }
    }
    state.SetItemsProcessed(state.iterations() * kBurst);
    state.counters["queued_bytes"] = static_cast<double>(queued - before);
    state.counters["left_bytes"] = static_cast<double>(after) - static_cast<double>(before);
}

void registerAll(const std::string& mode, const char* level) {
    const auto add = [&](const char* name, bool burst, Fire fire, bool needsPage) {
        auto* made = benchmark::RegisterBenchmark(
            (std::string(burst ? "burst" : "event") + "/" + name + "/" + mode).c_str(),
            [=](benchmark::State& state) {
                level ? setenv("LOG_MODULE", level, 1) : unsetenv("LOG_MODULE");
                if (needsPage) {
                    const Page page;
                    burst ? inABurst(state, fire) : oneByOne(state, fire);
                } else {
                    burst ? inABurst(state, fire) : oneByOne(state, fire);
                }
            });
        if (burst) {
            made->UseRealTime()->Unit(benchmark::kMillisecond);
        }
    };
    for (const bool burst : {false, true}) {
        add("bare hop", burst, fireBare<bareHandler>, false);
        add("bare hop and the browser's calls", burst, fireBare<callingHandler>, false);
        add("ours", burst, fireOurs, true);
    }
}

} // namespace

int main(int argc, char** argv) {
    return runWithAndWithoutLog(argc, argv, registerAll);
}
