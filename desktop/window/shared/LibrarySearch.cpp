// Waits until the plug-in has loaded the platform library.
#include "desktop/window/shared/LibrarySearch.h"

#include <glib.h>

#include <utility>

namespace desktop {

namespace {

struct SearchSource {
    GSource source;
    const std::function<bool()>* find;
};

gboolean prepareSearch(GSource* source, gint* timeout) {
    *timeout = -1;
    return (*reinterpret_cast<SearchSource*>(source)->find)();
}

gboolean checkSearch(GSource*) {
    return FALSE;
}

// The library is found, and stays.
gboolean dispatchSearch(GSource*, GSourceFunc, gpointer) {
    return G_SOURCE_REMOVE;
}

} // namespace

LibrarySearch::LibrarySearch(std::function<bool()> find) : m_find(std::move(find)) {
    static GSourceFuncs functions{prepareSearch, checkSearch, dispatchSearch, nullptr, nullptr, nullptr};
    m_source = g_source_new(&functions, sizeof(SearchSource));
    reinterpret_cast<SearchSource*>(m_source)->find = &m_find;
    g_source_attach(m_source, nullptr);
}

LibrarySearch::~LibrarySearch() {
    g_source_destroy(m_source);
    g_source_unref(m_source);
}

} // namespace desktop
