// Random attributes, streams, calls, messages and seconds, in random order: what must hold of the play states
// whatever a page and a set do. A failure names its seed and step.
#include <algorithm>
#include <atomic>
#include <cmath>
#include <random>
#include <set>

#include "src/avcontrol/AVControl.h"
#include "tests/unit/avcontrol/AVControlTest.h"

namespace avcontrol {
namespace {

constexpr int kSteps = 700;
constexpr size_t kMaxObjects = 3;

class AVControlRandom : public AVControlTest, public ::testing::WithParamInterface<unsigned> {
protected:
    AVControlRandom() {
        platform.TELIX_JS_AV_GetPlayInfo = [this](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO** out) {
            *out = &m_report;
            return m_reportResult.load();
        };
        platform.TELIX_JS_AV_Play = [this](TELIX_JS_AV_HANDLE player, const char* url, uint32_t, int32_t,
                                           int32_t, int32_t, uint32_t, uint16_t) {
            EXPECT_STRNE(url, "");
            expectLiving(player);
            return m_refusing.load();
        };
        platform.TELIX_JS_AV_SetVolume = [](TELIX_JS_AV_HANDLE, uint32_t volume) {
            EXPECT_LE(volume, 100u);
            return 0;
        };
        const auto plain = [this](TELIX_JS_AV_HANDLE player) {
            expectLiving(player);
            return m_refusing.load();
        };
        platform.TELIX_JS_AV_Stop = plain;
        platform.TELIX_JS_AV_Pause = plain;
        platform.TELIX_JS_AV_Resume = plain;
    }

    // One element of the page, and what was seen of it last.
    struct Media {
        EmbeddedObject object;
        uint32_t player;
        std::string id;
        int state;
        bool mayShowNextClip; // a playlist's clip change that finds nothing to play stays where it is
        BrowserStream* stream;
        bool streamEnded;
    };

    template <class Number>
    Number upTo(Number last) {
        return std::uniform_int_distribution<Number>(0, last)(m_random);
    }
    bool sometimes() { return upTo(3) == 0; }
    template <class Item>
    Item oneOf(const std::vector<Item>& items) {
        return items[upTo(items.size() - 1)];
    }

    std::string someUrl() {
        return oneOf<std::string>({kClip, "http://media.example/list.asx", "mms://media.example/stream",
                                   "film.mp4", "http://media.example/a.wav",
                                   "http://media.example/b.ism/Manifest", "", "rtsp://media.example/x",
                                   "/root.mp4"});
    }

    void embed() {
        const std::string id = "element" + std::to_string(nextPlayer);
        Attributes attributes{{"id", id}};
        for (const char* name : {"data", "src", "url"}) {
            if (sometimes()) {
                attributes.emplace_back(name, someUrl());
            }
        }
        for (const char* name :
             {"buffering", "downloadable", "oneshot_url", "bufferingLowerLimit", "bufferingUpperLimit",
              "playCount", "src1", "width", "autoStart", "nonsense"}) {
            if (upTo(6) == 0) {
                attributes.emplace_back(name, oneOf<std::string>({"true", "false", "0", "7", "-1", "x", ""}));
            }
        }
        std::shuffle(attributes.begin(), attributes.end(), m_random);
        const std::string type =
            oneOf<std::string>({"video/mp4", "audio/mpeg", "audio/mpegurl", "video/x-ms-ism"});
        m_living.insert(nextPlayer);
        const uint32_t player = nextPlayer;
        Media media{element(type, attributes), player, id, Stopped, false, nullptr, false};
        ASSERT_EQ(media.object.error(), NPERR_NO_ERROR);
        media.object.set("onPlayStateChange", m_listener);
        media.object.set("onPlayPositionChanged", m_listener);
        m_media.push_back(media);
    }

    void destroyOne(size_t index) {
        m_media[index].object.destroy();
        browser.pump();
        m_living.erase(m_media[index].player);
        m_media.erase(m_media.begin() + static_cast<ptrdiff_t>(index));
    }

    void streamSomething(Media& media) {
        if (!media.stream) {
            media.stream =
                &media.object.newStream(oneOf<std::string>({"http://media.example/list.asx", kClip}),
                                        oneOf<std::string>({"", "Content-Type: audio/mpeg\r\n"}));
        } else if (!media.streamEnded && sometimes()) {
            media.stream->destroy(oneOf<NPReason>({NPRES_DONE, NPRES_NETWORK_ERR}));
            media.streamEnded = true;
        } else if (!media.streamEnded && !media.stream->wasDestroyedByPlugin()) {
            std::string chunk =
                oneOf<std::string>({asx({entry("http://media.example/1"),
                                         entry("http://media.example/2", "<duration value=\"3\"/>")}),
                                    "<ASX><Repeat count=\"2\">" + entry("first"),
                                    entry("second") + "</Repeat>", "<asx>", "bytes", std::string(3, '\0'),
                                    "<Entry><starttime value=\"5\"/><Ref HREF=\"late\"/></Entry></ASX>"});
            chunk.resize(chunk.size() - upTo(std::min<size_t>(chunk.size(), 4) - 1));
            media.stream->write(chunk);
        }
    }

    void ask(Media& media) {
        const EmbeddedObject& object = media.object;
        switch (upTo(13)) {
        case 0:
            object.call("play", oneOf<double>({0, 1, 1, 1, 2, -4, 0.5}));
            break;
        case 1:
            expectStops(media);
            break;
        case 2:
            object.call("seek", upTo(100000));
            break;
        case 3:
            object.call(oneOf<std::string>({"next", "previous"}));
            media.mayShowNextClip = true;
            break;
        case 4:
            object.set("data", someUrl());
            break;
        case 5:
            object.call("queue", sometimes() ? Value(nullptr) : Value(someUrl()));
            break;
        case 6:
            object.set("currentTrackIndex", upTo(4));
            media.mayShowNextClip = true;
            break;
        case 7:
            object.call("setVolume", upTo(150) - 20);
            break;
        case 8:
            object.call("setFullScreen", sometimes());
            break;
        case 9:
            object.setRectangle(upTo(50), upTo(50), upTo(1500), upTo(900));
            object.setWindow(0, 0, 0, 0);
            break;
        case 10:
            object.urlNotify(kClip, oneOf<NPReason>({NPRES_DONE, NPRES_NETWORK_ERR, NPRES_USER_BREAK}));
            break;
        case 11:
        case 12:
            object.call("play", 1);
            break;
        default:
            streamSomething(media);
            media.mayShowNextClip = true;
            break;
        }
    }

    // A message leads its object to the state of its row, unless it repeats the one before.
    void sendSomething() {
        const auto message = oneOf<TELIX_AV_CB_MSG>(
            {TELIX_AV_CB_MSG_PLAYSTART, TELIX_AV_CB_MSG_PLAYSTART, TELIX_AV_CB_MSG_PLAYEND,
             TELIX_AV_CB_MSG_PLAYEND, TELIX_AV_CB_MSG_ERR_PLAYING, TELIX_AV_CB_MSG_ERR_NOT_FOUND,
             TELIX_AV_CB_MSG_ERR_NET_BUSY, 0, 5, TELIX_AV_CB_MSG_ERR_WMDRM_LIC_EXPIRED});
        browser.pump(); // so that what is seen next is this message's doing
        const uint32_t last = g_lastReceivedMessage;
        AVControl* const target = g_lastPlayedInstance;
        const int before = target ? int{target->getPlayState()} : int{Stopped};
        send(message);
        if (!target) {
            EXPECT_EQ(g_lastReceivedMessage, last);
            blocksLeftBehind(++m_unheard);
            return;
        }
        const int after = target->getPlayState();
        if (message == last && message != TELIX_AV_CB_MSG_PLAYSTART) {
            EXPECT_EQ(after, before);
        } else if (message == TELIX_AV_CB_MSG_PLAYSTART) {
            EXPECT_EQ(after, Playing);
        } else if (message >= 0xF000 && message != TELIX_AV_CB_MSG_ERR_NET_BUSY) {
            EXPECT_EQ(after, Error);
            EXPECT_TRUE(target->getError() == 2 || target->getError() == 5);
        } else if (message == TELIX_AV_CB_MSG_PLAYEND) {
            EXPECT_TRUE(after == Finished || after == Buffering || after == Playing || after == NextClip)
                << after;
        } else {
            EXPECT_EQ(after, before);
        }
        for (Media& media : m_media) {
            media.mayShowNextClip |= message == TELIX_AV_CB_MSG_PLAYEND;
        }
    }

    void expectStops(const Media& media) {
        browser.pump();
        const bool ownsPipeline = g_lastPlayedInstance == media.object.model();
        const int before = state(media.object);
        media.object.call("stop");
        EXPECT_EQ(state(media.object), ownsPipeline && !m_refusing ? Stopped : before);
    }

    void letTimePass() {
        m_report = info(oneOf<uint32_t>({0, 3, 4, 9, 10, 11, 30, 0xFFFFFFFF, 0x00FF0002, 0xFF000002}),
                        upTo(20000u), oneOf<uint32_t>({0, 60000}), upTo(60u), upTo(3u));
        m_reportResult = sometimes() ? 1 : 0;
        clock.second();
        for (Media& media : m_media) {
            media.mayShowNextClip = true; // a playlist's clip may run out
        }
    }

    void step() {
        const size_t choice = upTo<size_t>(9);
        if (m_media.empty() || (choice == 0 && m_media.size() < kMaxObjects)) {
            embed();
        } else if (choice == 1 && sometimes()) {
            destroyOne(upTo(m_media.size() - 1));
        } else if (choice <= 5) {
            ask(m_media[upTo(m_media.size() - 1)]);
        } else if (choice <= 7) {
            sendSomething();
        } else if (choice == 8) {
            letTimePass();
        } else {
            m_refusing = sometimes() ? 1 : 0;
            browser.pump();
        }
    }

    void checkInvariants() {
        bool pipelineIsLiving = g_lastPlayedInstance == nullptr;
        for (Media& media : m_media) {
            pipelineIsLiving |= g_lastPlayedInstance == media.object.model();
            const int now = state(media.object);
            EXPECT_TRUE((now >= Stopped && now <= Error) || (now == NextClip && media.mayShowNextClip))
                << now;
            EXPECT_NE(now, Connecting); // left again before anybody else is asked
            if (now != media.state && now != NextClip) {
                EXPECT_GT(changesOf(media.id), 0u) << media.state << " to " << now << " without an event";
            }
            media.state = now;
            const Value error = media.object.get("error").value;
            EXPECT_TRUE(error.isUndefined() || (error.integer() >= 0 && error.integer() <= 5)) << error;
            EXPECT_TRUE(now != Error || !error.isUndefined());
            EXPECT_TRUE(std::isfinite(media.object.get("speed").value.number()));
            EXPECT_EQ(media.object.get("playPosition").value.type(), NPVariantType_Double);
        }
        EXPECT_TRUE(pipelineIsLiving);
        expectEventsInTheirOrder();
        EXPECT_LE(clock.sleeping(), m_media.size() + 1); // one each, and one that is being cancelled
        m_seen = browser.events().size();
    }

    size_t changesOf(const std::string& id) const {
        const std::vector<DomEvent> all = browser.events();
        return static_cast<size_t>(std::count_if(
            all.begin() + static_cast<ptrdiff_t>(m_seen), all.end(),
            [&](const DomEvent& event) { return event.elementId == id && event.type == "PlayStateChange"; }));
    }

    // "Error", then "Buffering", then "PlayStateChange", which always comes.
    void expectEventsInTheirOrder() const {
        const std::vector<DomEvent> all = browser.events();
        for (size_t i = m_seen; i < all.size(); ++i) {
            if (all[i].type != "Error" && all[i].type != "Buffering") {
                continue;
            }
            ASSERT_LT(i + 1, all.size()) << all[i];
            EXPECT_EQ(all[i + 1].elementId, all[i].elementId);
            EXPECT_TRUE(all[i + 1].type == "PlayStateChange" ||
                        (all[i].type == "Error" && all[i + 1].type == "Buffering"))
                << all[i + 1] << " behind " << all[i];
        }
    }

    void expectLiving(uint32_t player) {
        EXPECT_EQ(m_living.count(player), 1u) << "a call for the player " << player << ", which has gone";
    }

    std::mt19937 m_random{GetParam()};
    std::vector<Media> m_media;
    std::set<uint32_t> m_living; // changed while no monitor polls
    size_t m_unheard = 0;        // messages while no object had played
    size_t m_seen = 0;
    TELIX_JS_AV_PLAY_INFO m_report{};
    std::atomic<int> m_reportResult{1};
    std::atomic<int> m_refusing{0};
    const ScriptFunction m_listener = browser.function("listener");
};

TEST_P(AVControlRandom, NothingThatAPageOrASetDoesBreaksThePlayStates) {
    for (int i = 0; i < kSteps && !HasFailure(); ++i) {
        SCOPED_TRACE("seed " + std::to_string(GetParam()) + ", step " + std::to_string(i));
        step();
        checkInvariants();
        log.clear();
    }
    while (!m_media.empty()) {
        destroyOne(0);
    }
    clock.await(0);
    EXPECT_EQ(g_lastPlayedInstance, nullptr);
    platform.reset(); // its functions are this test's
}

INSTANTIATE_TEST_SUITE_P(Seeds, AVControlRandom, ::testing::Values(1, 20, 300));

} // namespace
} // namespace avcontrol
