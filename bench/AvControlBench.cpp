// The time from a player callback of the platform to the state event and the listener of the page, compared
// with a bare g_idle_add of a record of the same size; and the time of a read of `playPosition`, compared
// with the platform call that it makes.
#include <benchmark/benchmark.h>
#include <glib.h>

#include "bench/BenchMain.h"
#include "common/JSPluginBase.h"
#include "common/PluginExports.h"
#include "src/avcontrol/AVControl.h"

namespace {

int delivered = 0;

// A playing element with an id and a listener.
class Page {
public:
    explicit Page(NPPluginFuncs& plugin) : m_plugin(plugin) {
        char type[] = "video/mp4";
        char names[][10] = {"id", "buffering", "url"};
        char values[][30] = {"video", "false", "mms://media.example/clip"};
        char* argn[] = {names[0], names[1], names[2]};
        char* argv[] = {values[0], values[1], values[2]};
        m_plugin.newp(type, &m_npp, NP_EMBED, 3, argn, argv, nullptr);
        m_control = static_cast<AVControl*>(m_npp.pdata);
        m_control->setOnPlayStateChange(&m_listener);
        m_control->play(1.0);
        m_script = m_control->getJSObject();
    }
    Page(const Page&) = delete;
    Page& operator=(const Page&) = delete;
    ~Page() {
        benchBrowserTable().releaseobject(m_script);
        m_plugin.destroy(&m_npp, nullptr);
    }

    NPObject* script() const { return m_script; }

private:
    NPPluginFuncs& m_plugin;
    NPP_t m_npp{};
    NPObject m_listener{nullptr, 1};
    AVControl* m_control = nullptr;
    NPObject* m_script = nullptr;
};

struct BareRecord {
    unsigned int player;
    unsigned int message;
};

void bareHop(benchmark::State& state) {
    const auto handler = [](gpointer data) -> gboolean {
        delete static_cast<BareRecord*>(data);
        ++delivered;
        return G_SOURCE_REMOVE;
    };
    for (auto _ : state) {
        g_idle_add(handler, new BareRecord{1, 2});
        g_main_context_iteration(nullptr, FALSE);
    }
}

// Start and end messages in turn: each causes one state event and one call of the listener.
void stateEvent(benchmark::State& state, NPPluginFuncs& plugin) {
    const Page page(plugin);
    delivered = 0;
    bool playing = false;
    for (auto _ : state) {
        playing = !playing;
        AVControl::onPlayStateChangeCb(1, playing ? TELIX_AV_CB_MSG_PLAYSTART : TELIX_AV_CB_MSG_PLAYEND);
        g_main_context_iteration(nullptr, FALSE);
    }
    if (delivered < state.iterations()) {
        state.SkipWithError("events were lost");
    }
}

void platformCall(benchmark::State& state) {
    for (auto _ : state) {
        TELIX_JS_AV_PLAY_INFO* info = nullptr;
        benchmark::DoNotOptimize(TELIX_JS_AV_GetPlayInfo(1, &info));
        benchmark::DoNotOptimize(info);
    }
}

void readPlayPosition(benchmark::State& state, NPPluginFuncs& plugin) {
    const Page page(plugin);
    NPObject* script = page.script();
    const NPIdentifier name = benchBrowserTable().getstringidentifier("playPosition");
    AVControl::onPlayStateChangeCb(1, TELIX_AV_CB_MSG_PLAYSTART);
    g_main_context_iteration(nullptr, FALSE);
    NPVariant position{};
    for (auto _ : state) {
        script->_class->getProperty(script, name, &position);
        benchmark::DoNotOptimize(position);
    }
    if (position.type != NPVariantType_Double || position.value.doubleValue == 0) {
        state.SkipWithError("no position was read");
    }
}

// The additional browser functions that an A/V control object needs.
void completeTable(NPNetscapeFuncs& table) {
    table.pluginthreadasynccall = [](NPP, void (*function)(void*), void* data) { function(data); };
    table.getproperty = [](NPP, NPObject*, NPIdentifier, NPVariant*) { return false; };
    table.invokeDefault = [](NPP, NPObject*, const NPVariant*, uint32_t, NPVariant* result) {
        ++delivered;
        result->type = NPVariantType_Void;
        return true;
    };
}

} // namespace

int main(int argc, char** argv) {
    completeTable(benchBrowserTable());
    return runBenchmarks(argc, argv, [](NPPluginFuncs& plugin) {
        benchmark::RegisterBenchmark("message/bare hop", bareHop);
        benchmark::RegisterBenchmark("message/state event",
                                     [&](benchmark::State& s) { stateEvent(s, plugin); });
        benchmark::RegisterBenchmark("playPosition/platform call", platformCall);
        benchmark::RegisterBenchmark("playPosition/read",
                                     [&](benchmark::State& s) { readPlayPosition(s, plugin); });
    });
}
