// The browser's own scripts: files in scripts/, each with one function expression.
#include "desktop/browser/PageScript.h"

#include <QFile>
#include <QJsonDocument>
#include <QWebFrame>

#include <cassert>

namespace desktop {

QVariant callPageScript(QWebFrame& frame, const QString& name, const QJsonArray& arguments) {
    QFile file(QStringLiteral(":/scripts/%1.js").arg(name));
    const bool opened = file.open(QIODevice::ReadOnly);
    assert(opened);
    // JSON is valid JavaScript except for two separators that end a line inside a string literal.
    const QString list = QString::fromUtf8(QJsonDocument(arguments).toJson(QJsonDocument::Compact))
                             .replace(QChar(QChar::LineSeparator), QLatin1String("\\u2028"))
                             .replace(QChar(QChar::ParagraphSeparator), QLatin1String("\\u2029"));
    return frame.evaluateJavaScript(
        QStringLiteral("%2.apply(null, %1)").arg(list, QString::fromUtf8(file.readAll()).trimmed()));
}

} // namespace desktop
