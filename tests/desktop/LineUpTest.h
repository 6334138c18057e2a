// A platform with a channel list of its own. A process reads list and configuration once, so each of the
// tests needs a process of its own.
#ifndef TELIX_TESTS_DESKTOP_LINEUPTEST_H
#define TELIX_TESTS_DESKTOP_LINEUPTEST_H

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <utility>
#include <vector>

#include "telix/telix_platform.h"
#include "tests/desktop/Received.h"

class LineUpTest : public testing::Test {
protected:
    void start(const std::string& lineUp, uint32_t expected) {
        setenv("TELIX_CHANNELS", lineUp.c_str(), 1);
        ASSERT_EQ(TELIX_JS_VB_GetHandle(&m_object), 0);
        TELIX_JS_VB_RegisterOnChannelChangeSucceeded(onChange);
        TELIX_JS_VB_RegisterOnChannelChangeError(onError);
        uint32_t count = 0;
        TELIX_JS_CM_HANDLE* handles = nullptr;
        ASSERT_EQ(TELIX_JS_CM_GetChannelList(&count, &handles), 0);
        ASSERT_EQ(count, expected);
        m_channels.assign(handles, handles + count);
    }

    void TearDown() override {
        TELIX_JS_VB_Release(m_object);
        TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded(onChange);
        TELIX_JS_VB_UnRegisterOnChannelChangeError(onError);
    }

    // Tunes and returns the outcome.
    TELIX_ERR_STATE_ENUM_T tune(TELIX_JS_CM_HANDLE channel) {
        const size_t before = outcomes.all().size();
        EXPECT_EQ(TELIX_JS_VB_SetChannel(m_object, channel, 0), 0);
        if (!waitUntil([&] { return outcomes.all().size() > before; })) {
            ADD_FAILURE() << "no outcome";
            return -1;
        }
        EXPECT_EQ(outcomes.all()[before].first, channel);
        return outcomes.all()[before].second;
    }

    // The outcome of each tune: the channel and the error.
    static inline Received<std::pair<TELIX_JS_CM_HANDLE, TELIX_ERR_STATE_ENUM_T>> outcomes;

    TELIX_JS_VB_HANDLE m_object = 0;
    std::vector<TELIX_JS_CM_HANDLE> m_channels;

private:
    static TELIX_RETCODE_ENUM_T onChange(TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE channel) {
        return outcomes.add({channel, TELIX_ERR_STATE_NONE});
    }
    static TELIX_RETCODE_ENUM_T onError(TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE channel,
                                        TELIX_ERR_STATE_ENUM_T error) {
        return outcomes.add({channel, error});
    }
};

#endif
