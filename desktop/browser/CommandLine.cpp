// The options of telix-tv.
#include "desktop/browser/CommandLine.h"

#include <QCommandLineParser>
#include <QFileInfo>
#include <QRegularExpression>
#include <QtWebKit/qtwebkitversion.h>
#include <QtWebKit/qwebkitglobal.h>

#include <algorithm>
#include <cmath>
#include <cstdio>

#include "desktop/browser/Diagnostics.h"

namespace desktop {

namespace {

const char kDescription[] =
    R"(The window of the desktop television: shows a page of an HbbTV application with the plug-in.

Automation performs these steps in this order, each only if its option is given:
  1. load the page;
  2. press --keys, one after the other, each when the page that the previous one opened is loaded;
  3. evaluate --wait-for repeatedly until it is true;
  4. --wait-for-picture: wait until the video plane shows broadcast or media;
  5. evaluate --eval and print its value as the last line on standard output;
  6. write --screenshot, also after a timeout;
  7. exit, if --wait-for, --wait-for-picture, --eval or --screenshot is given.
Expressions and keys go to the topmost application, the visible one, when it is loaded. An expression that throws
counts as false. --timeout applies to all steps together.

Exit status: 0 if all steps are done; 1 after a timeout or if --eval throws; 2 for a bad option and for a page or a
plug-in that cannot be loaded.

Keyboard: arrow keys, Enter (OK), Backspace or Escape (Back), F1 to F4 (red, green, yellow, blue), F5 to F10 or the
media keys (play, pause, stop, rewind, fast forward, info), and the digits.)";

constexpr int kMaxSide = 16384;
constexpr double kMaxTimeoutSeconds = 24 * 60 * 60;

std::optional<QSize> parseSize(const QString& text) {
    static const QRegularExpression kPattern(QStringLiteral("^([1-9][0-9]{0,4})x([1-9][0-9]{0,4})$"));
    const auto match = kPattern.match(text);
    const QSize size(match.captured(1).toInt(), match.captured(2).toInt());
    if (!match.hasMatch() || size.width() > kMaxSide || size.height() > kMaxSide) {
        return std::nullopt;
    }
    return size;
}

// The engine's own string and the HbbTV token of TS 102 796: capabilities (none), vendor, model, software
// version, hardware version, a reserved field.
QString defaultUserAgent() {
    return QStringLiteral("Mozilla/5.0 (X11; Linux) AppleWebKit/%1 (KHTML, like Gecko) Safari/%1 "
                          "HbbTV/1.1.1 (;Telix;telix-tv;" TELIX_VERSION ";;)")
        .arg(qWebKitVersion());
}

// A string with a scheme is a URL, any other a file name.
QUrl parsePage(const QString& text) {
    static const QRegularExpression kScheme(QStringLiteral("^([a-zA-Z][a-zA-Z0-9+.-]*://|data:|about:)"));
    return kScheme.match(text).hasMatch() ? QUrl(text)
                                          : QUrl::fromLocalFile(QFileInfo(text).absoluteFilePath());
}

QString keyNames() {
    QStringList names;
    for (const auto& key : remoteKeys()) {
        names << QLatin1String(key.name);
    }
    return names.join(QLatin1String(", "));
}

struct Options {
    QCommandLineOption size{"size",
                            "Size of the window in pixels, default 1280x720. The page is scaled to it.",
                            "WxH", "1280x720"};
    QCommandLineOption fullscreen{"fullscreen", "Fill the screen."};
    QCommandLineOption plugin{"plugin", "The plug-in to load, default " TELIX_DEFAULT_PLUGIN ".", "FILE",
                              TELIX_DEFAULT_PLUGIN};
    QCommandLineOption keys{"keys", "Press keys of the remote control: " + keyNames() + ".", "NAME,NAME..."};
    QCommandLineOption waitFor{"wait-for", "Wait until the expression is true.", "EXPR"};
    QCommandLineOption waitForPicture{"wait-for-picture", "Wait until the video plane shows something."};
    QCommandLineOption timeout{"timeout", "Timeout of all steps in seconds, default 30.", "SECONDS", "30"};
    QCommandLineOption eval{"eval", "Print the value of the expression as JSON.", "EXPR"};
    QCommandLineOption screenshot{"screenshot", "Write a screenshot of the window.", "FILE.png"};
    QCommandLineOption userAgent{"user-agent", "The user agent string, default " + defaultUserAgent() + ".",
                                 "TEXT", defaultUserAgent()};
    QCommandLineOption inspect{"inspect", "Open the web inspector."};
    QCommandLineOption help{QStringList{"h", "help"}, "Print this text."};
    QCommandLineOption version{"version", "Print the version."};

    QList<QCommandLineOption> all() const {
        return {size, fullscreen, plugin,    keys,    waitFor, waitForPicture, timeout,
                eval, screenshot, userAgent, inspect, help,    version};
    }
};

// Reports a usage error.
std::optional<int> reject(const QString& error) {
    printError(error);
    return kExitBadInput;
}

// Handles --help and --version, which need nothing else of the command line.
bool printInformation(const QCommandLineParser& parser, const Options& options) {
    if (parser.isSet(options.help)) {
        std::fputs(parser.helpText().toUtf8().constData(), stdout);
        return true;
    }
    if (parser.isSet(options.version)) {
        std::printf("telix-tv %s (QtWebKit %s, Qt %s)\n", TELIX_VERSION, QTWEBKIT_VERSION_STR, qVersion());
        return true;
    }
    return false;
}

// The following functions return the usage error, a null string if there is none.

QString parseKeys(const QString& list, QVector<const RemoteKey*>& keys) {
    for (const auto& name : list.split(QLatin1Char(','))) {
        const RemoteKey* key = remoteKeyByName(name);
        if (!key) {
            return QStringLiteral("--keys: unknown key \"%1\"").arg(name);
        }
        keys << key;
    }
    return {};
}

QString checkNotEmpty(const QCommandLineParser& parser, const Options& options) {
    for (const auto& option :
         {options.waitFor, options.eval, options.screenshot, options.plugin, options.userAgent}) {
        if (parser.isSet(option) && parser.value(option).trimmed().isEmpty()) {
            return QStringLiteral("--%1: empty value").arg(option.names().first());
        }
    }
    // The user agent becomes a line of a request header.
    const QString userAgent = parser.value(options.userAgent);
    const auto isControl = [](QChar letter) { return letter.category() == QChar::Other_Control; };
    if (std::any_of(userAgent.cbegin(), userAgent.cend(), isControl)) {
        return QStringLiteral("--user-agent: control character in the user agent");
    }
    return {};
}

QString parseValues(const QCommandLineParser& parser, const Options& options, CommandLine& commandLine) {
    if (parser.positionalArguments().size() != 1) {
        return QStringLiteral("expected exactly one page, see --help");
    }
    commandLine.page = parsePage(parser.positionalArguments().first());

    const auto size = parseSize(parser.value(options.size));
    if (!size) {
        return QStringLiteral("--size: bad size \"%1\", expected WxH").arg(parser.value(options.size));
    }
    commandLine.windowSize = *size;

    bool isNumber = false;
    const double timeout = parser.value(options.timeout).toDouble(&isNumber);
    if (!isNumber || !(timeout > 0 && timeout <= kMaxTimeoutSeconds)) {
        return QStringLiteral("--timeout: bad timeout \"%1\", expected seconds")
            .arg(parser.value(options.timeout));
    }
    commandLine.timeoutSeconds = timeout;

    const QString keyError =
        parser.isSet(options.keys) ? parseKeys(parser.value(options.keys), commandLine.keys) : QString();
    return keyError.isNull() ? checkNotEmpty(parser, options) : keyError;
}

} // namespace

std::optional<int> readCommandLine(const QStringList& arguments, CommandLine& commandLine) {
    const Options options;
    QCommandLineParser parser;
    parser.setApplicationDescription(QString::fromUtf8(kDescription));
    parser.addOptions(options.all());
    parser.addPositionalArgument("page", "URL or file name of the page.", "URL-or-FILE");

    if (!parser.parse(arguments)) {
        return reject(parser.errorText());
    }
    if (printInformation(parser, options)) {
        return kExitSuccess;
    }
    const QString error = parseValues(parser, options, commandLine);
    if (!error.isNull()) {
        return reject(error);
    }
    commandLine.fullscreen = parser.isSet(options.fullscreen);
    commandLine.inspect = parser.isSet(options.inspect);
    commandLine.plugin = parser.value(options.plugin);
    commandLine.userAgent = parser.value(options.userAgent);
    commandLine.waitForPicture = parser.isSet(options.waitForPicture);
    commandLine.waitFor = parser.value(options.waitFor);
    commandLine.eval = parser.value(options.eval);
    commandLine.screenshot = parser.value(options.screenshot);
    return std::nullopt;
}

} // namespace desktop
