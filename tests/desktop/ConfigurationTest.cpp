// The configuration file: what it sets, and how it says what is wrong with it.
#include "desktop/platform/Configuration.h"

#include <fstream>
#include <gtest/gtest.h>
#include <unistd.h>

using namespace desktop;

namespace {

class ConfigurationTest : public testing::Test {
protected:
    std::optional<Configuration::Error> load(const std::string& text) {
        std::ofstream(m_file) << text;
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
              m_file.substr(0, m_file.rfind('/')) + "/music"); // beside the file
    EXPECT_EQ(m_configuration.sources[2].service, 7);
}

TEST_F(ConfigurationTest, NamesFileLineAndReasonOfEveryFault) {
    const struct {
        const char* text;
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
        {"[channels]\nsources=a.ts#0\n", 2, "service of \"a.ts#0\""},
    };
    for (const auto& fault : faults) {
        const auto error = load(fault.text);
        ASSERT_TRUE(error) << fault.text;
        EXPECT_EQ(error->line, fault.line) << fault.text;
        EXPECT_NE(error->reason.find(fault.reason), std::string::npos) << error->reason;
        EXPECT_EQ(error->text(), m_file + ":" + std::to_string(fault.line) + ": " + error->reason);
        EXPECT_EQ(m_configuration.country, Configuration().country);
    }
    const auto error = Configuration::load(m_file + ".missing", m_configuration);
    ASSERT_TRUE(error);
    EXPECT_EQ(error->line, 0U);
    EXPECT_NE(error->reason, "");
}

} // namespace
