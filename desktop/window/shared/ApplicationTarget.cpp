// What a URL leads to that starts an application: a page, an XML AIT with pages, or a signalled application.
#include "desktop/window/shared/ApplicationTarget.h"

#include <algorithm>

#include "desktop/platform/XmlAit.h"
#include "desktop/window/shared/Pattern.h"

namespace desktop {

namespace {

ApplicationTarget failure(const std::string& error) {
    ApplicationTarget target;
    target.error = error;
    return target;
}

ApplicationTarget checkedPage(const std::string& url, const RequestOptions& options) {
    return {url, std::nullopt, loadError(url, options), {}};
}

// The URL with a query (`?...`) and a fragment (`#...`) added, which may be empty. A query is added to one
// that is there; a fragment takes its place.
std::string withQueryAndFragment(const std::string& url, const std::string& query,
                                 const std::string& fragment) {
    const std::size_t hash = std::min(url.find('#'), url.size());
    std::string result = url.substr(0, hash);
    if (!query.empty()) {
        result += (result.find('?') == std::string::npos ? "?" : "&") + query.substr(1);
    }
    return result + (fragment.empty() ? url.substr(hash) : fragment);
}

bool isBetter(const SignalledApplication& left, const SignalledApplication& right) {
    const bool isLeftAutostart = left.controlCode == kControlCodeAutostart;
    const bool isRightAutostart = right.controlCode == kControlCodeAutostart;
    return isLeftAutostart != isRightAutostart ? isLeftAutostart : left.priority > right.priority;
}

ApplicationTarget targetOfXmlAit(const std::string& document, const RequestOptions& options) {
    std::string error;
    const auto list = parseXmlAit(document, error);
    if (!list) {
        return failure(error);
    }
    std::vector<SignalledApplication> startable;
    std::copy_if(list->applications.begin(), list->applications.end(), std::back_inserter(startable),
                 [](const SignalledApplication& each) { return each.isStartable(); });
    std::stable_sort(startable.begin(), startable.end(), isBetter);
    ApplicationTarget last =
        failure(list->skipped.empty() ? "the XML AIT has no application to start" : list->skipped.front());
    for (const SignalledApplication& each : startable) {
        last = checkedPage(each.url, options);
        if (last.error.empty()) {
            break;
        }
        last.error = each.url + ": " + last.error;
    }
    last.skipped = list->skipped;
    return last;
}

} // namespace

ApplicationTarget findApplication(const std::string& url, const RequestOptions& options,
                                  const std::vector<SignalledApplication>& signalled) {
    static const Pattern kSignalledUrl(
        R"(dvb://current\.ait/0*([0-9a-f]{1,8})\.0*([0-9a-f]{1,4})(\?[^#]*)?(#.*)?)",
        Pattern::Case::Insensitive);
    if (const auto parts = kSignalledUrl.match(url)) {
        const ApplicationId id{static_cast<uint32_t>(std::stoul((*parts)[1], nullptr, 16)),
                               static_cast<uint16_t>(std::stoul((*parts)[2], nullptr, 16))};
        const auto found =
            std::find_if(signalled.begin(), signalled.end(), [&id](const SignalledApplication& each) {
                return each.id == id && each.isStartable();
            });
        if (found == signalled.end()) {
            return failure("the channel signals no such application");
        }
        ApplicationTarget target =
            checkedPage(withQueryAndFragment(found->url, (*parts)[3], (*parts)[4]), options);
        target.signalled = *found;
        return target;
    }
    const LoadResult result = load(url, options);
    return result.xmlAit ? targetOfXmlAit(*result.xmlAit, options)
                         : ApplicationTarget{url, std::nullopt, result.error, {}};
}

ApplicationTarget findApplicationOfXmlAit(const std::string& url, const RequestOptions& options) {
    const LoadResult result = load(url, options, ExpectedDocument::XmlAit);
    if (result.xmlAit) {
        return targetOfXmlAit(*result.xmlAit, options);
    }
    return failure(result.error.empty() ? "not an XML AIT" : result.error);
}

void warnOfSkipped(const ApplicationTarget& target, const std::string& url, Warnings& warnings) {
    for (const std::string& each : target.skipped) {
        if (each != target.error) {
            warnings.print({}, Warning::SkippedEntry, url + ": " + each);
        }
    }
}

} // namespace desktop
