// What callbacks received, and waiting for it.
#ifndef TELIX_TESTS_DESKTOP_RECEIVED_H
#define TELIX_TESTS_DESKTOP_RECEIVED_H

#include <chrono>
#include <cstdlib>
#include <functional>
#include <mutex>
#include <set>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "telix/telix_platform.h"

// Polls until the condition holds. False after the timeout, which is long enough for a machine under full
// load.
inline bool waitUntil(const std::function<bool()>& condition, int seconds = 60) {
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(seconds);
    while (!condition()) {
        if (std::chrono::steady_clock::now() > end) {
            return false;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    return true;
}

// Takes ownership of a string that the platform returned; null counts as empty.
inline std::string textOf(char* text) {
    std::string copy = text ? text : "";
    std::free(text);
    return copy;
}

// Events in the order of their arrival. The functions may be called on any thread.
template <typename Event>
class Received {
public:
    // Returns what the callback returns.
    TELIX_RETCODE_ENUM_T add(Event event) {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_events.push_back(std::move(event));
        m_threads.insert(std::this_thread::get_id());
        return 0;
    }

    void clear() {
        std::lock_guard<std::mutex> lock(m_mutex);
        m_events.clear();
    }

    std::vector<Event> all() const {
        std::lock_guard<std::mutex> lock(m_mutex);
        return m_events;
    }

    // The threads on which events arrived since the start of the test program.
    std::set<std::thread::id> threads() const {
        std::lock_guard<std::mutex> lock(m_mutex);
        return m_threads;
    }

private:
    mutable std::mutex m_mutex;
    std::vector<Event> m_events;
    std::set<std::thread::id> m_threads;
};

#endif
