// The options of telix-tv.
#include "desktop/browser/CommandLine.h"

#include "desktop/browser/Diagnostics.h"

#include <QCommandLineParser>
#include <QFileInfo>
#include <QRegularExpression>
#include <QtWebKit/qtwebkitversion.h>
#include <QtWebKit/qwebkitglobal.h>

#include <algorithm>
#include <cmath>
#include <cstdio>

namespace {

const char description[] =
    R"(A television on the desk: shows a page of interactive television with the plug-in in it.

A run with a script goes through these steps, in this order, each only if asked for:
  1. the page is loaded;
  2. --keys are pressed, one after the other, each when the page before it is loaded;
  3. --wait-for is evaluated again and again until it is true;
  4. --wait-for-picture waits until a picture of broadcast or of a media player is there;
  5. --eval is evaluated; its value is the last line on standard output;
  6. --screenshot is written, also when what was waited for never came;
  7. the program ends if --wait-for, --wait-for-picture, --eval or --screenshot was given.
Expressions and keys go to the application on top, the one on the screen, once it is loaded. An expression that
throws is not yet true. All steps together have --timeout seconds.

Exit status: 0 when everything asked for was done, 1 when what was waited for never came, --eval threw or the keys could
not be pressed in time, 2 for a bad option and for a page or a plug-in that can't be loaded.

Keyboard: arrow keys, Enter as OK, Backspace or Escape as Back, F1 to F4 as red, green, yellow, blue, F5 to F10 (or
the media keys) as play, pause, stop, rewind, fast forward, info, and the digits.)";

const int largestSide = 16384;
const double longestTimeoutSeconds = 24 * 60 * 60;

std::optional<int> reject(const QString& mistake) {
    printError(mistake);
    return exitUnusable;
}

std::optional<QSize> readSize(const QString& text) {
    static const QRegularExpression pattern(QStringLiteral("^([1-9][0-9]{0,4})x([1-9][0-9]{0,4})$"));
    const auto match = pattern.match(text);
    const QSize size(match.captured(1).toInt(), match.captured(2).toInt());
    if (!match.hasMatch() || size.width() > largestSide || size.height() > largestSide)
        return std::nullopt;
    return size;
}

// The engine's own, and the token by which television services know a set: options that the set does not
// have, maker, model, versions of software and of hardware, and a field that is kept free.
QString defaultUserAgent() {
    return QStringLiteral("Mozilla/5.0 (X11; Linux) AppleWebKit/%1 (KHTML, like Gecko) Safari/%1 "
                          "HbbTV/1.1.1 (;Telix;telix-tv;" TELIX_VERSION ";;)")
        .arg(qWebKitVersion());
}

// What has a scheme is an address, everything else the name of a file.
QUrl readPage(const QString& text) {
    static const QRegularExpression scheme(QStringLiteral("^([a-zA-Z][a-zA-Z0-9+.-]*://|data:|about:)"));
    return scheme.match(text).hasMatch() ? QUrl(text)
                                         : QUrl::fromLocalFile(QFileInfo(text).absoluteFilePath());
}

QString keyNames() {
    QStringList names;
    for (const auto& key : remoteKeys())
        names << QLatin1String(key.name);
    return names.join(QLatin1String(", "));
}

} // namespace

std::optional<int> readCommandLine(const QStringList& arguments, CommandLine& commandLine) {
    QCommandLineParser parser;
    parser.setApplicationDescription(QString::fromUtf8(description));
    const QCommandLineOption size(
        "size",
        "Size of the window in pixels (1280x720). The page always has 1280x720 and is "
        "enlarged or reduced.",
        "WxH", "1280x720");
    const QCommandLineOption fullscreen("fullscreen", "Fill the screen.");
    const QCommandLineOption plugin("plugin", "The plug-in to load (" TELIX_DEFAULT_PLUGIN ").", "FILE",
                                    TELIX_DEFAULT_PLUGIN);
    const QCommandLineOption keys("keys", "Press keys of the remote control: " + keyNames() + ".",
                                  "NAME,NAME...");
    const QCommandLineOption waitFor("wait-for", "Wait until the expression is true.", "EXPR");
    const QCommandLineOption waitForPicture("wait-for-picture", "Wait until there is a picture.");
    const QCommandLineOption timeout("timeout", "Give up after so many seconds (30).", "SECONDS", "30");
    const QCommandLineOption eval("eval", "Print the value of the expression as JSON.", "EXPR");
    const QCommandLineOption screenshot("screenshot", "Write a picture of the window.", "FILE.png");
    const QCommandLineOption userAgent(
        "user-agent", "What servers and pages are told that this is (" + defaultUserAgent() + ").", "TEXT",
        defaultUserAgent());
    const QCommandLineOption inspect("inspect", "Open the engine's inspector.");
    const QCommandLineOption help(QStringList{"h", "help"}, "Print this text.");
    const QCommandLineOption version("version", "Print the version.");
    parser.addOptions({size, fullscreen, plugin, keys, waitFor, waitForPicture, timeout, eval, screenshot,
                       userAgent, inspect, help, version});
    parser.addPositionalArgument("page", "Address or file name of the page.", "URL-or-FILE");

    if (!parser.parse(arguments))
        return reject(parser.errorText());
    if (parser.isSet(help)) {
        std::fputs(parser.helpText().toUtf8().constData(), stdout);
        return exitSuccess;
    }
    if (parser.isSet(version)) {
        std::printf("telix-tv %s (QtWebKit %s, Qt %s)\n", TELIX_VERSION, QTWEBKIT_VERSION_STR, qVersion());
        return exitSuccess;
    }

    if (parser.positionalArguments().size() != 1)
        return reject(QStringLiteral("exactly one page is needed, see --help"));
    commandLine.page = readPage(parser.positionalArguments().first());

    const auto sizeRead = readSize(parser.value(size));
    if (!sizeRead)
        return reject(QStringLiteral("bad size \"%1\", expected WxH").arg(parser.value(size)));
    commandLine.size = *sizeRead;

    bool isNumber = false;
    commandLine.timeoutSeconds = parser.value(timeout).toDouble(&isNumber);
    if (!isNumber || !(commandLine.timeoutSeconds > 0 && commandLine.timeoutSeconds <= longestTimeoutSeconds))
        return reject(QStringLiteral("bad timeout \"%1\", expected seconds").arg(parser.value(timeout)));

    if (parser.isSet(keys)) {
        for (const auto& name : parser.value(keys).split(QLatin1Char(','))) {
            const RemoteKey* key = remoteKeyByName(name);
            if (!key)
                return reject(QStringLiteral("unknown key \"%1\"").arg(name));
            commandLine.keys << key;
        }
    }
    for (const auto& option : {waitFor, eval, screenshot, plugin, userAgent}) {
        if (parser.isSet(option) && parser.value(option).trimmed().isEmpty())
            return reject(QStringLiteral("option --%1 is empty").arg(option.names().first()));
    }

    commandLine.userAgent = parser.value(userAgent);
    // It becomes a line of a request's head.
    const auto isControl = [](QChar letter) { return letter.category() == QChar::Other_Control; };
    if (std::any_of(commandLine.userAgent.cbegin(), commandLine.userAgent.cend(), isControl))
        return reject(QStringLiteral("bad user agent, it holds a control character"));

    commandLine.fullscreen = parser.isSet(fullscreen);
    commandLine.inspect = parser.isSet(inspect);
    commandLine.plugin = parser.value(plugin);
    commandLine.waitForPicture = parser.isSet(waitForPicture);
    commandLine.waitFor = parser.value(waitFor);
    commandLine.eval = parser.value(eval);
    commandLine.screenshot = parser.value(screenshot);
    return std::nullopt;
}
