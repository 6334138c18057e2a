// Values from any thread on their way to the main thread.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_MAINTHREADQUEUE_H
#define TELIX_DESKTOP_WINDOW_SHARED_MAINTHREADQUEUE_H

#include <glib.h>

#include <functional>
#include <mutex>
#include <utility>
#include <vector>

namespace desktop {

// Main thread, but for post().
template <typename Value>
class MainThreadQueue {
public:
    // `take` gets each value, in the order of the posts, when the default main context runs.
    explicit MainThreadQueue(std::function<void(const Value&)> take) : m_take(std::move(take)) {}
    // Drops what is waiting. Nobody may post any more.
    ~MainThreadQueue() {
        if (m_idle != 0) {
            g_source_remove(m_idle);
        }
    }
    MainThreadQueue(const MainThreadQueue&) = delete;
    MainThreadQueue& operator=(const MainThreadQueue&) = delete;

    // Any thread.
    void post(Value value) {
        const std::lock_guard<std::mutex> lock(m_mutex);
        m_waiting.push_back(std::move(value));
        if (m_idle == 0) {
            m_idle = g_idle_add_full(
                G_PRIORITY_DEFAULT,
                [](gpointer queue) -> gboolean {
                    static_cast<MainThreadQueue*>(queue)->takeAll();
                    return G_SOURCE_REMOVE;
                },
                this, nullptr);
        }
    }

private:
    void takeAll() {
        std::vector<Value> values;
        {
            const std::lock_guard<std::mutex> lock(m_mutex);
            values.swap(m_waiting);
            m_idle = 0;
        }
        for (const Value& each : values) {
            m_take(each);
        }
    }

    std::function<void(const Value&)> m_take;
    std::mutex m_mutex; // guards what follows
    std::vector<Value> m_waiting;
    unsigned m_idle = 0; // the source that runs takeAll()
};

} // namespace desktop

#endif
