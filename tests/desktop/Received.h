// What the callbacks of a test were given, and waiting for it.
#ifndef TELIX_TESTS_DESKTOP_RECEIVED_H
#define TELIX_TESTS_DESKTOP_RECEIVED_H

#include "telix/telix_platform.h"

#include <chrono>
#include <cstdlib>
#include <functional>
#include <mutex>
#include <set>
#include <string>
#include <thread>
#include <utility>
#include <vector>

// Looks until it is so; false if that takes too long.
inline bool waitUntil(const std::function<bool()>& isSo, int seconds = 30) {
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(seconds);
    while (!isSo()) {
        if (std::chrono::steady_clock::now() > end) {
            return false;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    return true;
}

// Takes a text of the platform over; a null one is empty.
inline std::string textOf(char* text) {
    std::string copy = text ? text : "";
    std::free(text);
    return copy;
}

// What came, in its order. The functions are called on any thread.
template <typename Event>
class Received {
public:
    // Gives what a callback gives back.
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

    // On which it came, since the start of the test program.
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
