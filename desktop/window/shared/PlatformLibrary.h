// The platform library that the plug-in has loaded.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_PLATFORMLIBRARY_H
#define TELIX_DESKTOP_WINDOW_SHARED_PLATFORMLIBRARY_H

#include <dlfcn.h>

namespace desktop {

// All functions are for one thread.
class PlatformLibrary {
public:
    // Searches the loaded libraries for libtelix.so, unless it is found already, and returns whether it is
    // found. Returns early if no library has been loaded since the last call. The library that is found stays
    // loaded, because the plug-in may close it while it is in use.
    bool find();

    // Sets `function` to the function of that name; returns whether the library, which must be found, has it.
    template <typename Function>
    bool bind(const char* name, Function& function) const {
        function = reinterpret_cast<Function>(dlsym(m_handle, name));
        return function != nullptr;
    }

private:
    unsigned long long m_knownLoads = 0;
    void* m_handle = nullptr;
};

} // namespace desktop

#endif
