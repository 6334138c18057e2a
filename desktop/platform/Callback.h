// One callback of the plug-in: registered and given up from the browser's thread, called on the platform
// thread.
#ifndef TELIX_DESKTOP_CALLBACK_H
#define TELIX_DESKTOP_CALLBACK_H

#include <mutex>

namespace desktop {

template <typename Function>
class Callback {
public:
    // The last one registered is called; null counts as none.
    void set(Function function) {
        std::lock_guard<std::recursive_mutex> lock(m_mutex);
        m_function = function;
    }

    // When this returns, `function` is not running on another thread and is never called again.
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

    // On the platform thread, without the platform's mutex. The callback may itself give the registration up.
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

// A callback that several register and give up, each for itself: it is called once as long as one of them is
// left.
template <typename Function>
class CountedCallback : private Callback<Function> {
public:
    void set(Function function) {
        std::lock_guard<std::recursive_mutex> lock(m_mutex);
        m_count = function == m_function ? m_count + 1 : 1; // another one takes the place
        m_function = function;
    }

    // As with Callback, once the last one has gone.
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
