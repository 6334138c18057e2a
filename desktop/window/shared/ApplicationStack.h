// The stack of applications of a window, whatever its toolkit.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_APPLICATIONSTACK_H
#define TELIX_DESKTOP_WINDOW_SHARED_APPLICATIONSTACK_H

#include <algorithm>
#include <cstddef>
#include <string>
#include <vector>

namespace desktop {

// The limit of what a page may have open, also if it opens itself.
constexpr std::size_t kMaxApplications = 16;

// The topmost application is visible. An application opens others above the topmost one and ends itself,
// wherever it is. `Application` has the function setOnTop(bool), called when the application gets to the top
// and when it leaves it. Owns nothing.
template <typename Application>
class ApplicationStack {
public:
    // The visible application, or null.
    Application* top() const { return m_applications.empty() ? nullptr : m_applications.back(); }
    bool has(const Application& application) const {
        return std::find(m_applications.begin(), m_applications.end(), &application) != m_applications.end();
    }
    const std::vector<Application*>& all() const { return m_applications; }

    // Whether one more may be opened. If not, `report` is called with the reason, once until there is space
    // again: a page may ask in a loop.
    template <typename Report>
    bool hasSpace(const Report& report) {
        const bool isFull = m_applications.size() >= kMaxApplications;
        if (isFull && !m_isFullReported) {
            report("there are " + std::to_string(kMaxApplications) + " applications already");
        }
        m_isFullReported = isFull;
        return !isFull;
    }

    void push(Application& application) {
        if (Application* before = top()) {
            before->setOnTop(false);
        }
        m_applications.push_back(&application);
        application.setOnTop(true);
    }
    void remove(Application& application) {
        const bool wasTop = top() == &application;
        m_applications.erase(std::remove(m_applications.begin(), m_applications.end(), &application),
                             m_applications.end());
        if (!wasTop) {
            return;
        }
        application.setOnTop(false);
        if (Application* now = top()) {
            now->setOnTop(true);
        }
    }
    void clear() { m_applications.clear(); }

private:
    // The last one is the topmost.
    std::vector<Application*> m_applications;
    bool m_isFullReported = false;
};

} // namespace desktop

#endif
