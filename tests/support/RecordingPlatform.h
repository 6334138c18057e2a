// A stand-in for the television's platform library: a real libtelix.so that writes down each call and does
// what a test asks it to. The library and the tests share this header; the library is built by
// telix_add_recording_platform (tests/support/platform).
#ifndef TELIX_TESTS_SUPPORT_RECORDINGPLATFORM_H
#define TELIX_TESTS_SUPPORT_RECORDINGPLATFORM_H

#include "telix/telix_platform.h"

#include <atomic>
#include <cstddef>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

// A function that a test may give and take back while other threads call it.
template <class Signature>
class ScriptedFunction;
template <class Result, class... Arguments>
class ScriptedFunction<Result(Arguments...)> {
public:
    using Function = std::function<Result(Arguments...)>;

    ScriptedFunction() = default;
    ScriptedFunction(const ScriptedFunction&) = delete;
    ScriptedFunction& operator=(const ScriptedFunction&) = delete;

    // nullptr takes the function back.
    ScriptedFunction& operator=(Function function) {
        auto fresh = std::make_shared<const Function>(std::move(function));
        std::lock_guard<std::mutex> lock(m_mutex);
        m_function.swap(fresh);
        return *this;
    }

    // What is in force now; it stays callable after the test has set another. Never null, possibly empty.
    std::shared_ptr<const Function> current() const {
        std::lock_guard<std::mutex> lock(m_mutex);
        return m_function;
    }

private:
    mutable std::mutex m_mutex;
    std::shared_ptr<const Function> m_function = std::make_shared<const Function>();
};

// One call of the platform: `platform.TELIX_JS_AV_Stop = [](TELIX_JS_AV_HANDLE) { return 1; };`
template <class Signature>
class ScriptedCall : public ScriptedFunction<Signature> {
public:
    using ScriptedFunction<Signature>::operator=;

    // How often the plug-in has called it since the last reset.
    std::size_t count() const { return m_count; }

private:
    friend struct RecordingPlatform;
    std::atomic<std::size_t> m_count{0};
};

struct RecordingPlatform {
    // One member a call, with its name and signature. A call that is not set gives defaultResult and leaves
    // its outputs alone. Texts and arrays that a test gives out follow the rules of telix/telix_platform.h.
#define TELIX_CALL(name, parameters, arguments) ScriptedCall<TELIX_RETCODE_ENUM_T parameters> name;
#include "telix/telix_platform_calls.h"

    std::atomic<TELIX_RETCODE_ENUM_T> defaultResult{TELIX_RETCODE_SUCCESS};

    // Gets each call as text before it is carried out, one at a time and in order: "TELIX_JS_AV_Seek(7,
    // 1500)". Texts stand in double quotes, bytes as <0aff>, display areas as {x,y,w,h}, callbacks as
    // `callback`, outputs as `out` and null pointers as `null`. It must not call the platform.
    ScriptedFunction<void(const std::string&)> onCall;

    // Back to the beginning: nothing set, nothing counted.
    void reset() {
        onCall = nullptr;
        defaultResult = TELIX_RETCODE_SUCCESS;
#define TELIX_CALL(name, parameters, arguments)                                                              \
    name = nullptr;                                                                                          \
    name.m_count = 0;
#include "telix/telix_platform_calls.h"
    }

    // For the library: takes a call down.
    template <class Signature>
    void record(ScriptedCall<Signature>& call, const std::string& text) {
        std::lock_guard<std::mutex> lock(m_order);
        ++call.m_count;
        if (auto listener = onCall.current(); *listener) {
            (*listener)(text);
        }
    }

private:
    std::mutex m_order; // keeps calls from several threads apart
};

// Exported by the library; lives as long as the process. A scenario that is compiled into the library begins
// here.
extern "C" TELIX_JS_API RecordingPlatform* telix_recording_platform();

// The stand-in of the unit tests, which is the very library that a plug-in built for its folder finds.
RecordingPlatform& recordingPlatform();

// The same for a stand-in at another place.
RecordingPlatform& recordingPlatformAt(const std::string& libraryFile);

// Runs `function` on a thread that is not the browser's, always the same one, and waits for its end.
void onPlatformThread(const std::function<void()>& function);

// Runs the functions at once, each on a thread of its own, and waits for all.
void onPlatformThreads(const std::vector<std::function<void()>>& functions);

#endif
