// Fuzz target of the XML AIT: a document is refused with a reason, or lists applications that the set can
// run.
#include <cassert>
#include <cstddef>
#include <cstdint>
#include <string>

#include "desktop/platform/XmlAit.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    std::string reason;
    const auto list = desktop::parseXmlAit({reinterpret_cast<const char*>(data), size}, reason);
    assert(list.has_value() == reason.empty());
    if (list) {
        assert(list->applications.size() <= desktop::kMaxSignalledApplications);
        for (const desktop::SignalledApplication& application : list->applications) {
            assert(desktop::findFault(application).empty());
        }
    }
    return 0;
}
