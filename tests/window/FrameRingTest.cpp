// The frame ring: what the writer publishes, the reader shows; neither waits for nor trusts the other.
#include <fcntl.h>
#include <poll.h>
#include <sys/eventfd.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <csignal>
#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "desktop/window/frames/FrameReader.h"
#include "desktop/window/frames/FrameWriter.h"

namespace desktop {
namespace {

constexpr uint32_t kWidth = 16;
constexpr uint32_t kHeight = 9;

// A frame of one colour with its pixels.
struct TestFrame {
    explicit TestFrame(uint8_t value, uint64_t serial, uint32_t width = kWidth, uint32_t height = kHeight,
                       uint32_t padding = 0)
        : pixels(size_t{height} * (width * 4 + padding), value) {
        frame.pixels = pixels.data();
        frame.width = width;
        frame.height = height;
        frame.stride = width * 4 + padding;
        frame.aspectWidth = 16;
        frame.aspectHeight = 9;
        frame.presenter = 5;
        frame.serial = serial;
        frame.areaX = -3;
        frame.areaY = 4;
        frame.areaWidth = 500;
        frame.areaHeight = 600;
        frame.visible = 1;
    }

    std::vector<uint8_t> pixels;
    telix_desktop_frame frame{};
};

telix_desktop_frame hiddenFrame(uint64_t serial) {
    telix_desktop_frame frame{};
    frame.serial = serial;
    return frame;
}

// The value of all bytes of a frame's pixels; -1 if they differ.
int colourOf(const telix_desktop_frame& frame) {
    const int first = frame.pixels[0];
    for (uint32_t line = 0; line < frame.height; ++line) {
        for (uint32_t byte = 0; byte < frame.width * 4; ++byte) {
            if (frame.pixels[size_t{line} * frame.stride + byte] != first) {
                return -1;
            }
        }
    }
    return first;
}

bool isReadable(int descriptor) {
    pollfd watched{descriptor, POLLIN, 0};
    return poll(&watched, 1, 0) == 1;
}

class FrameRingTest : public testing::Test {
protected:
    void connect(const FrameWriter& writer) {
        std::string error;
        m_reader = FrameReader::open(dup(writer.memoryDescriptor()), dup(writer.wakeupDescriptor()), error);
        ASSERT_TRUE(m_reader) << error;
    }

    void SetUp() override {
        m_writer = FrameWriter::create(size_t{kWidth} * kHeight * 4);
        ASSERT_TRUE(m_writer);
        connect(*m_writer);
    }

    bool publish(uint8_t value, uint64_t serial) { return m_writer->publish(TestFrame(value, serial).frame); }
    const telix_desktop_frame& shown() const { return m_reader->frame(); }

    std::unique_ptr<FrameWriter> m_writer;
    std::unique_ptr<FrameReader> m_reader;
};

// ---- Order

TEST_F(FrameRingTest, AnEmptyRingShowsNothing) {
    EXPECT_FALSE(m_reader->refresh());
    EXPECT_FALSE(shown().visible);
    EXPECT_FALSE(shown().pixels);
}

TEST_F(FrameRingTest, AFrameArrivesWithAllThatIsSaidOfIt) {
    TestFrame sent(7, 41);
    sent.frame.fullScreen = 1;
    ASSERT_TRUE(m_writer->publish(sent.frame));
    ASSERT_TRUE(m_reader->refresh());
    EXPECT_EQ(colourOf(shown()), 7);
    EXPECT_EQ(shown().width, kWidth);
    EXPECT_EQ(shown().height, kHeight);
    EXPECT_EQ(shown().stride, kWidth * 4);
    EXPECT_EQ(shown().aspectWidth, 16U);
    EXPECT_EQ(shown().aspectHeight, 9U);
    EXPECT_EQ(shown().presenter, 5U);
    EXPECT_EQ(shown().serial, 41U);
    EXPECT_EQ(shown().areaX, -3);
    EXPECT_EQ(shown().areaY, 4);
    EXPECT_EQ(shown().areaWidth, 500U);
    EXPECT_EQ(shown().areaHeight, 600U);
    EXPECT_EQ(shown().fullScreen, 1);
    EXPECT_EQ(shown().visible, 1);
}

TEST_F(FrameRingTest, FramesArriveInTheirOrder) {
    for (uint64_t serial = 1; serial <= 20; ++serial) {
        ASSERT_TRUE(publish(static_cast<uint8_t>(serial), serial));
        ASSERT_TRUE(m_reader->refresh());
        EXPECT_EQ(shown().serial, serial);
        EXPECT_EQ(colourOf(shown()), static_cast<int>(serial));
        EXPECT_FALSE(m_reader->refresh()) << "nothing new";
    }
}

TEST_F(FrameRingTest, ASlowReaderGetsTheNewestFrame) {
    for (uint64_t serial = 1; serial <= 20; ++serial) {
        ASSERT_TRUE(publish(static_cast<uint8_t>(serial), serial));
    }
    ASSERT_TRUE(m_reader->refresh());
    EXPECT_EQ(shown().serial, 20U);
    EXPECT_EQ(colourOf(shown()), 20);
    EXPECT_FALSE(m_reader->refresh());
}

TEST_F(FrameRingTest, AFrameStaysUntilTheReaderTakesTheNextOne) {
    ASSERT_TRUE(publish(1, 1));
    ASSERT_TRUE(m_reader->refresh());
    for (uint64_t serial = 2; serial <= 20; ++serial) {
        ASSERT_TRUE(publish(static_cast<uint8_t>(serial), serial));
        EXPECT_EQ(colourOf(shown()), 1);
    }
}

TEST_F(FrameRingTest, AChangeOfPlaceKeepsThePixels) {
    TestFrame sent(5, 1);
    ASSERT_TRUE(m_writer->publish(sent.frame));
    ASSERT_TRUE(m_reader->refresh());
    const uint8_t* const before = shown().pixels;
    for (int32_t place = 1; place <= 10; ++place) {
        sent.frame.areaX = place;
        ASSERT_TRUE(m_writer->publish(sent.frame));
        ASSERT_TRUE(m_reader->refresh());
        EXPECT_EQ(shown().areaX, place);
        EXPECT_EQ(shown().pixels, before) << "the pixels are copied again";
    }
}

TEST_F(FrameRingTest, ChangesThatNobodyTakesOverwriteNoPixelsThatCanBeShown) {
    ASSERT_TRUE(publish(1, 1));
    ASSERT_TRUE(m_reader->refresh());
    for (uint64_t serial = 2; serial <= 10; ++serial) {
        TestFrame next(static_cast<uint8_t>(serial), serial);
        for (int32_t place = 0; place < 5; ++place) {
            next.frame.areaX = place;
            ASSERT_TRUE(m_writer->publish(next.frame));
        }
        EXPECT_EQ(colourOf(shown()), static_cast<int>(serial) - 1);
        ASSERT_TRUE(m_reader->refresh());
        EXPECT_EQ(colourOf(shown()), static_cast<int>(serial));
        EXPECT_EQ(shown().areaX, 4);
    }
}

TEST_F(FrameRingTest, AHiddenFrameIsThereAgainWithItsPixels) {
    const TestFrame sent(5, 1);
    ASSERT_TRUE(m_writer->publish(sent.frame));
    ASSERT_TRUE(m_writer->publish(hiddenFrame(1)));
    ASSERT_TRUE(m_reader->refresh());
    EXPECT_FALSE(shown().visible);
    EXPECT_FALSE(shown().pixels);
    ASSERT_TRUE(m_writer->publish(sent.frame));
    ASSERT_TRUE(m_reader->refresh());
    EXPECT_EQ(colourOf(shown()), 5);
}

TEST_F(FrameRingTest, APresentationThatStartsHiddenShowsItsFirstFrame) {
    ASSERT_TRUE(m_writer->publish(hiddenFrame(1)));
    ASSERT_TRUE(m_writer->publish(TestFrame(5, 1).frame));
    ASSERT_TRUE(m_reader->refresh());
    EXPECT_EQ(colourOf(shown()), 5);
}

TEST_F(FrameRingTest, ThePaddingOfLinesIsLeftOut) {
    TestFrame sent(9, 1, kWidth, kHeight, 12);
    for (uint32_t line = 0; line < kHeight; ++line) {
        std::memset(&sent.pixels[size_t{line} * sent.frame.stride + kWidth * 4], 0xee, 12);
    }
    ASSERT_TRUE(m_writer->publish(sent.frame));
    ASSERT_TRUE(m_reader->refresh());
    EXPECT_EQ(shown().stride, kWidth * 4);
    EXPECT_EQ(colourOf(shown()), 9);
}

// ---- Wake-up

TEST_F(FrameRingTest, TheReaderIsWokenByEachChangeAndByNothingElse) {
    EXPECT_FALSE(isReadable(m_reader->pollDescriptor()));
    for (uint64_t serial = 1; serial <= 3; ++serial) {
        ASSERT_TRUE(publish(1, serial));
        ASSERT_TRUE(publish(2, serial));
        EXPECT_TRUE(isReadable(m_reader->pollDescriptor()));
        m_reader->refresh();
        EXPECT_FALSE(isReadable(m_reader->pollDescriptor()));
    }
}

TEST_F(FrameRingTest, AWriterThatIsConnectedLateHasWokenTheReader) {
    ASSERT_TRUE(publish(1, 1));
    connect(*m_writer);
    EXPECT_TRUE(isReadable(m_reader->pollDescriptor()));
}

TEST_F(FrameRingTest, ACounterThatIsFullDoesNotBlockTheWriter) {
    const uint64_t nearlyFull = UINT64_MAX - 1;
    ASSERT_EQ(write(m_writer->wakeupDescriptor(), &nearlyFull, sizeof nearlyFull),
              ssize_t{sizeof nearlyFull});
    EXPECT_TRUE(publish(3, 1));
    ASSERT_TRUE(m_reader->refresh());
    EXPECT_EQ(colourOf(shown()), 3);
}

// ---- Sizes

TEST_F(FrameRingTest, AFrameThatIsTooLargeIsRefusedAndChangesNothing) {
    ASSERT_TRUE(publish(1, 1));
    EXPECT_FALSE(m_writer->publish(TestFrame(2, 2, 64, 64).frame));
    ASSERT_TRUE(m_reader->refresh());
    EXPECT_EQ(shown().serial, 1U);
    EXPECT_EQ(colourOf(shown()), 1);
}

TEST_F(FrameRingTest, LargerMemoryTakesOverWhileTheReaderHoldsTheOldFrame) {
    ASSERT_TRUE(publish(1, 1));
    ASSERT_TRUE(m_reader->refresh());
    const TestFrame large(2, 2, 640, 360);
    auto next = FrameWriter::create(FrameWriter::sizeOf(large.frame));
    ASSERT_TRUE(next);
    ASSERT_TRUE(next->publish(large.frame));
    m_writer = std::move(next);
    EXPECT_EQ(colourOf(shown()), 1);
    connect(*m_writer);
    ASSERT_TRUE(m_reader->refresh());
    EXPECT_EQ(colourOf(shown()), 2);
    EXPECT_EQ(shown().width, 640U);
}

TEST_F(FrameRingTest, SizesThatNoRingTakesAreNone) {
    TestFrame frame(1, 1);
    EXPECT_EQ(FrameWriter::sizeOf(frame.frame), size_t{kWidth} * kHeight * 4);
    EXPECT_EQ(FrameWriter::sizeOf(hiddenFrame(1)), 0U);
    for (const auto& [width, height] :
         {std::pair{1U << 20, 1U}, {1U, 1U << 20}, {8192U, 8192U}, {0xffffffffU, 0xffffffffU}}) {
        frame.frame.width = width;
        frame.frame.height = height;
        EXPECT_EQ(FrameWriter::sizeOf(frame.frame), 0U) << width << "x" << height;
    }
    EXPECT_FALSE(FrameWriter::create(kMaximumSlotSize + 1));
    EXPECT_FALSE(FrameWriter::create(0));
}

// ---- The end of a side

TEST_F(FrameRingTest, TheFrameOfAnEndedWriterStays) {
    ASSERT_TRUE(publish(1, 1));
    m_writer.reset();
    ASSERT_TRUE(m_reader->refresh());
    EXPECT_EQ(colourOf(shown()), 1);
    EXPECT_FALSE(m_reader->refresh());
    EXPECT_EQ(colourOf(shown()), 1);
}

// A process that publishes frames, each of one colour, until it is killed.
class WritingProcess {
public:
    explicit WritingProcess(FrameWriter& writer) : m_process(fork()) {
        if (m_process == 0) {
            prctl(PR_SET_PDEATHSIG, SIGKILL);
            for (uint64_t serial = 1;; ++serial) {
                writer.publish(TestFrame(static_cast<uint8_t>(serial), serial).frame);
            }
        }
    }
    ~WritingProcess() {
        if (m_process > 0) {
            kill(m_process, SIGKILL);
            waitpid(m_process, nullptr, 0);
        }
    }

private:
    pid_t m_process;
};

TEST_F(FrameRingTest, AWriterThatIsKilledWhileItWritesHarmsNobody) {
    {
        const WritingProcess writing(*m_writer);
        // Until it is at work; its end comes at any point of it.
        while (shown().serial < 1000) {
            pollfd watched{m_reader->pollDescriptor(), POLLIN, 0};
            ASSERT_EQ(poll(&watched, 1, 60000), 1) << "nothing is written";
            m_reader->refresh();
            ASSERT_EQ(colourOf(shown()), static_cast<uint8_t>(shown().serial));
        }
    }
    m_reader->refresh();
    EXPECT_EQ(colourOf(shown()), static_cast<uint8_t>(shown().serial));
    EXPECT_FALSE(m_reader->refresh());
}

TEST_F(FrameRingTest, AWriterWithoutReaderGoesOn) {
    m_reader.reset();
    for (uint64_t serial = 1; serial <= 20; ++serial) {
        EXPECT_TRUE(publish(1, serial));
    }
}

// ---- Two threads on one mapping, which a sanitizer can follow

TEST(FrameRingThreadsTest, NoFrameChangesWhileItIsShown) {
    int descriptor = -1;
    const auto memory = FrameRingMemory::create(size_t{64} * 36 * 4, descriptor);
    ASSERT_TRUE(memory);
    close(descriptor);
    std::atomic<bool> isEnough{false};
    std::thread writing([&] {
        FrameWriter writer(memory, -1);
        for (uint64_t serial = 1; !isEnough; ++serial) {
            TestFrame frame(static_cast<uint8_t>(serial), serial, 64, 36);
            writer.publish(frame.frame);
            if (serial % 3 == 0) {
                frame.frame.areaX = 9;
                writer.publish(frame.frame);
            }
        }
    });
    FrameReader reader(memory);
    uint64_t last = 0;
    bool isSound = true;
    for (int taken = 0; taken < 2000 && isSound;) {
        if (reader.refresh()) {
            taken++;
            isSound = reader.frame().visible && reader.frame().serial >= last &&
                      colourOf(reader.frame()) == static_cast<uint8_t>(reader.frame().serial);
            last = reader.frame().serial;
        } else {
            std::this_thread::yield();
        }
    }
    isEnough = true;
    writing.join();
    EXPECT_TRUE(isSound) << "after frame " << last;
}

// ---- A hostile writer

class HostileRingTest : public FrameRingTest {
protected:
    // Publishes a frame, changes its description as only a hostile writer would, and takes it.
    void takeWith(const std::function<void(FrameDescription&)>& damage) {
        const char* reason = nullptr;
        const auto memory = FrameRingMemory::map(m_writer->memoryDescriptor(), reason);
        ASSERT_TRUE(memory) << reason;
        ASSERT_TRUE(publish(1, ++m_serial));
        const uint32_t newest = memory->header().newest & ~FrameRingHeader::kNew;
        ASSERT_LT(newest, kSlotCount);
        damage(memory->header().descriptions[newest]);
        ASSERT_TRUE(m_reader->refresh());
    }

    uint64_t m_serial = 0;
};

TEST_F(HostileRingTest, AWrongDescriptionShowsNothing) {
    const std::pair<const char*, std::function<void(FrameDescription&)>> damages[] = {
        {"slot", [](FrameDescription& it) { it.slot = kSlotCount; }},
        {"largest slot", [](FrameDescription& it) { it.slot = UINT32_MAX; }},
        {"no width", [](FrameDescription& it) { it.width = 0; }},
        {"no height", [](FrameDescription& it) { it.height = 0; }},
        {"width", [](FrameDescription& it) { it.width = it.stride / 4 + 1; }},
        {"width whose bytes overflow", [](FrameDescription& it) { it.width = (1U << 30) + 1; }},
        {"height", [](FrameDescription& it) { it.height = 4096; }},
        {"height times stride overflows",
         [](FrameDescription& it) { it.height = 8192, it.stride = 1U << 20; }},
        {"stride", [](FrameDescription& it) { it.stride = 1U << 31; }},
        {"short stride", [](FrameDescription& it) { it.stride = 4; }},
        {"odd stride", [](FrameDescription& it) { it.stride += 1; }},
        {"far left", [](FrameDescription& it) { it.areaX = INT32_MIN; }},
        {"far below", [](FrameDescription& it) { it.areaY = INT32_MAX; }},
        {"wide", [](FrameDescription& it) { it.areaWidth = UINT32_MAX; }},
        {"tall", [](FrameDescription& it) { it.areaHeight = UINT32_MAX; }},
    };
    for (const auto& [name, damage] : damages) {
        SCOPED_TRACE(name);
        takeWith(damage);
        EXPECT_FALSE(shown().visible);
        EXPECT_FALSE(shown().pixels);
        takeWith([](FrameDescription&) {});
        EXPECT_EQ(colourOf(shown()), 1) << "the ring does not recover";
    }
}

TEST_F(HostileRingTest, FlagsAreOnlyYesOrNo) {
    takeWith([](FrameDescription& it) { it.visible = 0xff00, it.fullScreen = 0xff00; });
    EXPECT_EQ(shown().visible, 1);
    EXPECT_EQ(shown().fullScreen, 1);
}

TEST_F(HostileRingTest, AWrongNumberOfADescriptionShowsNothing) {
    const char* reason = nullptr;
    const auto memory = FrameRingMemory::map(m_writer->memoryDescriptor(), reason);
    ASSERT_TRUE(memory) << reason;
    for (const uint32_t newest :
         {UINT32_MAX, FrameRingHeader::kNew | kSlotCount, FrameRingHeader::kNew | 0x7fU}) {
        ASSERT_TRUE(publish(1, ++m_serial));
        memory->header().newest = newest;
        m_reader->refresh();
        EXPECT_FALSE(shown().visible) << newest;
    }
}

// What a hostile process sends instead of the memory of a ring.
class HostileMemoryTest : public testing::Test {
protected:
    static constexpr int kSeals = F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_SEAL;

    static int makeMemory(off_t size, int seals, unsigned flags = 0) {
        const int memory = memfd_create("test", MFD_ALLOW_SEALING | flags);
        EXPECT_NE(memory, -1);
        EXPECT_EQ(ftruncate(memory, size), 0);
        EXPECT_EQ(fcntl(memory, F_ADD_SEALS, seals), 0);
        return memory;
    }

    // The reason of the refusal.
    static std::string refusal(int memory, int wakeup = eventfd(0, 0)) {
        std::string error;
        EXPECT_FALSE(FrameReader::open(memory, wakeup, error));
        EXPECT_EQ(fcntl(memory, F_GETFD), -1) << "the descriptor stays open";
        EXPECT_EQ(fcntl(wakeup, F_GETFD), -1) << "the descriptor stays open";
        return error;
    }

    static constexpr off_t kHeader = 4096;
    static constexpr off_t kSlot = 4096;
};

TEST_F(HostileMemoryTest, MemoryThatCanShrinkOrGrowIsRefused) {
    for (const int seals : {0, F_SEAL_GROW, F_SEAL_SHRINK | F_SEAL_GROW, F_SEAL_GROW | F_SEAL_SEAL}) {
        EXPECT_EQ(refusal(makeMemory(kHeader + 3 * kSlot, seals)), "frames: not sealed memory") << seals;
    }
}

TEST_F(HostileMemoryTest, OtherFilesAreRefused) {
    EXPECT_EQ(refusal(open("/dev/zero", O_RDWR)), "frames: not sealed memory");
    EXPECT_EQ(refusal(eventfd(0, 0)), "frames: not sealed memory");
    EXPECT_EQ(refusal(-1), "frames: no descriptor");
}

TEST_F(HostileMemoryTest, MemoryOfAnotherSizeIsRefused) {
    for (const off_t size :
         {off_t{0}, kHeader, kHeader + 3 * kSlot + 1, kHeader + 4 * kSlot, kHeader + 3 * 4095,
          kHeader + 3 * (off_t{kMaximumSlotSize} + 4096), off_t{1} << 40}) {
        EXPECT_EQ(refusal(makeMemory(size, kSeals)), "frames: not of the size of a frame ring") << size;
    }
}

TEST_F(HostileMemoryTest, MemoryThatIsNoRingIsRefused) {
    EXPECT_EQ(refusal(makeMemory(kHeader + 3 * kSlot, kSeals)), "frames: not a frame ring");
    EXPECT_EQ(refusal(makeMemory(kHeader + 3 * kSlot, kSeals | F_SEAL_WRITE)), "frames: cannot be mapped");
}

TEST_F(HostileMemoryTest, AWakeUpThatCannotBePolledIsRefused) {
    const auto writer = FrameWriter::create(4096);
    ASSERT_TRUE(writer);
    EXPECT_EQ(refusal(dup(writer->memoryDescriptor()), makeMemory(1, 0)),
              "frames: wake-up: Operation not permitted");
}

TEST_F(HostileMemoryTest, AWakeUpThatIsReadByOthersDoesNotBlockTheReader) {
    const auto writer = FrameWriter::create(4096);
    ASSERT_TRUE(writer);
    std::string error;
    const int wakeup = eventfd(0, 0); // blocking
    const auto reader = FrameReader::open(dup(writer->memoryDescriptor()), dup(wakeup), error);
    ASSERT_TRUE(reader) << error;
    uint64_t one = 1;
    ASSERT_EQ(write(wakeup, &one, sizeof one), ssize_t{sizeof one});
    ASSERT_EQ(read(wakeup, &one, sizeof one), ssize_t{sizeof one});
    EXPECT_FALSE(reader->refresh());
    close(wakeup);
}

} // namespace
} // namespace desktop
