// A private folder for the engine's plug-in search, with a link to the one plug-in that it shall find.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_PLUGINFOLDER_H
#define TELIX_DESKTOP_WINDOW_NPAPI_PLUGINFOLDER_H

#include <QString>
#include <QTemporaryDir>

namespace desktop {

class PluginFile;

class PluginFolder {
public:
    // Links the plug-in into a new folder, which is removed with this object. Unless `isStrict`, the plug-in
    // of a television is behind an adapter: see adapter/PluginAdapter.cpp.
    PluginFolder(const PluginFile& plugin, bool isStrict);

    // The reason why there is no folder; empty if there is one.
    QString failure() const { return m_failure; }
    QString path() const { return m_folder.path(); }

private:
    QTemporaryDir m_folder;
    QString m_failure;
};

} // namespace desktop

#endif
