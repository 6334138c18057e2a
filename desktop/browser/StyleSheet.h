// Style sheets of the browser's own, which pages can't overrule.
#ifndef TELIX_DESKTOP_BROWSER_STYLESHEET_H
#define TELIX_DESKTOP_BROWSER_STYLESHEET_H

#include <QString>
#include <QUrl>

// The address of a style sheet with that text. In this form the engine uses it at once, without loading it.
inline QUrl styleSheetUrl(const QString& style) {
    return QUrl(QLatin1String("data:text/css;charset=utf-8;base64,") +
                QLatin1String(style.toUtf8().toBase64()));
}

#endif
