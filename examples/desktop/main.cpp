// desktop: a small desktop with windows, text, pictures, video and cursors, all of it
// drawn by libquillon in plain memory.  --help says how to call it.
#include "options.h"
#include "output.h"
#include "selftest.h"

#include <chrono>
#include <csignal>
#include <cstdio>
#include <exception>
#include <stdexcept>

namespace desktop {

std::atomic<bool> isInterrupted = false;

namespace {

std::shared_ptr<const Image> readOpaque(const std::string &fileName) {
    std::optional<Image> image = Image::readPng(fileName.c_str());
    if (!image || image->isEmpty())
        throw std::runtime_error(fileName + " cannot be read, or is not a PNG in colour");
    image->premultiply();
    Image opaque = created(image->size());
    opaque.fill(0xFFE8EAEF);
    opaque.blend({0, 0}, *image);
    return std::make_shared<const Image>(std::move(opaque));
}

// What the desktop shows where it was given no picture: a frame of the video.
std::shared_ptr<const Image> stillOf(FrameSource &video) {
    Image still = created(video.size());
    still.copyVideo({0, 0}, {video.frame().data(), quillon::VideoFormat::kI420, video.size()});
    return std::make_shared<const Image>(std::move(still));
}

Settings settingsFor(const Options &options) {
    Settings settings;
    settings.size = options.size;
    if (!options.wallpaper.empty())
        settings.wallpaper = readOpaque(options.wallpaper);
    const std::shared_ptr<FrameSource> generated = makeGeneratedFrames();
    generated->advance(1);
    settings.video = options.video.empty()
                         ? generated
                         : openRawFrames(options.video, options.videoSize, options.framesPerSecond);
    settings.picture = !options.picture.empty()        ? readOpaque(options.picture)
                       : settings.wallpaper != nullptr ? settings.wallpaper
                                                       : stillOf(*generated);
    return settings;
}

// Sums up frames, and tells about them twice a second.
class FrameTimes {
public:
    void add(double seconds, const Region &painted) {
        painting_ += seconds;
        pixels_ += static_cast<double>(painted.area());
        ++frames_;
        rects_ += painted.size();
    }
    void tell(Desktop &desktop, double seconds) {
        constexpr double kPeriod = 0.5;
        elapsed_ += seconds;
        if (elapsed_ < kPeriod || frames_ == 0)
            return;
        const auto line = [](const char *format, double number) {
            char text[64];
            std::snprintf(text, sizeof text, format, number);
            return std::string(text);
        };
        desktop.setTimes({line("%6.2f ms a frame", painting_ * 1e3 / frames_),
                          line("%6.0f Mpixel/s", pixels_ / 1e6 / painting_),
                          line("%6.1f frames/s", frames_ / elapsed_),
                          line("%6.1f rectangles", static_cast<double>(rects_) / frames_)});
        *this = {};
    }

private:
    double elapsed_ = 0, painting_ = 0, pixels_ = 0;
    int frames_ = 0;
    size_t rects_ = 0;
};

[[maybe_unused]] void run(Desktop &desktop, Output &output) {
    using Clock = std::chrono::steady_clock;
    const auto seconds = [](Clock::duration time) {
        return std::chrono::duration<double>(time).count();
    };
    constexpr int kMilliseconds = 8;
    FrameTimes times;
    for (Clock::time_point last = Clock::now(); output.handleInput(desktop, kMilliseconds);) {
        const Clock::time_point now = Clock::now();
        const double passed = seconds(now - std::exchange(last, now));
        desktop.advance(passed);
        times.tell(desktop, passed);
        const Clock::time_point start = Clock::now();
        const Region painted = desktop.paint();
        if (painted.isEmpty())
            continue;
        times.add(seconds(Clock::now() - start), painted);
        output.show(desktop.screen(), painted);
    }
}

// A scene that is the same each time.
void drawScene(Desktop &desktop) {
    constexpr int kFrames = 240;
    for (int i = 0; i < kFrames; ++i)
        desktop.advance(0.04);
    for (const char c : std::string_view("help\necho exact to the bit"))
        desktop.typed(c);
    const Image &screen = desktop.screen();
    desktop.movePointer({screen.width() * 42 / 100, screen.height() * 84 / 100});
    desktop.paint();
}

int runMode(const Options &options) {
    Desktop desktop(settingsFor(options));
    if (options.mode == Mode::kSelftest)
        return passSelftest(desktop, options.actions, options.seed) ? 0 : 1;
    if (options.mode == Mode::kScreenshot) {
        drawScene(desktop);
        if (!desktop.screen().writePng(options.screenshot.c_str(), quillon::Alpha::kDrop))
            throw std::runtime_error(options.screenshot + " cannot be written");
        return 0;
    }
    std::signal(SIGINT, [](int) { isInterrupted = true; });
    std::signal(SIGTERM, [](int) { isInterrupted = true; });
    if (options.mode == Mode::kRemote) {
#ifdef DESKTOP_HAS_REMOTE_SCREEN
        const std::unique_ptr<Output> output =
            openRemoteScreen(desktop, options.address, options.port);
        std::printf("Point a viewer at %s:%d; Ctrl+C ends.\n", options.address.c_str(),
                    static_cast<int>(options.port));
        std::fflush(stdout);
        run(desktop, *output);
        return 0;
#else
        throw std::runtime_error("--vnc needs a build with libvncserver-dev");
#endif
    }
#ifdef DESKTOP_HAS_WINDOW
    const std::unique_ptr<Output> output = openSystemWindow(options.size);
    run(desktop, *output);
    return 0;
#else
    throw std::runtime_error("a window needs a build with libsdl2-dev; see --help");
#endif
}

} // namespace

} // namespace desktop

int main(int argc, char **argv) {
    try {
        const desktop::Options options = desktop::parseOptions(argc, argv);
        if (options.mode == desktop::Mode::kHelp)
            std::fputs(desktop::kHelp, stdout);
        else if (options.mode == desktop::Mode::kVersion)
            std::puts("desktop " QUILLON_VERSION_STRING);
        else
            return desktop::runMode(options);
        return 0;
    } catch (const std::exception &problem) {
        std::fprintf(stderr, "desktop: %s\n", problem.what());
        return 1;
    }
}
