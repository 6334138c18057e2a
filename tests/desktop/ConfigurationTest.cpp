// The configuration file: settings, their defaults, and error messages.
#include <cerrno>
#include <fstream>
#include <glib.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <set>
#include <sys/stat.h>
#include <unistd.h>

#include "desktop/platform/Configuration.h"
#include "desktop/platform/RegularFile.h"
#include "desktop/platform/Settings.h"

using namespace desktop;

namespace {

class ConfigurationTest : public testing::Test {
protected:
    std::optional<Configuration::Error> load(const std::string& contents) {
        std::ofstream(m_file) << contents;
        return Configuration::load(m_file, m_configuration);
    }
    void TearDown() override { std::remove(m_file.c_str()); }

    std::string m_file = testing::TempDir() + "telix-configuration-" + std::to_string(getpid()) + ".conf";
    Configuration m_configuration;
};

TEST_F(ConfigurationTest, SetsWhatItNamesAndLeavesTheRestAtItsDefaults) {
    EXPECT_FALSE(load("# mine\n[viewer]\ncountry=FRA\n[channels]\nsources=test#102; /films/a.ts ;music#7\n"
                      "[parental]\nthreshold=12\n"));
    EXPECT_EQ(m_configuration.country, "FRA");
    EXPECT_EQ(m_configuration.audioLanguage, "deu");
    EXPECT_EQ(m_configuration.ratingThreshold, 12);
    ASSERT_EQ(m_configuration.sources.size(), 3U);
    EXPECT_EQ(m_configuration.sources[0].path, "");
    EXPECT_EQ(m_configuration.sources[0].service, 102);
    EXPECT_EQ(m_configuration.sources[1].path, "/films/a.ts");
    EXPECT_FALSE(m_configuration.sources[1].service);
    EXPECT_EQ(m_configuration.sources[2].path,
              m_file.substr(0, m_file.rfind('/')) + "/music"); // in the folder of the file
    EXPECT_EQ(m_configuration.sources[2].service, 7);
}

TEST_F(ConfigurationTest, KnowsRatingSchemesDrmSystemsAndKeys) {
    const auto error = load("[parental-scheme films]\nthreshold=PG\nratings=G; PG;R;\nicons=;pg.png;;\n"
                            "[parental-scheme games]\nratings=3;18\n"
                            "[drm urn:dvb:casystemid:1]\nresult=4\nmessage=no; not now\n[drm other]\n"
                            "[set]\nkey-set=red;alpha\nkeys=red;blue;vcr\n");
    ASSERT_FALSE(error) << error->message();
    ASSERT_EQ(m_configuration.ratingSchemes.size(), 2U);
    const Configuration::RatingScheme& films = m_configuration.ratingSchemes[0];
    EXPECT_EQ(films.name, "films");
    EXPECT_EQ(films.ratings, (std::vector<std::string>{"G", "PG", "R"}));
    EXPECT_EQ(films.icons, (std::vector<std::string>{"", "pg.png", ""}));
    EXPECT_EQ(films.threshold, 1U);
    EXPECT_EQ(m_configuration.ratingSchemes[1].icons, (std::vector<std::string>{"", ""}));
    EXPECT_EQ(m_configuration.ratingSchemes[1].threshold, 1U); // the last rating
    ASSERT_EQ(m_configuration.drmSystems.size(), 2U);
    EXPECT_EQ(m_configuration.drmSystems[0].id, "urn:dvb:casystemid:1");
    EXPECT_EQ(m_configuration.drmSystems[0].result, 4);
    EXPECT_EQ(m_configuration.drmSystems[0].message, "no; not now");
    EXPECT_EQ(m_configuration.drmSystems[1].id, "other");
    EXPECT_EQ(m_configuration.drmSystems[1].result, 0);
    EXPECT_EQ(m_configuration.keys, 0x29U);
    EXPECT_EQ(m_configuration.keySet, 0x1U); // the remote control has no letters
}

TEST_F(ConfigurationTest, NamesFileLineAndReasonOfEveryFault) {
    const struct {
        const char* contents;
        unsigned int line;
        const char* reason;
    } faults[] = {
        {"[viewer]\ncountry=DEU\nthis is no setting\n", 3, "this is no setting"},
        {"country=DEU\n", 1, ""},
        {"\n[colours]\nred=1\n", 2, "unknown group [colours]"},
        {"[viewer]\n\nregion=1\n", 3, "unknown key \"region\" in [viewer]"},
        {"[viewer]\ncountry=Germany\n", 2, "country: \"Germany\" is not an ISO code of three letters"},
        {"[test]\nprogramme-seconds=often\n", 2, "programme-seconds"},
        {"[test]\nprogramme-seconds=1\n", 2, "programme-seconds"},
        {"[set]\nfree-memory=4294967296\n", 2, "free-memory"},
        {"[channels]\nsources= ; \n", 2, "no channel source is given"},
        {"[channels]\nsources=a.ts#0\n", 2, "service id of \"a.ts#0\""},
        {"[parental-scheme films]\n", 1, "the scheme has no ratings"},
        {"\n[parental-scheme dvb-si]\nratings=1\n", 2, "the scheme dvb-si is built in"},
        {"[parental-scheme films]\nthreshold=X\nratings=G;PG\n", 2, "\"X\" is not one of the ratings"},
        {"[parental-scheme films]\nratings=G;;PG\n", 2, "a rating has no name"},
        {"[parental-scheme films]\nratings=G;PG;G\n", 2, "\"G\" is given twice"},
        {"[parental-scheme films]\nratings=G;PG\nicons=a;b;c\n", 3, "icons: 3 for 2 ratings"},
        {"[parental-scheme films]\nratings=G\ncolour=red\n", 3, "unknown key \"colour\""},
        {"[parental-scheme a]\nratings=G\n[parental-scheme  a]\nratings=G\n", 3, "given twice"},
        {"[parental-scheme ]\nratings=G\n", 1, "unknown group"},
        {"[drm a]\nresult=-1\n", 2, "result"},
        {"[drm a]\nanswer=1\n", 2, "unknown key \"answer\""},
        {"[drm a]\n[drm  a]\n", 2, "given twice"},
        {"[set]\nkeys=red;pink\n", 2, "\"pink\" is not a group of keys"},
        {"[test]\napplications=apps/\n", 2, "\"apps/\" is not an absolute URL"},
        {"[set]\ninstant-zap=maybe\n", 2, "\"maybe\" is neither true nor false"},
        {"[set]\ntuners=4\n", 2, "tuners"},
        {"[set]\nzap-delay=60001\n", 2, "zap-delay"},
        {"[set]\ncapabilities=missing.xml\n", 2, "missing.xml"},
    };
    for (const auto& fault : faults) {
        const auto error = load(fault.contents);
        ASSERT_TRUE(error) << fault.contents;
        EXPECT_EQ(error->line, fault.line) << fault.contents;
        EXPECT_NE(error->reason.find(fault.reason), std::string::npos) << error->reason;
        EXPECT_EQ(error->message(), m_file + ":" + std::to_string(fault.line) + ": " + error->reason);
        EXPECT_EQ(m_configuration.country, Configuration().country);
    }
    const auto error = Configuration::load(m_file + ".missing", m_configuration);
    ASSERT_TRUE(error);
    EXPECT_EQ(error->line, 0U);
    EXPECT_NE(error->reason, "");
}

TEST_F(ConfigurationTest, ChecksTheDocumentOfTheCapabilities) {
    const std::string document = m_file + ".xml";
    const std::string setting = "[set]\ncapabilities=" + document.substr(document.rfind('/') + 1) + "\n";
    std::ofstream(document) << "<profilelist/>";
    EXPECT_FALSE(load(setting));
    EXPECT_EQ(m_configuration.capabilitiesFile, document); // in the folder of the file
    std::ofstream(document) << "<profilelist><open></profilelist>";
    const auto error = load(setting);
    ASSERT_TRUE(error);
    EXPECT_EQ(error->line, 2U);
    EXPECT_NE(error->reason.find(document), std::string::npos) << error->reason;
    std::remove(document.c_str());
}

// A device would be read without end, a pipe would block.
TEST_F(ConfigurationTest, ReadsRegularFilesOfABoundedSizeOnly) {
    const std::string fifo = m_file + ".fifo";
    ASSERT_EQ(mkfifo(fifo.c_str(), 0600), 0);
    for (const std::string& file : {std::string("/dev/zero"), fifo, std::string("/")}) {
        const auto error = Configuration::load(file, m_configuration);
        ASSERT_TRUE(error) << file;
        EXPECT_EQ(error->message(), file + ": Not a regular file");
        const auto inSetting = load("[set]\ncapabilities=" + file + "\n");
        ASSERT_TRUE(inSetting) << file;
        EXPECT_EQ(inSetting->message(), m_file + ":2: capabilities: " + file + ": Not a regular file");
    }
    unlink(fifo.c_str());

    const std::string document = m_file + ".xml";
    std::ofstream(document) << "<profilelist>" << std::string(1 << 20, ' ') << "</profilelist>";
    const auto error = load("[set]\ncapabilities=" + document + "\n");
    unlink(document.c_str());
    ASSERT_TRUE(error);
    EXPECT_EQ(error->reason, "capabilities: " + document + ": Larger than 1048576 bytes");
    const auto tooLarge = load("[viewer]\ncountry=FRA\n" + std::string(1 << 20, '#'));
    ASSERT_TRUE(tooLarge);
    EXPECT_EQ(tooLarge->message(), m_file + ": Larger than 1048576 bytes");
    EXPECT_EQ(m_configuration.country, "DEU");
}

TEST_F(ConfigurationTest, ReadsAFileWhateverItsDescriptorAndTheErrorBefore) {
    ASSERT_FALSE(load("[viewer]\ncountry=DEU\n"));
    const int standardInput = dup(STDIN_FILENO);
    close(STDIN_FILENO);
    std::string error;
    auto opened = RegularFile::open(m_file, error); // takes the lowest free number, which is 0
    ASSERT_TRUE(opened) << error;
    char contents[64];
    errno = EINTR;
    EXPECT_EQ(opened->read(contents, sizeof(contents), 0), opened->size());
    opened.reset();
    dup2(standardInput, STDIN_FILENO);
    close(standardInput);
}

TEST_F(ConfigurationTest, FindsTheLineOfASyntaxErrorInALargeFile) {
    std::string contents = "[viewer]\n";
    for (int line = 0; line < 50000; ++line) {
        contents += "# note\n";
    }
    const auto error = load(contents + "nonsense\n" + contents);
    ASSERT_TRUE(error);
    EXPECT_EQ(error->line, 50002U);
}

TEST_F(ConfigurationTest, HasTheDefaultsOfTheTableWithoutAFile) {
    const Configuration defaults;
    ASSERT_EQ(defaults.sources.size(), 1U);
    EXPECT_EQ(defaults.sources[0].path, "");
    EXPECT_EQ(defaults.programmeSeconds, 300U);
    EXPECT_EQ(defaults.streamEventSeconds, 10U);
    EXPECT_EQ(defaults.country, "DEU");
    EXPECT_EQ(defaults.audioLanguage, "deu");
    EXPECT_EQ(defaults.subtitleLanguage, "deu");
    EXPECT_EQ(defaults.ratingThreshold, 16U);
    EXPECT_TRUE(defaults.ratingSchemes.empty());
    EXPECT_TRUE(defaults.drmSystems.empty());
    EXPECT_EQ(defaults.signalTimeout, 6U);
    EXPECT_EQ(defaults.freeMemory, 64U * 1024 * 1024);
    EXPECT_EQ(defaults.keys, 0x3FFU);
    EXPECT_EQ(defaults.keySet, 0x1FU);
    EXPECT_EQ(defaults.capabilitiesFile, "");
    EXPECT_EQ(defaults.extraSdVideoDecodes, 1U);
    EXPECT_EQ(defaults.extraHdVideoDecodes, 0U);
    EXPECT_EQ(defaults.applicationsUrl, "");
    EXPECT_EQ(defaults.tuners, 1U);
    EXPECT_TRUE(defaults.instantZap);
    EXPECT_EQ(defaults.zapDelay, 0U);
}

TEST_F(ConfigurationTest, TakesTheFolderOfTheApplicationsFromTheEnvironmentToo) {
    ASSERT_FALSE(load("[test]\napplications=http://a.example/apps\n"));
    EXPECT_EQ(m_configuration.applicationsUrl, "http://a.example/apps/"); // paths are appended
    setenv("TELIX_APPLICATIONS", "file:///apps/", 1);
    EXPECT_EQ(Configuration::loadOrDefault().applicationsUrl, "file:///apps/");
    setenv("TELIX_APPLICATIONS", "apps", 1);
    testing::internal::CaptureStderr();
    EXPECT_EQ(Configuration::loadOrDefault().applicationsUrl, "http://127.0.0.1/apps/"); // that of the file
    EXPECT_EQ(testing::internal::GetCapturedStderr().substr(0, 29), "libtelix: TELIX_APPLICATIONS:");
    unsetenv("TELIX_APPLICATIONS");
}

TEST_F(ConfigurationTest, ReadsEverySettingOfTheTableFromItsSection) {
    std::set<std::string> read;
    for (const Setting& setting : settings()) {
        const std::string value = setting.defaultValue ? setting.defaultValue : "a;b";
        std::string contents = std::string("[") + setting.section + "]\n" + setting.key + "=" + value + "\n";
        if (setting.section == std::string(kSchemeSection) && setting.defaultValue) {
            contents += "ratings=a;b\n";
        }
        const auto error = load(contents);
        EXPECT_FALSE(error) << error->message();
        EXPECT_TRUE(read.insert(std::string(setting.section) + "/" + setting.key).second) << setting.key;
    }
}

// A row of a Markdown table; the section is named in its first row only.
std::string settingRow(const Setting& setting, bool isFirst) {
    const std::string value = setting.defaultValue ? setting.defaultValue : "";
    const std::string defaultCell = !setting.defaultValue ? "required"
                                    : value.empty()       ? "empty"
                                                          : "`" + value + "`";
    return std::string("| ") + (isFirst ? std::string("`[") + setting.section + "]` " : "") + "| `" +
           setting.key + "` | " + setting.reader.accepts + " | " + defaultCell + " | " + setting.meaning +
           " |\n";
}

TEST_F(ConfigurationTest, IsDocumentedAsTheTableStatesIt) {
    const char* folder = g_getenv("TELIX_DOCS");
    ASSERT_NE(folder, nullptr);
    std::ifstream file(std::string(folder) + "/television.md");
    const std::string document((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
    std::string table = "| Group | Key | Values | Default | Meaning |\n|---|---|---|---|---|\n";
    std::string section;
    for (const Setting& setting : settings()) {
        table += settingRow(setting, setting.section != section);
        section = setting.section;
    }
    EXPECT_THAT(document, testing::HasSubstr("\n" + table + "\n"));
    for (const KeyGroup& group : keyGroups()) {
        EXPECT_THAT(document, testing::HasSubstr(std::string("`") + group.name + "`"));
    }
}

} // namespace
