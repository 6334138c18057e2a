// The browser's own scripts: files in scripts/, each with one function expression.
#ifndef TELIX_DESKTOP_BROWSER_PAGESCRIPT_H
#define TELIX_DESKTOP_BROWSER_PAGESCRIPT_H

#include <QJsonArray>
#include <QString>
#include <QVariant>

class QWebFrame;

namespace desktop {

// Calls the function of scripts/`name`.js in the frame and returns its value.
QVariant callPageScript(QWebFrame& frame, const QString& name, const QJsonArray& arguments);

} // namespace desktop

#endif
