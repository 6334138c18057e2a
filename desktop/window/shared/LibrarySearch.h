// Waits until the plug-in has loaded the platform library.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_LIBRARYSEARCH_H
#define TELIX_DESKTOP_WINDOW_SHARED_LIBRARYSEARCH_H

#include <functional>

using GSource = struct _GSource;

namespace desktop {

// Main thread.
class LibrarySearch {
public:
    // Calls `find` before each wait of the default main context until it returns true. The plug-in loads the
    // library during a call of a page on this thread, so the main loop runs after it.
    explicit LibrarySearch(std::function<bool()> find);
    // Ends the search.
    ~LibrarySearch();
    LibrarySearch(const LibrarySearch&) = delete;
    LibrarySearch& operator=(const LibrarySearch&) = delete;

private:
    GSource* m_source; // owns a reference
    std::function<bool()> m_find;
};

} // namespace desktop

#endif
