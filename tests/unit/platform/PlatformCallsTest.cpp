// The forwarders over a complete platform library, and the recording platform that stands in for it.
#include "src/platform/PlatformLoader.h"
#include "tests/support/BorderTest.h"
#include "tests/support/platform/CallSamples.h"

#include <glib.h>

#include <set>
#include <thread>

namespace {

class PlatformCalls : public BorderTest {};
class RecordingPlatformLibrary : public BorderTest {};

template <class Function>
struct Forwarding;
template <class... Arguments>
struct Forwarding<TELIX_RETCODE_ENUM_T(Arguments...)> {
    static void expectUnchanged(TELIX_RETCODE_ENUM_T (*forwarder)(Arguments...),
                                ScriptedCall<TELIX_RETCODE_ENUM_T(Arguments...)>& call,
                                TELIX_RETCODE_ENUM_T result) {
        ArgumentSource source;
        const std::tuple<Arguments...> given = CallSignature<decltype(forwarder)>::sample(source);
        std::tuple<Arguments...> received;
        call = [&](Arguments... arguments) {
            received = std::tuple<Arguments...>(arguments...);
            return result;
        };
        EXPECT_EQ(std::apply(forwarder, given), result);
        EXPECT_EQ(received, given);
        EXPECT_EQ(call.count(), 1U);
        EXPECT_TRUE(source.isUntouched());
        call = nullptr; // it refers to what ends here
    }
};

} // namespace

TEST_F(PlatformCalls, EveryForwarderPassesArgumentsAndResultUnchanged) {
    TELIX_RETCODE_ENUM_T result = -50;
#define TELIX_CALL(name, parameters, arguments)                                                              \
    {                                                                                                        \
        SCOPED_TRACE(#name);                                                                                 \
        Forwarding<decltype(name)>::expectUnchanged(name, platform.name, ++result);                          \
    }
#define TELIX_CALL_UNBOUND(name, parameters, arguments)
#include "telix/telix_platform_calls.h"
}

TEST_F(PlatformCalls, TheCurrentProgrammeHandleIsNeverBoundEvenInACompleteLibrary) {
    platform.TELIX_JS_SI_GetCurrentProgrammeHandle = [](uint32_t) { return 0; };
    EXPECT_EQ(TELIX_JS_SI_GetCurrentProgrammeHandle(1), 5);
    EXPECT_EQ(platform.TELIX_JS_SI_GetCurrentProgrammeHandle.count(), 0U);
}

TEST_F(PlatformCalls, ACallAfterTheEndOfThePluginStillReachesTheLibrary) {
    EXPECT_EQ(TELIX_JS_AV_Stop(1), 0);
    EXPECT_EQ(browser.shutdown(), NPERR_NO_ERROR);
    platform.TELIX_JS_AV_Stop = [](TELIX_JS_AV_HANDLE player) { return player == 2 ? 9 : 0; };
    EXPECT_EQ(TELIX_JS_AV_Stop(2), 9);
}

TEST_F(PlatformCalls, NoneOfTheNamesStandsTwiceInTheList) {
    const std::vector<std::string> names = callNames();
    EXPECT_EQ(names.size(), 121U);
    EXPECT_EQ(boundCallNames().size(), 120U);
    EXPECT_EQ(std::set<std::string>(names.begin(), names.end()).size(), names.size());
}

TEST_F(PlatformCalls, AnUnknownSymbolIsNotBound) {
    ASSERT_EQ(should_load_telix_library(), 1);
    void* slot = nullptr;
    EXPECT_EQ(resolve_symbol(g_platformModule, "TELIX_JS_AV_Play", &slot), 1);
    EXPECT_NE(slot, nullptr);
    void* unknown = nullptr;
    g_log_set_default_handler([](const char*, GLogLevelFlags, const char*, void*) {}, nullptr);
    EXPECT_EQ(resolve_symbol(g_platformModule, "TELIX_JS_AV_Rewind", &unknown), 0);
    g_log_set_default_handler(g_log_default_handler, nullptr);
    EXPECT_EQ(unknown, nullptr);
}

TEST_F(PlatformCalls, ATimerRunsUntilItsFunctionSaysStop) {
    int runs = 0;
    const unsigned int id = createAndSetTimer(
        1, [](void* data) { return ++*static_cast<int*>(data) < 3 ? 1 : 0; }, &runs);
    while (g_main_context_find_source_by_id(nullptr, id) != nullptr) {
        g_main_context_iteration(nullptr, TRUE);
    }
    EXPECT_EQ(runs, 3);
}

TEST_F(RecordingPlatformLibrary, TellsEachCallAsText) {
    const TELIX_JS_DISPLAY_AREA area{1, 2, 640, 65535};
    const ___UINT8 descriptor[] = {0x0A, 0xFF, 0x00};
    TELIX_JS_CM_HANDLE channel = 0;
    char* text = nullptr;
    TELIX_JS_AV_SetPlaySpeed(7, 1, -2, 5);
    TELIX_JS_AV_Queue(7, nullptr, 1, 6, 1280, 0, 0, 0);
    TELIX_JS_CAP_HasCapability("OITF \"HD\"", nullptr);
    TELIX_JS_CM_GetName(0xFFFFFFFF, &text);
    TELIX_JS_VB_SetDisplayArea(3, &area);
    TELIX_JS_VB_SetWidth(3, -1);
    TELIX_JS_VB_CreateChannelObjectByDsd(3, 13, descriptor, 3, 28106, &channel);
    TELIX_JS_VB_RegisterOnFullScreenChange([](TELIX_JS_VB_HANDLE) { return 0; });
    TELIX_JS_VB_RegisterOnFullScreenChange(nullptr);
    EXPECT_EQ(log.startingWith("TELIX_JS_"),
              (std::vector<std::string>{
                  "TELIX_JS_AV_SetPlaySpeed(7, 1, -2, 5)",
                  "TELIX_JS_AV_Queue(7, null, 1, 6, 1280, 0, 0, 0)",
                  "TELIX_JS_CAP_HasCapability(\"OITF \"HD\"\", null)",
                  "TELIX_JS_CM_GetName(4294967295, out)",
                  "TELIX_JS_VB_SetDisplayArea(3, {1,2,640,65535})",
                  "TELIX_JS_VB_SetWidth(3, -1)",
                  "TELIX_JS_VB_CreateChannelObjectByDsd(3, 13, <0aff00>, 3, 28106, out)",
                  "TELIX_JS_VB_RegisterOnFullScreenChange(callback)",
                  "TELIX_JS_VB_RegisterOnFullScreenChange(null)",
              }));
}

TEST_F(RecordingPlatformLibrary, GivesTheDefaultResultWhereATestSaysNothing) {
    uint32_t amount = 11;
    EXPECT_EQ(TELIX_JS_APP_GetFreeMem(&amount), 0);
    platform.defaultResult = 1;
    EXPECT_EQ(TELIX_JS_APP_GetFreeMem(&amount), 1);
    EXPECT_EQ(amount, 11U);
    EXPECT_EQ(platform.TELIX_JS_APP_GetFreeMem.count(), 2U);
    EXPECT_EQ(platform.TELIX_JS_APP_GetCurrentChannel.count(), 0U);
}

TEST_F(RecordingPlatformLibrary, ForgetsEverythingAtAReset) {
    platform.TELIX_JS_AV_Stop = [](TELIX_JS_AV_HANDLE) { return 3; };
    platform.defaultResult = 2;
    EXPECT_EQ(TELIX_JS_AV_Stop(1), 3);
    platform.reset();
    EXPECT_EQ(platform.TELIX_JS_AV_Stop.count(), 0U);
    log.clear();
    EXPECT_EQ(TELIX_JS_AV_Stop(1), 0);
    EXPECT_EQ(log.count("TELIX_JS_"), 0U);
}

TEST_F(RecordingPlatformLibrary, TakesCallsOfSeveralThreadsAtOnceWhileATestChangesItsMind) {
    constexpr int calls = 500;
    auto caller = [] {
        for (int call = 0; call < calls; ++call) {
            TELIX_JS_AV_Pause(1);
        }
    };
    TELIX_JS_AV_Stop(1); // the library is loaded on the browser's thread
    onPlatformThreads({caller, caller, caller, [this] {
                           for (int change = 0; change < calls; ++change) {
                               platform.TELIX_JS_AV_Pause = [change](TELIX_JS_AV_HANDLE) { return change; };
                           }
                       }});
    EXPECT_EQ(platform.TELIX_JS_AV_Pause.count(), 3U * calls);
    EXPECT_EQ(log.count("TELIX_JS_AV_Pause(1)"), 3U * calls);
}

TEST_F(RecordingPlatformLibrary, HasOneThreadThatIsNotTheBrowsers) {
    std::thread::id first;
    std::thread::id second;
    onPlatformThread([&] { first = std::this_thread::get_id(); });
    onPlatformThread([&] { second = std::this_thread::get_id(); });
    EXPECT_EQ(first, second);
    EXPECT_NE(first, std::this_thread::get_id());
}
