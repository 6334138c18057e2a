// The picture of the platform library that the plug-in has opened: found when it is there, read frame by
// frame.
#include "desktop/browser/PictureSource.h"

#include <cstring>
#include <string>

#include <dlfcn.h>
#include <link.h>

namespace {

const char* const libraryName = "libtelix.so";

// What the walk through the loaded libraries brings back.
struct Search {
    unsigned long long loadsSeen;
    unsigned long long loads;
    std::string file;
};

int lookAt(dl_phdr_info* library, size_t, void* data) {
    auto* search = static_cast<Search*>(data);
    search->loads = library->dlpi_adds;
    if (search->loads == search->loadsSeen)
        return 1;
    const char* slash = std::strrchr(library->dlpi_name, '/');
    if (std::strcmp(slash ? slash + 1 : library->dlpi_name, libraryName) != 0)
        return 0;
    search->file = library->dlpi_name;
    return 1;
}

template <typename Function>
bool bindFunction(void* library, const char* name, Function& function) {
    function = reinterpret_cast<Function>(dlsym(library, name));
    return function != nullptr;
}

} // namespace

PictureSource::PictureSource(telix_desktop_wakeup wakeup, void* data)
    : m_wakeup(wakeup), m_wakeupData(data) {}

PictureSource::~PictureSource() {
    if (!m_setWakeup)
        return;
    m_setWakeup(nullptr, nullptr);
    m_release(&m_frame);
}

bool PictureSource::find() {
    if (m_setWakeup)
        return true;
    Search search{m_loadsSeen, 0, {}};
    dl_iterate_phdr(lookAt, &search);
    m_loadsSeen = search.loads;
    return !search.file.empty() && bind(search.file.c_str());
}

bool PictureSource::bind(const char* file) {
    // Kept: the plug-in may close the library while a frame of it is on the screen.
    void* library = dlopen(file, RTLD_LAZY | RTLD_NOLOAD);
    if (!library)
        return false;
    telix_desktop_set_wakeup_function setWakeup = nullptr;
    if (!bindFunction(library, "telix_desktop_acquire_frame", m_acquire) ||
        !bindFunction(library, "telix_desktop_release_frame", m_release) ||
        !bindFunction(library, "telix_desktop_set_wakeup", setWakeup)) {
        dlclose(library);
        return false;
    }
    m_setWakeup = setWakeup;
    m_setWakeup(m_wakeup, m_wakeupData);
    return true;
}

void PictureSource::refresh() {
    if (!m_setWakeup)
        return;
    m_release(&m_frame);
    m_acquire(&m_frame);
}
