// The messages of telix-tv on standard error, and its exit statuses.
#include "desktop/browser/Diagnostics.h"

#include <QUrl>

#include <cstdio>

namespace desktop {

void printError(const QString& message) {
    std::fprintf(stderr, "telix-tv: %s\n", message.simplified().toUtf8().constData());
}

void printConsoleMessage(const QString& source, int line, const QString& text) {
    const QUrl url(source);
    const QString file = url.isLocalFile() ? url.toLocalFile() : source;
    std::fprintf(stderr, "%s:%d: %s\n", file.toUtf8().constData(), line, text.toUtf8().constData());
}

} // namespace desktop
