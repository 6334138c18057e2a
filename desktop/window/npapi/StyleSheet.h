// User style sheets of the browser, which pages cannot override.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_STYLESHEET_H
#define TELIX_DESKTOP_WINDOW_NPAPI_STYLESHEET_H

#include <QString>
#include <QUrl>

namespace desktop {

// The URL of a style sheet with that text. The engine applies a data URL synchronously.
inline QUrl styleSheetUrl(const QString& style) {
    return QUrl(QLatin1String("data:text/css;charset=utf-8;base64,") +
                QLatin1String(style.toUtf8().toBase64()));
}

} // namespace desktop

#endif
