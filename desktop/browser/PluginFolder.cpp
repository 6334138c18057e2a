// A private folder for the engine's plug-in search, with a link to the one plug-in that it shall find.
#include "desktop/browser/PluginFolder.h"

#include <dlfcn.h>

#include <QDir>
#include <QFile>
#include <QFileInfo>

namespace desktop {

namespace {

// The description has the form `type:suffixes:description;type:suffixes:description;`.
QStringList mimeTypesOf(const char* mimeDescription) {
    QStringList types;
    for (const auto& entry : QString::fromUtf8(mimeDescription).split(QLatin1Char(';'), Qt::SkipEmptyParts)) {
        types << entry.section(QLatin1Char(':'), 0, 0).trimmed();
    }
    return types;
}

} // namespace

PluginFolder::PluginFolder(const QString& file)
    : m_folder(QDir::temp().filePath(QStringLiteral("telix-tv-XXXXXX"))) {
    const QFileInfo info(file);
    if (!info.isFile()) {
        m_failure = QStringLiteral("No such file");
        return;
    }
    // The reference is kept, because an idle callback of the plug-in may run after the engine has closed
    // the library.
    void* library = dlopen(QFile::encodeName(info.absoluteFilePath()).constData(), RTLD_LAZY | RTLD_LOCAL);
    if (!library) {
        m_failure = QString::fromLocal8Bit(dlerror());
        return;
    }
    for (const char* name : {"NP_Initialize", "NP_Shutdown", "NP_GetValue", "NP_GetMIMEDescription"}) {
        if (!dlsym(library, name)) {
            m_failure = QStringLiteral("not an NPAPI plug-in, %1 is missing").arg(QLatin1String(name));
            return;
        }
    }
    const auto mimeDescription = reinterpret_cast<const char* (*)()>(dlsym(library, "NP_GetMIMEDescription"));
    m_mimeTypes = mimeTypesOf(mimeDescription());

    const QString link = QDir(m_folder.path()).filePath(QStringLiteral("plugin.so"));
    if (!m_folder.isValid() || !QFile::link(info.absoluteFilePath(), link)) {
        m_failure = QStringLiteral("cannot create a link in %1").arg(m_folder.path());
    }
}

} // namespace desktop
