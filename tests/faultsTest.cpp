// Everything that can fail fails once: each request for memory, and each call on a file.
// Nothing may be left behind.

#include "support/faults.h"
#include "support/messages.h"
#include "support/pngFile.h"
#include "support/testImage.h"
#include <quillon/quillon.h>

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <dlfcn.h>
#include <fcntl.h>
#include <functional>
#include <map>
#include <memory>
#include <sys/stat.h>
#include <unistd.h>

using namespace quillon::test;

// --- Files; not under a sanitizer, which has such functions of its own

#if !defined(QUILLON_SANITIZED)

namespace {

enum class Fault { kError, kInterrupted, kShort, kNothing };

// While one lives, the n-th call on a file, from 0, fails: that one alone.
struct FileFault {
    FileFault(uint64_t n, Fault fault) : callsLeft(n), kind(fault) { current = this; }
    ~FileFault() { current = nullptr; }
    FileFault(const FileFault &) = delete;
    FileFault &operator=(const FileFault &) = delete;

    static FileFault *current;
    uint64_t callsLeft;
    const Fault kind;
    const char *call = nullptr; // the one that has failed
    int filesOpen = 0;
};

FileFault *FileFault::current = nullptr;

bool fails(const char *call) {
    FileFault *const fault = FileFault::current;
    if (fault == nullptr || fault->callsLeft-- != 0)
        return false;
    fault->call = call;
    return true;
}

void noteOpen(int change) {
    if (FileFault::current != nullptr)
        FileFault::current->filesOpen += change;
}

int failed(int error) {
    errno = FileFault::current->kind == Fault::kInterrupted ? EINTR : error;
    return -1;
}

template <class Function>
Function *hidden(Function * /*own*/, const char *name) {
    return reinterpret_cast<Function *>(dlsym(RTLD_NEXT, name));
}

// Reads or writes, or does less.
template <class Transfer>
ssize_t transfer(const char *call, size_t count, int error, const Transfer &next) {
    if (!fails(call))
        return next(count);
    switch (FileFault::current->kind) {
    case Fault::kShort:
        return next(count / 2);
    case Fault::kNothing:
        return 0;
    default:
        return failed(error);
    }
}

bool isHard(Fault kind) {
    return kind == Fault::kError || kind == Fault::kInterrupted;
}

} // namespace

// In the place of the system's.
extern "C" {

int open(const char *name, int flags, ...) {
    static auto *const next = hidden(open, "open");
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = (flags & O_CREAT) != 0 ? va_arg(arguments, mode_t) : 0;
    va_end(arguments);
    if (fails("open") && isHard(FileFault::current->kind))
        return failed(EMFILE);
    const int file = next(name, flags, mode);
    noteOpen(file >= 0 ? 1 : 0);
    return file;
}

int fstat(int file, struct stat *status) noexcept {
    static auto *const next = hidden(fstat, "fstat");
    return fails("size") && FileFault::current->kind == Fault::kError ? failed(EIO)
                                                                      : next(file, status);
}

ssize_t read(int file, void *bytes, size_t count) {
    static auto *const next = hidden(read, "read");
    return transfer("read", count, EIO, [&](size_t part) { return next(file, bytes, part); });
}

ssize_t write(int file, const void *bytes, size_t count) {
    static auto *const next = hidden(write, "write");
    return transfer("write", count, ENOSPC, [&](size_t part) { return next(file, bytes, part); });
}

int close(int file) {
    static auto *const next = hidden(close, "close");
    noteOpen(-1);
    const int status = next(file);
    return fails("close") && isHard(FileFault::current->kind) ? failed(EIO) : status;
}

} // extern "C"
#endif

namespace {

// --- What is called

// Images of every format.
struct Images {
    Images() {
        Random random(1);
        for (const Format format : kFormats)
            all.push_back(std::make_unique<TestImage>(random, format, 50u, 40u));
    }
    const ImageInfo &of(uint32_t bpp) const {
        for (const auto &image : all)
            if (image->info.bpp == bpp)
                return image->info;
        std::abort();
    }
    std::vector<std::unique_ptr<TestImage>> all;
};

// Memory operations whose blocks no other functions could resize or free.
size_t kAhead = 64; // its address is their context

void *resizeBlock(void *context, void *block, size_t size) {
    EXPECT_EQ(context, &kAhead);
    void *whole = block == nullptr ? nullptr : static_cast<uint8_t *>(block) - kAhead;
    whole = std::realloc(whole, size + kAhead);
    return whole == nullptr ? nullptr : static_cast<uint8_t *>(whole) + kAhead;
}

void *takeBlock(void *context, size_t size) {
    return resizeBlock(context, nullptr, size);
}

void releaseBlock(void *context, void *block) {
    EXPECT_EQ(context, &kAhead);
    std::free(block == nullptr ? nullptr : static_cast<uint8_t *>(block) - kAhead);
}

bool taken(bool isMade, ImageInfo &image) {
    if (isMade)
        ImageUtil_FreeImageData(&image);
    return isMade;
}

bool taken(bool isMade, DynBuf &buffer) {
    EXPECT_EQ(buffer.data != nullptr, isMade);
    DynBuf_Destroy(&buffer);
    return isMade;
}

bool encodedByOwnMemory(const ImageInfo &image, const Bytes &expected) {
    const ImageUtilMemOps ops = {&kAhead, takeBlock, releaseBlock, resizeBlock};
    uint8_t untouched = 0, *data = &untouched;
    uint32_t size = 77;
    const bool isMade = ImageUtil_ConstructPNGBufferWithMemOps(&image, nullptr, &data, &size, &ops);
    EXPECT_TRUE(isMade ? std::equal(data, data + size, bytesOf(expected),
                                    bytesOf(expected) + expected.size())
                       : data == &untouched && size == 0);
    if (isMade)
        releaseBlock(&kAhead, data);
    return isMade;
}

bool decoded(const Bytes &png) {
    ImageInfo image;
    const bool isRead = ImageUtil_ReadPNGBuffer(
        &image, bytesOf(png), static_cast<uint32_t>(png.size()), IMAGEUTIL_READ_KEEP_ALPHA);
    ImageUtil_FreeImageData(&image);
    return isRead;
}

bool readFile(const std::string &path) {
    ImageInfo image = {};
    const bool isRead = ImageUtil_ReadPNG(&image, path.c_str(), 0);
    ImageUtil_FreeImageData(&image);
    return isRead;
}

bool combined(const ImageInfo &image, int32_t x) {
    const ImageInfo both[] = {image, image};
    const RectPoint positions[] = {{0, 0}, {x, 0}};
    ImageInfo canvas;
    return taken(ImageUtil_Combine(both, positions, 2, &canvas), canvas);
}

bool cropped(const ImageInfo &image, int32_t width) {
    ImageInfo result;
    return taken(ImageUtil_CropAndScaleImage(&image, 1, 1, -1, -1, 0, 0, width, -1, &result),
                 result);
}

bool scaled(const ImageInfo &image) {
    static uint8_t pixels[20 * 20 * 4];
    return Raster_Scale(pixels, 80, 20, 20, 0, 0, 20, 20, image.data,
                        static_cast<int32_t>(image.bytesPerLine), 30, 30, 2.0 / 3, 2.0 / 3, 2) != 0;
}

bool cursorScaled(const ImageInfo &image, uint32_t type) {
    RasterCursor cursor = {};
    cursor.type = type;
    cursor.width = cursor.height = 16;
    if (type == RASTER_CURSOR_ALPHA) {
        cursor.alphaImage = image.data;
    } else {
        cursor.andImage = image.data;
        cursor.xorImage = image.data;
    }
    RasterCursor *const made = Raster_ScaleCursor(&cursor, 0.75, 2);
    if (made == nullptr)
        return false;
    std::free(made->type == RASTER_CURSOR_ALPHA ? made->alphaImage : made->andImage);
    if (made->type != RASTER_CURSOR_ALPHA)
        std::free(made->xorImage);
    std::free(made);
    return true;
}

struct Subject {
    std::string name;
    std::function<bool()> run; // gives back what it got, and tells whether there was anything
};

std::string temporaryPath() {
    return testing::TempDir() + "quillonFaults" + std::to_string(getpid());
}

const Images &images() {
    static const Images &made = *new Images; // outlives the fences' own memory
    return made;
}

const std::string kPath = temporaryPath();

bool writtenAs(uint32_t format) {
    return ImageUtil_WriteImage(&images().of(32), kPath.c_str(), format);
}

const Subject kFileSubjects[] = {
    {"ImageUtil_ReadPNG", [] { return readFile(kPath); }},
    {"ImageUtil_WriteImage, PNG", [] { return writtenAs(IMAGEUTIL_FORMAT_PNG); }},
    {"ImageUtil_WriteImage, BMP", [] { return writtenAs(IMAGEUTIL_FORMAT_BMP); }},
    {"ImageUtil_WritePNG",
     [] { return ImageUtil_WritePNG(&images().of(24), kPath.c_str(), nullptr); }}};

std::vector<Subject> memorySubjects() {
    std::vector<Subject> subjects(std::begin(kFileSubjects), std::end(kFileSubjects));
    const auto add = [&](const std::string &name, const auto &run) {
        subjects.push_back({name, run});
    };
    for (const uint32_t bpp : {8u, 16u, 24u, 32u}) {
        const ImageInfo &image = images().of(bpp);
        const std::string bits = ", " + std::to_string(bpp) + " bits";
        add("ImageUtil_ConstructPNGBuffer" + bits, [&image] {
            DynBuf buffer = {};
            return taken(ImageUtil_ConstructPNGBuffer(&image, nullptr, &buffer), buffer);
        });
        add("ImageUtil_ConstructBMPBuffer" + bits, [&image] {
            DynBuf buffer = {};
            return taken(ImageUtil_ConstructBMPBuffer(&image, &buffer), buffer);
        });
        for (const int32_t x : {50, 5})
            add("ImageUtil_Combine" + bits, [&image, x] { return combined(image, x); });
        DynBuf buffer = {};
        ImageUtil_ConstructPNGBuffer(&image, nullptr, &buffer);
        const Bytes png(buffer.data, buffer.size);
        DynBuf_Destroy(&buffer);
        add("ImageUtil_ConstructPNGBufferWithMemOps" + bits,
            [&image, png] { return encodedByOwnMemory(image, png); });
        add("ImageUtil_ReadPNGBuffer" + bits, [png] { return decoded(png); });
    }
    for (const int32_t width : {-1, 20})
        add("ImageUtil_CropAndScaleImage", [width] { return cropped(images().of(32), width); });
    add("Raster_Scale", [] { return scaled(images().of(32)); });
    for (const uint32_t type : {RASTER_CURSOR_ANDXOR, RASTER_CURSOR_ALPHA})
        add("Raster_ScaleCursor", [type] { return cursorScaled(images().of(32), type); });
    return subjects;
}

TEST(Faults, EveryRequestForMemory) {
    uint64_t total = 0;
    writtenAs(IMAGEUTIL_FORMAT_PNG);
    for (const Subject &subject : memorySubjects()) {
        SCOPED_TRACE(subject.name);
        const uint64_t requests = forEachMemoryFault(subject.run);
        std::printf("%-50s %3lu requests, each refused once\n", subject.name.c_str(), requests);
        total += requests;
    }
    std::printf("%-50s %3lu\n", "in all", total);
    EXPECT_GT(total, 0u); // under a sanitizer, only of those to libhearth
    std::remove(kPath.c_str());
}

#if !defined(QUILLON_SANITIZED)

// Whether the call succeeds in spite of a fault: closing is not looked at, and
// interrupted or short transfers go on.
bool isSurvived(const std::string &call, Fault kind) {
    return call == "close" || kind == Fault::kInterrupted || kind == Fault::kShort ||
           (kind == Fault::kNothing && call != "read" && call != "write");
}

TEST(Faults, EveryCallOnAFile) {
    constexpr std::pair<Fault, const char *> kFaults[] = {{Fault::kError, "an error"},
                                                          {Fault::kInterrupted, "an interruption"},
                                                          {Fault::kShort, "half of the bytes"},
                                                          {Fault::kNothing, "no bytes"}};
    for (const Subject &subject : kFileSubjects)
        for (const auto &[kind, name] : kFaults) {
            std::map<std::string, int> refused, survived;
            for (uint64_t n = 0;; ++n) {
                ASSERT_TRUE(writtenAs(IMAGEUTIL_FORMAT_PNG));
                logs.clear();
                FileFault fault(n, kind);
                const bool isDone = subject.run();
                if (fault.call == nullptr)
                    break;
                EXPECT_EQ(fault.filesOpen, 0);
                EXPECT_EQ(isDone, isSurvived(fault.call, kind)) << subject.name << fault.call;
                const bool isWriter = subject.name.find("Write") != std::string::npos;
                EXPECT_EQ(logs.size(), isWriter && !isDone ? 1u : 0u);
                if (fault.call == "write"s && kind == Fault::kNothing) {
                    EXPECT_EQ(logs, Messages{"ImageUtilWriteBuf: Wrong number of image bytes "
                                             "written to '" +
                                             kPath + "': Success (0)\n"});
                }
                ++(isDone ? survived : refused)[fault.call];
            }
            std::printf("%-26s %-18s refused:", subject.name.c_str(), name);
            for (const auto &[call, count] : refused)
                std::printf(" %s %d", call.c_str(), count);
            std::printf("; went on:");
            for (const auto &[call, count] : survived)
                std::printf(" %s %d", call.c_str(), count);
            std::printf("\n");
            EXPECT_FALSE(survived.empty());
        }
    std::remove(kPath.c_str());
}

#endif

} // namespace
