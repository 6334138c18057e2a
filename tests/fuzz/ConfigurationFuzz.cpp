// Fuzz target of the configuration file. A file that is refused leaves the configuration as it was; one that
// is accepted holds values within their limits.
#include <sys/mman.h>
#include <unistd.h>

#include <cassert>
#include <cstddef>
#include <cstdint>
#include <string>

#include "desktop/platform/Configuration.h"

namespace {

// One file in memory for all inputs.
const std::string& memoryFile(const uint8_t* data, size_t size) {
    static const int descriptor = memfd_create("configuration", MFD_CLOEXEC);
    static const std::string path = "/proc/self/fd/" + std::to_string(descriptor);
    const bool isWritten =
        ftruncate(descriptor, 0) == 0 && pwrite(descriptor, data, size, 0) == static_cast<ssize_t>(size);
    assert(isWritten);
    return path;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    desktop::Configuration configuration;
    configuration.country = "unchanged";
    const auto error = desktop::Configuration::load(memoryFile(data, size), configuration);
    if (error) {
        assert(!error->reason.empty() && configuration.country == "unchanged");
        return 0;
    }
    assert(configuration.country.size() == 3 && (configuration.keySet & ~configuration.keys) == 0);
    for (const desktop::Configuration::RatingScheme& scheme : configuration.ratingSchemes) {
        assert(scheme.threshold < scheme.ratings.size() && scheme.icons.size() == scheme.ratings.size());
    }
    return 0;
}
