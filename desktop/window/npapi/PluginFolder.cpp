// A private folder for the engine's plug-in search, with a link to the one plug-in that it shall find.
#include "desktop/window/npapi/PluginFolder.h"

#include <dlfcn.h>

#include <QDir>
#include <QFile>

#include <algorithm>
#include <string>

#include "desktop/window/npapi/adapter/PluginAdapter.h"
#include "desktop/window/shared/PluginFile.h"
#include "desktop/window/shared/ProgramFolder.h"

namespace desktop {

namespace {

bool isOfTelevision(const PluginFile& plugin) {
    const auto& types = plugin.mimeTypes();
    return std::find(types.begin(), types.end(), "video/broadcast") != types.end();
}

// The file of the adapter, which leads to the plug-in from now on; empty if it cannot be loaded.
std::string adapterOf(const PluginFile& plugin, bool isStrict, ReportWarningFunction report, void* data) {
    const std::string file = besideProgram("telix-tv-npapi-adapter.so");
    void* library = dlopen(file.c_str(), RTLD_LAZY | RTLD_LOCAL);
    const auto adapt =
        library ? reinterpret_cast<AdaptPluginFunction>(dlsym(library, kAdaptPluginFunction)) : nullptr;
    return adapt && adapt({plugin.path().c_str(), isStrict, report, data}) ? file : "";
}

} // namespace

PluginFolder::PluginFolder(const PluginFile& plugin, bool isStrict)
    : m_folder(QDir::temp().filePath(QStringLiteral("telix-tv-XXXXXX"))) {
    const auto report = [](const char* page, const char* warning, const char* subject, void* data) {
        const auto* self = static_cast<const PluginFolder*>(data);
        const auto found = warningNamed(warning);
        if (self->m_reporter && found) {
            self->m_reporter(page, *found, subject);
        }
    };
    const std::string file =
        isOfTelevision(plugin) ? adapterOf(plugin, isStrict, report, this) : plugin.path();
    const QString link = QDir(m_folder.path()).filePath(QStringLiteral("plugin.so"));
    if (file.empty()) {
        m_failure =
            QStringLiteral("cannot load the adapter of the plug-in: %1").arg(QString::fromUtf8(dlerror()));
    } else if (!m_folder.isValid() || !QFile::link(QFile::decodeName(file.c_str()), link)) {
        m_failure = QStringLiteral("cannot create a link in %1").arg(m_folder.path());
    }
}

} // namespace desktop
