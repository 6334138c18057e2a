// The browser's own scripts, each a file in scripts/ that holds one function expression.
#ifndef TELIX_DESKTOP_BROWSER_PAGESCRIPT_H
#define TELIX_DESKTOP_BROWSER_PAGESCRIPT_H

#include <QJsonArray>
#include <QString>
#include <QVariant>

class QWebFrame;

// Calls the function of scripts/`name`.js in the frame's page and gives its value.
QVariant callPageScript(QWebFrame& frame, const QString& name, const QJsonArray& arguments);

#endif
