// The adapter between the NPAPI engine and the plug-in: what the engine calls too early.
#include <dlfcn.h>

#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "desktop/window/npapi/adapter/PluginAdapter.h"
#include "npapi/npfunctions.h"
#include "tests/window/AdaptedPlugin.h"

namespace {

// Tasks that the adapter has given to the engine.
std::vector<std::pair<void (*)(void*), void*>> tasks;

void addTask(NPP, void (*function)(void*), void* data) {
    tasks.emplace_back(function, data);
}

void runTasks() {
    for (const auto& [function, data] : std::exchange(tasks, {})) {
        function(data);
    }
}

template <class Function>
Function find(const char* file, const char* name) {
    void* library = dlopen(file, RTLD_NOW | RTLD_LOCAL);
    EXPECT_NE(library, nullptr) << dlerror();
    return reinterpret_cast<Function>(dlsym(library, name));
}

// The engine's side of the adapter.
class PluginAdapterTest : public testing::Test {
protected:
    static void SetUpTestSuite() {
        const PluginAdapterSettings settings{TELIX_ADAPTED_PLUGIN, true, nullptr, nullptr};
        ASSERT_TRUE(find<AdaptPluginFunction>(TELIX_PLUGIN_ADAPTER, kAdaptPluginFunction)(settings));
    }

    void SetUp() override {
        initialize();
        ASSERT_EQ(calls(), "initialize");
    }

    void TearDown() override {
        shutdown();
        EXPECT_EQ(calls(), "shutdown");
        tasks.clear();
    }

    void initialize() {
        static NPNetscapeFuncs engine{};
        engine.size = sizeof(engine);
        engine.pluginthreadasynccall = addTask;
        m_plugin = {};
        m_plugin.size = sizeof(m_plugin);
        const auto function =
            find<NPError (*)(NPNetscapeFuncs*, NPPluginFuncs*)>(TELIX_PLUGIN_ADAPTER, "NP_Initialize");
        EXPECT_EQ(function(&engine, &m_plugin), NPERR_NO_ERROR);
    }

    void shutdown() { EXPECT_EQ(find<NPError (*)()>(TELIX_PLUGIN_ADAPTER, "NP_Shutdown")(), NPERR_NO_ERROR); }

    void create(NPP_t& instance) {
        char type[] = "video/broadcast";
        EXPECT_EQ(m_plugin.newp(type, &instance, NP_EMBED, 0, nullptr, nullptr, nullptr), NPERR_NO_ERROR);
    }

    void setWidth(NPP_t& instance, uint32_t width) {
        NPWindow window{};
        window.width = width;
        EXPECT_EQ(m_plugin.setwindow(&instance, &window), NPERR_NO_ERROR);
    }

    void destroy(NPP_t& instance) { EXPECT_EQ(m_plugin.destroy(&instance, nullptr), NPERR_NO_ERROR); }

    static std::string calls() {
        return find<AdaptedCallsFunction>(TELIX_ADAPTED_PLUGIN, kAdaptedCallsFunction)();
    }

private:
    NPPluginFuncs m_plugin{};
};

TEST_F(PluginAdapterTest, AWindowIsSetInATaskOfItsOwn) {
    NPP_t first{};
    NPP_t second{};
    create(first);
    create(second);
    setWidth(first, 100);
    setWidth(second, 200);
    EXPECT_EQ(calls(), "new new");
    runTasks();
    EXPECT_EQ(calls(), "window:100 window:200");
    destroy(first);
    destroy(second);
    EXPECT_EQ(calls(), "destroy destroy");
}

TEST_F(PluginAdapterTest, OfSeveralWindowsTheLastIsSet) {
    NPP_t instance{};
    create(instance);
    setWidth(instance, 100);
    setWidth(instance, 101);
    runTasks();
    EXPECT_EQ(calls(), "new window:101");
    setWidth(instance, 100);
    runTasks();
    EXPECT_EQ(calls(), "window:100");
    destroy(instance);
    EXPECT_EQ(calls(), "destroy");
}

TEST_F(PluginAdapterTest, AnInstanceThatHasEndedGetsNoWindow) {
    NPP_t instance{};
    create(instance);
    setWidth(instance, 100);
    destroy(instance);
    create(instance); // at the same address
    runTasks();
    EXPECT_EQ(calls(), "new destroy new");
    destroy(instance);
    EXPECT_EQ(calls(), "destroy");
}

TEST_F(PluginAdapterTest, ThePluginStaysAsLongAsItHasInstances) {
    NPP_t first{};
    NPP_t second{};
    create(first);
    shutdown();
    EXPECT_EQ(calls(), "new");
    initialize();
    create(second);
    destroy(first);
    destroy(second);
    EXPECT_EQ(calls(), "new destroy destroy");
}

} // namespace
