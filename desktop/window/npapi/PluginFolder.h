// A private folder for the engine's plug-in search, with a link to the one plug-in that it shall find.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_PLUGINFOLDER_H
#define TELIX_DESKTOP_WINDOW_NPAPI_PLUGINFOLDER_H

#include <QString>
#include <QTemporaryDir>

#include <functional>
#include <string>
#include <utility>

#include "desktop/window/shared/Warnings.h"

namespace desktop {

class PluginFile;

class PluginFolder {
public:
    // Receives what the plug-in's calls have failed at, with the URL of the application's document.
    using Reporter =
        std::function<void(const std::string& page, Warning warning, const std::string& subject)>;

    // Links the plug-in into a new folder, which is removed with this object. The plug-in of a television is
    // behind an adapter, strict or not: see adapter/PluginAdapter.cpp.
    PluginFolder(const PluginFile& plugin, bool isStrict);
    PluginFolder(const PluginFolder&) = delete;
    PluginFolder& operator=(const PluginFolder&) = delete;

    // Null: nobody. Main thread.
    void reportTo(Reporter reporter) { m_reporter = std::move(reporter); }

    // The reason why there is no folder; empty if there is one.
    QString failure() const { return m_failure; }
    QString path() const { return m_folder.path(); }

private:
    Reporter m_reporter;
    QTemporaryDir m_folder;
    QString m_failure;
};

} // namespace desktop

#endif
