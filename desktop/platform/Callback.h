// A callback of the plug-in: registered and removed on the browser's thread, called on the platform thread.
#ifndef TELIX_DESKTOP_PLATFORM_CALLBACK_H
#define TELIX_DESKTOP_PLATFORM_CALLBACK_H

#include <mutex>

namespace desktop {

// The mutex is held while the callback runs, so that none runs after its removal; it is recursive, because
// the callback may remove itself.
template <typename Function>
class Callback {
public:
    // Replaces the callback; null removes it.
    void set(Function function) {
        std::lock_guard<std::recursive_mutex> lock(m_mutex);
        m_function = function;
    }

    // Removes `function` if it is the registered one. When this returns, it is not running on another thread
    // and is not called again.
    void clear(Function function) {
        std::lock_guard<std::recursive_mutex> lock(m_mutex);
        if (m_function == function) {
            m_function = nullptr;
        }
    }

    bool isSet() const {
        std::lock_guard<std::recursive_mutex> lock(m_mutex);
        return m_function != nullptr;
    }

    // Platform thread, without the platform's mutex.
    template <typename... Arguments>
    void call(Arguments... arguments) const {
        std::lock_guard<std::recursive_mutex> lock(m_mutex);
        if (m_function) {
            m_function(arguments...);
        }
    }

protected:
    mutable std::recursive_mutex m_mutex;
    Function m_function = nullptr;
};

// A callback that is registered several times, and called once as long as a registration is left.
template <typename Function>
class CountedCallback : private Callback<Function> {
public:
    // Another function replaces the registered one, with a count of one.
    void set(Function function) {
        std::lock_guard<std::recursive_mutex> lock(m_mutex);
        m_count = function == m_function ? m_count + 1 : 1;
        m_function = function;
    }

    // As Callback::clear(), at the last registration.
    void clear(Function function) {
        std::lock_guard<std::recursive_mutex> lock(m_mutex);
        if (m_function == function && m_count > 0 && --m_count == 0) {
            m_function = nullptr;
        }
    }

    using Callback<Function>::isSet;
    using Callback<Function>::call;

private:
    using Callback<Function>::m_function;
    using Callback<Function>::m_mutex;

    unsigned int m_count = 0;
};

} // namespace desktop

#endif
