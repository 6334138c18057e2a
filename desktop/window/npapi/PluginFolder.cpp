// A private folder for the engine's plug-in search, with a link to the one plug-in that it shall find.
#include "desktop/window/npapi/PluginFolder.h"

#include <QDir>
#include <QFile>

#include "desktop/window/shared/PluginFile.h"

namespace desktop {

PluginFolder::PluginFolder(const PluginFile& plugin)
    : m_folder(QDir::temp().filePath(QStringLiteral("telix-tv-XXXXXX"))) {
    const QString link = QDir(m_folder.path()).filePath(QStringLiteral("plugin.so"));
    if (!m_folder.isValid() || !QFile::link(QFile::decodeName(plugin.path().c_str()), link)) {
        m_failure = QStringLiteral("cannot create a link in %1").arg(m_folder.path());
    }
}

} // namespace desktop
