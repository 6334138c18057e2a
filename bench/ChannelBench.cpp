// Large channel lists: building one, getting an entry, finding one by its id (a binary search; with the log
// on, and as the baseline, a linear one that compares strings), and reading cached and uncached properties of
// a channel. Each is compared with the bare work that it cannot avoid.
#include <benchmark/benchmark.h>
#include <strings.h>

#include <cstdlib>
#include <functional>
#include <string>
#include <vector>

#include "bench/BenchMain.h"
#include "common/PluginExports.h"
#include "common/ScriptReferences.h"
#include "src/channel/JSChannel.h"
#include "src/channel/JSChannelList.h"
#include "telix/telix_platform.h"

namespace {

constexpr int64_t kChannels = 10000;

NPP instance() {
    static NPP_t npp{};
    return &npp;
}

std::vector<uint32_t> handlesOf(int64_t count) {
    std::vector<uint32_t> handles;
    for (int64_t i = 0; i < count; ++i) {
        handles.push_back(static_cast<uint32_t>(100000 + i));
    }
    return handles;
}

NPObject* buildList(const std::vector<uint32_t>& handles) {
    NPObject* list = createScriptObject<JSChannelList>(instance());
    wrapperOf<JSChannelList>(list)->impl()->initialize(handles.data(), static_cast<unsigned>(handles.size()));
    return list;
}

// Releases the list, and the channels, which a list does not release.
void destroyList(NPObject* list) {
    ChannelList& model = *wrapperOf<JSChannelList>(list)->impl();
    std::vector<NPObject*> channels;
    for (uint32_t i = 0; i < model.getLength(); ++i) {
        channels.push_back(model.getitem(i));
    }
    NPN_ReleaseObject(list);
    for (NPObject* channel : channels) {
        NPN_ReleaseObject(channel); // of getitem
        NPN_ReleaseObject(channel); // of the creation
    }
}

NPObject* largeList() {
    static NPObject* list = buildList(handlesOf(kChannels));
    return list;
}

NPObject* channel() {
    static NPObject* object = [] {
        NPObject* made = createScriptObject<JSChannel>(instance());
        wrapperOf<JSChannel>(made)->impl()->setChannelHandle(7);
        return made;
    }();
    return object;
}

void buildOurs(benchmark::State& state) {
    const std::vector<uint32_t> handles = handlesOf(state.range(0));
    for (auto _ : state) {
        NPObject* list = buildList(handles);
        state.PauseTiming();
        destroyList(list);
        state.ResumeTiming();
    }
    state.SetComplexityN(state.range(0));
}

// The same objects with the same references in a plain vector.
void buildBare(benchmark::State& state) {
    for (auto _ : state) {
        std::vector<NPObject*> channels;
        for (int64_t i = 0; i < state.range(0); ++i) {
            channels.push_back(handOut(createScriptObject<JSChannel>(instance())));
        }
        state.PauseTiming();
        for (NPObject* made : channels) {
            NPN_ReleaseObject(made);
            NPN_ReleaseObject(made);
        }
        state.ResumeTiming();
    }
    state.SetComplexityN(state.range(0));
}

void invokeList(benchmark::State& state, const char* method, const NPVariant& argument) {
    const NPIdentifier name = benchBrowserTable().getstringidentifier(method);
    NPObject* list = largeList();
    for (auto _ : state) {
        NPVariant result{};
        if (!list->_class->invoke(list, name, &argument, 1, &result) || result.type != NPVariantType_Object) {
            state.SkipWithError("no channel");
            return;
        }
        NPN_ReleaseObject(result.value.objectValue);
    }
}

void itemOurs(benchmark::State& state, int64_t index) {
    NPVariant argument{};
    argument.type = NPVariantType_Int32;
    argument.value.intValue = static_cast<int32_t>(index);
    invokeList(state, "item", argument);
}

// The reference that is passed to the page and released again.
void itemBare(benchmark::State& state) {
    for (auto _ : state) {
        NPN_ReleaseObject(NPN_RetainObject(channel()));
    }
}

void getChannelOurs(benchmark::State& state, int64_t index) {
    const std::string ccid = std::to_string(100000 + index);
    NPVariant argument{};
    argument.type = NPVariantType_String;
    argument.value.stringValue = {ccid.data(), static_cast<uint32_t>(ccid.size())};
    invokeList(state, "getChannel", argument);
}

// The search alone, over ids that are strings already.
void getChannelBare(benchmark::State& state, int64_t index) {
    std::vector<std::string> ccids;
    for (const uint32_t handle : handlesOf(kChannels)) {
        ccids.push_back(std::to_string(handle));
    }
    const std::string wanted = ccids[static_cast<size_t>(index)];
    for (auto _ : state) {
        size_t at = 0;
        while (strcasecmp(ccids[at].c_str(), wanted.c_str()) != 0) {
            ++at;
        }
        benchmark::DoNotOptimize(at);
    }
}

void readOurs(benchmark::State& state, const char* property) {
    const NPIdentifier name = benchBrowserTable().getstringidentifier(property);
    NPObject* object = channel();
    for (auto _ : state) {
        NPVariant result;
        benchmark::DoNotOptimize(object->_class->getProperty(object, name, &result));
        NPN_ReleaseVariantValue(&result);
    }
}

// A string of the name's length in the browser's memory.
void readTextBare(benchmark::State& state) {
    const std::string name = wrapperOf<JSChannel>(channel())->impl()->getName();
    for (auto _ : state) {
        NPVariant result;
        setResult(result, name);
        benchmark::DoNotOptimize(result);
        NPN_ReleaseVariantValue(&result);
    }
}

void getTypeBare(benchmark::State& state) {
    int32_t type = 0;
    for (auto _ : state) {
        benchmark::DoNotOptimize(TELIX_JS_CM_GetChannelType(7, &type));
    }
}

void getTextBare(benchmark::State& state) {
    for (auto _ : state) {
        char* text = nullptr;
        benchmark::DoNotOptimize(TELIX_JS_CM_GetDsd(7, &text));
        std::free(text);
    }
}

// `level` is the value of LOG_MODULE, null for none.
void registerAll(const std::string& log, const char* level) {
    const auto add = [&](const std::string& name, const std::function<void(benchmark::State&)>& function) {
        return benchmark::RegisterBenchmark((name + "/" + log).c_str(), [=](benchmark::State& state) {
            level ? setenv("LOG_MODULE", level, 1) : unsetenv("LOG_MODULE");
            function(state);
        });
    };
    for (const auto& [name, build] :
         {std::pair{"build/bare", buildBare}, std::pair{"build/ours", buildOurs}}) {
        add(name, build)
            ->RangeMultiplier(10)
            ->Range(kChannels / 100, kChannels * 10)
            ->Complexity(benchmark::oN)
            ->Unit(benchmark::kMicrosecond);
    }
    add("item/bare", itemBare);
    add("item/ours/first", [](benchmark::State& state) { itemOurs(state, 0); });
    add("item/ours/last", [](benchmark::State& state) { itemOurs(state, kChannels - 1); });
    for (const auto& [place, index] : {std::pair{"first", int64_t{0}}, std::pair{"middle", kChannels / 2},
                                       std::pair{"last", kChannels - 1}}) {
        add(std::string("getChannel/bare/") + place,
            [index = index](benchmark::State& state) { getChannelBare(state, index); });
        add(std::string("getChannel/ours/") + place,
            [index = index](benchmark::State& state) { getChannelOurs(state, index); });
    }
    add("read/cached string/bare", readTextBare);
    add("read/cached string/ours", [](benchmark::State& state) { readOurs(state, "name"); });
    add("read/uncached number/bare", getTypeBare);
    add("read/uncached number/ours", [](benchmark::State& state) { readOurs(state, "channelType"); });
    add("read/uncached string/bare", getTextBare);
    add("read/uncached string/ours", [](benchmark::State& state) { readOurs(state, "dsd"); });
    add("read/constant/ours", [](benchmark::State& state) { readOurs(state, "TYPE_OTHER"); });
}

} // namespace

int main(int argc, char** argv) {
    return runWithAndWithoutLog(argc, argv, registerAll);
}
