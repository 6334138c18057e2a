// What a URL leads to that starts an application: a page, an XML AIT with pages, or a signalled application.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_APPLICATIONTARGET_H
#define TELIX_DESKTOP_WINDOW_SHARED_APPLICATIONTARGET_H

#include <optional>
#include <string>
#include <vector>

#include "desktop/platform/ApplicationInformation.h"
#include "desktop/window/shared/LoadCheck.h"
#include "desktop/window/shared/Warnings.h"

namespace desktop {

struct ApplicationTarget {
    std::string url; // of the page
    // The application that is signalled, for a URL that names it by its id.
    std::optional<SignalledApplication> signalled;
    // Why no application can be started; empty if one can.
    std::string error;
    // Per entry of an XML AIT that was left out: which, and why.
    std::vector<std::string> skipped;
};

// Follows a URL to a page that can be loaded:
//   dvb://current.ait/ORG.APP  the application with these hexadecimal ids among `signalled`; the query
//                              and the fragment of the URL are added to its own (TS 102 796, 9.2)
//   an XML AIT                 by content type, or by the name *.aitx: of its applications that can be
//                              loaded the one with the highest priority, AUTOSTART before PRESENT
//   anything else              the page itself
// Blocks until the server has responded. Any thread.
ApplicationTarget findApplication(const std::string& url, const RequestOptions& options,
                                  const std::vector<SignalledApplication>& signalled);

// The same for a URL that must be one of an XML AIT.
ApplicationTarget findApplicationOfXmlAit(const std::string& url, const RequestOptions& options);

// Warns of what was left out of the XML AIT that `url` has led to, but for the error.
void warnOfSkipped(const ApplicationTarget& target, const std::string& url, Warnings& warnings);

} // namespace desktop

#endif
