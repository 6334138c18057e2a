// Checks whether a page can be loaded before the engine loads it.
#ifndef TELIX_DESKTOP_BROWSER_LOADCHECK_H
#define TELIX_DESKTOP_BROWSER_LOADCHECK_H

#include <QString>
#include <QUrl>

namespace desktop {

// The reason why the page at `url` cannot be loaded; empty if it can. A local file must be readable; a server
// must start a successful response within 5 seconds. Blocks the calling thread, so that no script or event of
// a page runs meanwhile. `userAgent` is sent to the server.
QString loadError(const QUrl& url, const QString& userAgent);

} // namespace desktop

#endif
