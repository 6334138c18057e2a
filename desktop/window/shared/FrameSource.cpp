// The video frames of the platform library that the plug-in has loaded.
#include "desktop/window/shared/FrameSource.h"

#include <dlfcn.h>
#include <link.h>

#include <cstring>
#include <string>

namespace desktop {

namespace {

const char* const kLibraryName = "libtelix.so";

// Input and result of the search through the loaded libraries.
struct Search {
    unsigned long long knownLoads;
    unsigned long long loads;
    std::string file;
};

int findPlatformLibrary(dl_phdr_info* library, size_t, void* data) {
    auto* search = static_cast<Search*>(data);
    search->loads = library->dlpi_adds;
    if (search->loads == search->knownLoads) {
        return 1;
    }
    const char* slash = std::strrchr(library->dlpi_name, '/');
    if (std::strcmp(slash ? slash + 1 : library->dlpi_name, kLibraryName) != 0) {
        return 0;
    }
    search->file = library->dlpi_name;
    return 1;
}

template <typename Function>
bool bindFunction(void* library, const char* name, Function& function) {
    function = reinterpret_cast<Function>(dlsym(library, name));
    return function != nullptr;
}

} // namespace

FrameSource::FrameSource(telix_desktop_wakeup wakeup, void* data) : m_wakeup(wakeup), m_wakeupData(data) {}

FrameSource::~FrameSource() {
    if (!m_setWakeup) {
        return;
    }
    m_setWakeup(nullptr, nullptr);
    m_release(&m_frame);
}

bool FrameSource::find() {
    if (m_setWakeup) {
        return true;
    }
    Search search{m_knownLoads, 0, {}};
    dl_iterate_phdr(findPlatformLibrary, &search);
    m_knownLoads = search.loads;
    return !search.file.empty() && bind(search.file.c_str());
}

bool FrameSource::bind(const char* file) {
    // The reference is kept, because the plug-in may close the library while one of its frames is shown.
    void* library = dlopen(file, RTLD_LAZY | RTLD_NOLOAD);
    if (!library) {
        return false;
    }
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

void FrameSource::refresh() {
    if (!m_setWakeup) {
        return;
    }
    m_release(&m_frame);
    m_acquire(&m_frame);
}

void FrameSource::drop() {
    if (m_setWakeup) {
        m_release(&m_frame);
    }
}

} // namespace desktop
