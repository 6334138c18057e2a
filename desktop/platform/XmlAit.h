// Signalling of applications without a broadcast: the XML encoding of the AIT, application/vnd.dvb.ait+xml,
// TS 102 809, 5.4.
#ifndef TELIX_DESKTOP_PLATFORM_XMLAIT_H
#define TELIX_DESKTOP_PLATFORM_XMLAIT_H

#include <optional>
#include <string>

#include "desktop/platform/ApplicationInformation.h"

namespace desktop {

// Our limit, in bytes.
constexpr size_t kMaxXmlAitSize = size_t{1} << 20;

// The applications of a document, which may be in any encoding that it declares. Nothing, with the reason in
// `error`, if it is not an XML AIT. Neither reads other documents nor expands entities of its own. Any
// thread.
std::optional<ApplicationList> parseXmlAit(const std::string& document, std::string& error);

} // namespace desktop

#endif
