// The browser's own scripts in a frame.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_PAGESCRIPT_H
#define TELIX_DESKTOP_WINDOW_NPAPI_PAGESCRIPT_H

#include <QVariant>
#include <QWebFrame>

#include "desktop/window/shared/PageScript.h"

namespace desktop {

// Calls the function of scripts/`name`.js in the frame and returns its value.
inline QVariant callPageScript(QWebFrame& frame, const std::string& name,
                               const std::vector<ScriptValue>& arguments) {
    return frame.evaluateJavaScript(QString::fromStdString(pageScriptCall(name, arguments)));
}

} // namespace desktop

#endif
