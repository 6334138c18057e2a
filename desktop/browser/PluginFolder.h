// The folder that the engine searches for plug-ins: a private one that holds nothing but a link to ours.
#ifndef TELIX_DESKTOP_BROWSER_PLUGINFOLDER_H
#define TELIX_DESKTOP_BROWSER_PLUGINFOLDER_H

#include <QString>
#include <QStringList>
#include <QTemporaryDir>

class PluginFolder {
public:
    // Loads the plug-in `file` into the process, where it stays for good, checks that it is one, and puts a
    // link to it into a new folder, which goes with this object.
    explicit PluginFolder(const QString& file);

    // Why the plug-in can't be used; empty when it can.
    QString failure() const { return m_failure; }
    QString path() const { return m_folder.path(); }
    // The MIME types that the plug-in says it handles.
    QStringList mimeTypes() const { return m_mimeTypes; }

private:
    QTemporaryDir m_folder;
    QStringList m_mimeTypes;
    QString m_failure;
};

#endif
