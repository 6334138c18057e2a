#include "desktop/conformance/Library.h"

#include <dlfcn.h>

namespace desktop {

bool Library::open(const std::string& file, std::string& error) {
    void* library = dlopen(file.c_str(), RTLD_LAZY | RTLD_LOCAL);
    if (!library) {
        const char* reason = dlerror();
        error = reason ? reason : file;
        return false;
    }
#define TELIX_CALL(name, parameters, arguments)                                                              \
    this->name = reinterpret_cast<decltype(this->name)>(dlsym(library, #name));                              \
    exports.push_back({#name, this->name != nullptr});
#define TELIX_CALL_UNBOUND(name, parameters, arguments)
#include "telix/telix_platform_calls.h"
    return true;
}

} // namespace desktop
