// A private folder for the engine's plug-in search, with a link to the one plug-in that it shall find.
#ifndef TELIX_DESKTOP_BROWSER_PLUGINFOLDER_H
#define TELIX_DESKTOP_BROWSER_PLUGINFOLDER_H

#include <QString>
#include <QStringList>
#include <QTemporaryDir>

namespace desktop {

class PluginFolder {
public:
    // Loads the plug-in `file`, which stays loaded until the process exits, checks its entry points, and
    // links it into a new folder. The folder is removed with this object.
    explicit PluginFolder(const QString& file);

    // The reason why the plug-in cannot be used; empty if it can.
    QString failure() const { return m_failure; }
    QString path() const { return m_folder.path(); }
    // The MIME types of NP_GetMIMEDescription().
    QStringList mimeTypes() const { return m_mimeTypes; }

private:
    QTemporaryDir m_folder;
    QStringList m_mimeTypes;
    QString m_failure;
};

} // namespace desktop

#endif
