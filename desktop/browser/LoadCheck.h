// Whether a page can be loaded, found out before it is asked for.
#ifndef TELIX_DESKTOP_BROWSER_LOADCHECK_H
#define TELIX_DESKTOP_BROWSER_LOADCHECK_H

#include <QString>
#include <QUrl>

// Why the page at `url` can't be loaded; empty when it can. A local file must be readable; a server must
// begin a successful answer within a few seconds, during which the calling thread stands still: no script and
// no event of a page runs in between. `userAgent` is what the server is told that asks.
QString loadObstacle(const QUrl& url, const QString& userAgent);

#endif
