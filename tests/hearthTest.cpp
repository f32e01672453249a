// libhearth's own functions, with nothing in their place.

#include <hearth/hearth.h>

#include <gtest/gtest.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <string>
#include <sys/stat.h>
#include <sys/time.h>
#include <thread>
#include <unistd.h>

// Under a sanitizer: null for what cannot be had, as everywhere else.
extern "C" const char *__asan_default_options() {
    return "allocator_may_return_null=1";
}

namespace {

constexpr size_t kHuge = static_cast<size_t>(-1);

TEST(Hearth, Messages) {
    EXPECT_EXIT(Panic("VERIFY %s:%d\n", "a/unit", 12), testing::KilledBySignal(SIGABRT),
                "^VERIFY a/unit:12\n");
    testing::internal::CaptureStderr();
    Warning("one %d\n", 1);
    Log("two %s\n", "2");
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "one 1\ntwo 2\n");
}

TEST(Hearth, Memory) {
    EXPECT_EQ(UtilSafeMalloc0(0), nullptr);
    EXPECT_EQ(UtilSafeCalloc0(0, 8), nullptr);
    EXPECT_EQ(UtilSafeMalloc0(kHuge), nullptr);
    EXPECT_EQ(UtilSafeCalloc0(kHuge / 2, 4), nullptr); // 4 fewer than nothing, wrapped

    DynBuf buffer;
    DynBuf_Init(&buffer);
    std::string expected;
    for (size_t length = 0; length < 3000; length = length * 5 / 4 + 1) {
        expected.append(length, static_cast<char>('a' + length % 26));
        ASSERT_TRUE(DynBuf_Append(&buffer, &expected[expected.size() - length], length));
    }
    EXPECT_FALSE(DynBuf_Append(&buffer, "x", kHuge));     // the size would wrap
    EXPECT_FALSE(DynBuf_Append(&buffer, "x", kHuge / 2)); // no such block
    EXPECT_EQ(std::string(buffer.data, buffer.data + buffer.size), expected);
    DynBuf_Destroy(&buffer);
    DynBuf_Destroy(&buffer);
}

struct HearthFile : testing::Test {
    HearthFile() { FileIO_Invalidate(&file); }
    ~HearthFile() override {
        FileIO_Close(&file);
        std::remove(path.c_str());
    }
    int open(int access, int action) { return FileIO_Open(&file, path.c_str(), access, action); }

    const std::string path = testing::TempDir() + "hearthTest" + std::to_string(getpid());
    FileIODescriptor file;
};

TEST_F(HearthFile, OpensAndCreates) {
    const auto contentAfter = [&](int action, const std::string &text) {
        std::string found(100, '\0');
        size_t actual = 0;
        EXPECT_EQ(open(FILEIO_ACCESS_WRITE, action), 0);
        EXPECT_EQ(FileIO_Write(&file, text.data(), text.size(), &actual), 0);
        EXPECT_EQ(actual, text.size());
        EXPECT_EQ(FileIO_Close(&file), 0);
        EXPECT_EQ(open(FILEIO_ACCESS_READ | FILEIO_ACCESS_WRITE, FILEIO_OPEN), 0);
        const int64_t size = FileIO_GetSize(&file);
        EXPECT_EQ(FileIO_Read(&file, found.data(), found.size(), &actual), 0);
        EXPECT_EQ(FileIO_Close(&file), 0);
        EXPECT_EQ(size, static_cast<int64_t>(actual));
        return found.substr(0, actual);
    };
    EXPECT_EQ(open(FILEIO_ACCESS_WRITE, FILEIO_OPEN), ENOENT);
    EXPECT_EQ(contentAfter(FILEIO_OPEN_CREATE, "a long text"), "a long text");
    EXPECT_EQ(contentAfter(FILEIO_OPEN, "A"), "A long text");
    EXPECT_EQ(contentAfter(FILEIO_OPEN_CREATE, "short"), "short");
}

TEST_F(HearthFile, SaysWhatIsWrong) {
    char byte = 0;
    size_t actual = 7;
    EXPECT_EQ(open(0, FILEIO_OPEN), EINVAL);
    EXPECT_EQ(open(FILEIO_ACCESS_READ, 1), EINVAL);
    EXPECT_EQ(FileIO_GetSize(&file), -1);
    EXPECT_EQ(FileIO_Read(&file, &byte, 1, &actual), EBADF);
    EXPECT_EQ(actual, 0u);
    EXPECT_EQ(FileIO_Open(&file, "/dev/full", FILEIO_ACCESS_WRITE, FILEIO_OPEN), 0);
    EXPECT_EQ(FileIO_Write(&file, &byte, 1, nullptr), ENOSPC);
    EXPECT_STREQ(FileIO_ErrorEnglish(ENOENT), "No such file or directory");
    EXPECT_STREQ(FileIO_ErrorEnglish(-12345), "Unknown error");
}

// A pipe gives what it has, and a timer interrupts the waiting for more.
TEST_F(HearthFile, GoesOnOverShortAndInterruptedTransfers) {
    struct sigaction action = {};
    action.sa_handler = [](int) {}; // not restarting what it interrupts
    sigaction(SIGALRM, &action, nullptr);
    const itimerval often = {{0, 1000}, {0, 1000}}, never = {};

    const std::string sent(300000, 'p'); // more than a pipe holds
    std::string received(sent.size() + 1, '\0');
    size_t written = 0, actual = 0;
    ASSERT_EQ(mkfifo(path.c_str(), 0600), 0);
    std::thread reader([&] {
        FileIODescriptor pipe;
        EXPECT_EQ(FileIO_Open(&pipe, path.c_str(), FILEIO_ACCESS_READ, FILEIO_OPEN), 0);
        usleep(20000); // while the other side waits for room
        EXPECT_EQ(FileIO_Read(&pipe, received.data(), received.size(), &actual), 0);
        EXPECT_EQ(FileIO_Close(&pipe), 0);
    });
    setitimer(ITIMER_REAL, &often, nullptr);
    EXPECT_EQ(open(FILEIO_ACCESS_WRITE, FILEIO_OPEN), 0);
    EXPECT_EQ(FileIO_Write(&file, sent.data(), sent.size(), &written), 0);
    usleep(20000); // while the other side waits for more
    EXPECT_EQ(FileIO_Close(&file), 0);
    reader.join();
    setitimer(ITIMER_REAL, &never, nullptr);
    EXPECT_EQ(written, sent.size());
    EXPECT_EQ(received.substr(0, actual), sent);
}

} // namespace
