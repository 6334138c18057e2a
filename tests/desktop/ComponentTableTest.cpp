// Handles of components, and which components are active.
#include "desktop/platform/ComponentTable.h"

#include <gtest/gtest.h>

using namespace desktop;

namespace {

constexpr TELIX_JS_AVCOMPTYPE kVideo = TELIX_JS_AVCOMPTYPE_VIDEO;
constexpr TELIX_JS_AVCOMPTYPE kAudio = TELIX_JS_AVCOMPTYPE_AUDIO;
constexpr TELIX_JS_AVCOMPTYPE kSubtitle = TELIX_JS_AVCOMPTYPE_SUBTITLE;

using Handles = std::vector<TELIX_JS_AVCOMPHANDLE>;

struct Stream : ComponentTraits {
    explicit Stream(TELIX_JS_AVCOMPTYPE type, int number = 0, const std::string& language = "")
        : number(number) {
        this->type = type;
        this->language = language;
    }

    bool operator==(const Stream& other) const { return type == other.type && number == other.number; }

    int number;
};

class ComponentTableTest : public testing::Test {
protected:
    TELIX_JS_AVCOMPHANDLE add(const Stream& stream) {
        const TELIX_JS_AVCOMPHANDLE handle = m_table.intern(stream);
        m_selection.add(handle, m_table.share(handle));
        return handle;
    }

    ComponentTable<Stream> m_table;
    ComponentSelection m_selection;
};

TEST_F(ComponentTableTest, GivesEqualComponentsOneHandle) {
    const auto first = m_table.intern(Stream(kAudio, 1, "eng"));
    EXPECT_NE(first, 0U);
    EXPECT_NE(m_table.intern(Stream(kAudio, 2)), first);
    EXPECT_NE(m_table.intern(Stream(kVideo, 1)), first);
    EXPECT_EQ(m_table.intern(Stream(kAudio, 1)), first);
    EXPECT_EQ(m_table.at(first).language, "eng");
}

TEST_F(ComponentTableTest, FindsAComponentByHandleAndType) {
    const auto handle = m_table.intern(Stream(kAudio, 7));
    ASSERT_TRUE(m_table.find(handle, kAudio));
    EXPECT_EQ(m_table.find(handle, kAudio)->number, 7);
    EXPECT_FALSE(m_table.find(handle, kVideo));
    EXPECT_FALSE(m_table.find(0, kAudio));
    EXPECT_FALSE(m_table.find(handle + 1, kAudio));
}

TEST_F(ComponentTableTest, KeepsReferencesWhileItGrows) {
    const Stream& first = m_table.at(add(Stream(kAudio, 0)));
    for (int number = 1; number < 1000; ++number) {
        m_table.intern(Stream(kAudio, number));
    }
    EXPECT_EQ(&m_table.at(1), &first);
}

TEST_F(ComponentTableTest, ForgetsTheOldestOfThoseThatNoSelectionHas) {
    constexpr int kMax = ComponentTable<Stream>::kMaxComponents;
    const auto selected = add(Stream(kAudio, 0));
    const auto oldest = m_table.intern(Stream(kAudio, 1));
    const auto second = m_table.intern(Stream(kAudio, 2));
    for (int number = 3; number < kMax; ++number) {
        m_table.intern(Stream(kAudio, number));
    }
    EXPECT_TRUE(m_table.find(oldest, kAudio));
    const auto last = m_table.intern(Stream(kAudio, kMax));
    EXPECT_FALSE(m_table.find(oldest, kAudio));
    EXPECT_TRUE(m_table.find(selected, kAudio));
    EXPECT_TRUE(m_table.find(second, kAudio));
    EXPECT_TRUE(m_table.find(last, kAudio));
    EXPECT_GT(m_table.intern(Stream(kAudio, 1)), last); // a handle that was forgotten is not used again
    m_selection.clear();
    m_table.intern(Stream(kAudio, kMax + 1));
    EXPECT_FALSE(m_table.find(selected, kAudio));
}

TEST_F(ComponentTableTest, ActivatesTheFirstVideoTheViewersLanguageAndNoSubtitle) {
    const auto video = add(Stream(kVideo, 0));
    add(Stream(kVideo, 1));
    const auto german = add(Stream(kAudio, 0, "deu"));
    const auto english = add(Stream(kAudio, 1, "eng"));
    add(Stream(kAudio, 2, "eng"));
    const auto subtitle = add(Stream(kSubtitle, 0, "eng"));
    EXPECT_TRUE(m_selection.list(kVideo, true).empty());

    m_selection.selectDefaults("eng");
    EXPECT_EQ(m_selection.list(kVideo, true), Handles{video});
    EXPECT_EQ(m_selection.list(kAudio, true), Handles{english});
    EXPECT_EQ(m_selection.list(kSubtitle, false), Handles{subtitle});
    EXPECT_EQ(m_selection.active(kSubtitle), 0U);

    m_selection.selectDefaults("fra");
    EXPECT_EQ(m_selection.active(kAudio), german);
}

TEST_F(ComponentTableTest, PrefersSoundThatIsMadeForEverybody) {
    Stream description(kAudio, 0, "eng");
    description.isAudioDescription = true;
    Stream clear(kAudio, 1, "eng");
    clear.isForHearingImpaired = true;
    const auto first = add(description);
    add(clear);
    m_selection.selectDefaults("eng");
    EXPECT_EQ(m_selection.active(kAudio), first);
    const auto plain = add(Stream(kAudio, 2, "eng"));
    m_selection.selectDefaults("eng");
    EXPECT_EQ(m_selection.active(kAudio), plain);
}

TEST_F(ComponentTableTest, ReplacesTheActiveComponentOfAType) {
    const auto video = add(Stream(kVideo));
    const auto first = add(Stream(kAudio, 0));
    const auto second = add(Stream(kAudio, 1));
    m_selection.selectDefaults("");
    EXPECT_TRUE(m_selection.select(second, kAudio, true));
    EXPECT_EQ(m_selection.list(kAudio, true), Handles{second});
    EXPECT_TRUE(m_selection.select(first, kAudio, false)); // was not active
    EXPECT_EQ(m_selection.active(kAudio), second);
    EXPECT_TRUE(m_selection.select(second, kAudio, false));
    EXPECT_EQ(m_selection.active(kAudio), 0U);
    EXPECT_EQ(m_selection.active(kVideo), video);
}

TEST_F(ComponentTableTest, RefusesAComponentThatIsNotAvailable) {
    const auto video = add(Stream(kVideo));
    const auto elsewhere = m_table.intern(Stream(kVideo, 1));
    EXPECT_FALSE(m_selection.select(elsewhere, kVideo, true));
    EXPECT_FALSE(m_selection.select(video, kAudio, true));
    EXPECT_FALSE(m_selection.select(video, 99, true));
    EXPECT_FALSE(m_selection.select(0, kVideo, true));
    EXPECT_TRUE(m_selection.list(99, true).empty());
    m_selection.clear();
    EXPECT_FALSE(m_selection.select(video, kVideo, true));
    EXPECT_TRUE(m_selection.available().empty());
}

} // namespace
