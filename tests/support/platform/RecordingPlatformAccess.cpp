// The tests' side of the recording platform: the way to the library, and threads that are not the browser's.
#include "tests/support/RecordingPlatform.h"

#include <cassert>
#include <condition_variable>
#include <cstdio>
#include <cstdlib>
#include <dlfcn.h>
#include <thread>

namespace {

// Work for one thread, done in turn.
class PlatformThread {
public:
    PlatformThread() : m_thread([this] { run(); }) {}
    ~PlatformThread() {
        hand(nullptr);
        m_thread.join();
    }
    PlatformThread(const PlatformThread&) = delete;
    PlatformThread& operator=(const PlatformThread&) = delete;

    void call(const std::function<void()>& function) {
        assert(std::this_thread::get_id() != m_thread.get_id());
        std::lock_guard<std::mutex> oneCaller(m_callers);
        hand(&function);
        std::unique_lock<std::mutex> lock(m_mutex);
        m_changed.wait(lock, [this] { return !m_busy; });
    }

private:
    void hand(const std::function<void()>* function) {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_work = function;
        m_busy = true;
        m_changed.notify_all();
    }

    void run() {
        for (;;) {
            std::unique_lock<std::mutex> lock(m_mutex);
            m_changed.wait(lock, [this] { return m_busy; });
            if (m_work == nullptr) {
                return;
            }
            lock.unlock();
            (*m_work)();
            lock.lock();
            m_busy = false;
            m_changed.notify_all();
        }
    }

    std::mutex m_callers;
    std::mutex m_mutex;
    std::condition_variable m_changed;
    const std::function<void()>* m_work = nullptr; // null with m_busy: the end
    bool m_busy = false;
    std::thread m_thread; // last: it starts with everything else in place
};

} // namespace

RecordingPlatform& recordingPlatformAt(const std::string& libraryFile) {
    void* library = dlopen(libraryFile.c_str(), RTLD_LAZY | RTLD_LOCAL); // kept open, like the plug-in's own
    void* accessor = library != nullptr ? dlsym(library, "telix_recording_platform") : nullptr;
    if (accessor == nullptr) {
        fprintf(stderr, "No recording platform: %s\n", dlerror());
        abort();
    }
    return *reinterpret_cast<decltype(&telix_recording_platform)>(accessor)();
}

RecordingPlatform& recordingPlatform() {
    static RecordingPlatform& platform = recordingPlatformAt(TELIX_RECORDING_PLATFORM_FILE);
    return platform;
}

void onPlatformThread(const std::function<void()>& function) {
    static PlatformThread thread;
    thread.call(function);
}

void onPlatformThreads(const std::vector<std::function<void()>>& functions) {
    std::mutex mutex;
    std::condition_variable changed;
    std::size_t ready = 0;
    std::vector<std::thread> threads;
    threads.reserve(functions.size());
    for (const auto& function : functions) {
        threads.emplace_back([&] {
            std::unique_lock<std::mutex> lock(mutex);
            ++ready;
            changed.notify_all();
            changed.wait(lock, [&] { return ready == functions.size(); });
            lock.unlock();
            function();
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
}
