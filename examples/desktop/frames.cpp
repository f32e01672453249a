#include "frames.h"

#include <array>
#include <cerrno>
#include <cmath>
#include <stdexcept>
#include <system_error>

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

namespace desktop {

FrameSource::FrameSource(Size size, double framesPerSecond)
    : size_(size), framesPerSecond_(framesPerSecond),
      frame_(quillon::VideoFrame::byteCount(quillon::VideoFormat::kI420, size), 128) {}

bool FrameSource::advance(double seconds) {
    const double period = 1 / framesPerSecond_;
    waiting_ = std::min(waiting_ + seconds, 2 * period);
    if (waiting_ < period || !next(frame_))
        return false;
    waiting_ -= period;
    ++number_;
    return true;
}

namespace {

class GeneratedFrames : public FrameSource {
public:
    GeneratedFrames() : FrameSource({kWidth, kHeight}, 25) {}

private:
    static constexpr int32_t kWidth = 480, kHeight = 270, kLayers = 4;
    static constexpr std::ptrdiff_t kPixels = std::ptrdiff_t{kWidth} * kHeight;
    static constexpr size_t index(int32_t number) { return static_cast<size_t>(number); }
    struct Yuv {
        double y, u, v;
    };

    bool next(std::vector<uint8_t> &frame) override {
        placeHills(static_cast<double>(number()));
        uint8_t *y = frame.data(), *u = y + kPixels, *v = u + kPixels / 4;
        for (int32_t row = 0; row < kHeight; ++row)
            for (int32_t column = 0; column < kWidth; ++column) {
                const Yuv pixel = at(column, row);
                *y++ = static_cast<uint8_t>(pixel.y);
                if (row % 2 == 0 && column % 2 == 0) {
                    *u++ = static_cast<uint8_t>(pixel.u);
                    *v++ = static_cast<uint8_t>(pixel.v);
                }
            }
        return true;
    }

    // Nearer hills are lower, and pass faster.
    void placeHills(double time) {
        for (int32_t layer = 0; layer < kLayers; ++layer)
            for (int32_t column = 0; column < kWidth; ++column) {
                const double x = column + time * (0.4 + layer * layer * 0.8) + layer * 371;
                const double rough = 11.0 + 3 * layer;
                tops_[index(layer)][index(column)] =
                    128 + 30 * layer +
                    static_cast<int32_t>(rough * std::sin(x / (71 - 6 * layer)) +
                                         rough / 2 * std::sin(x / 23 + 1) +
                                         rough / 7 * std::sin(x / 5.3));
            }
        sunX_ = kWidth * 0.63;
        sunY_ = 96 + 14 * std::sin(time / 90);
    }

    Yuv at(int32_t column, int32_t row) const {
        constexpr Yuv kHills[kLayers] = {
            {112, 142, 146}, {84, 146, 140}, {58, 142, 134}, {34, 136, 128}};
        for (int32_t layer = kLayers - 1; layer >= 0; --layer)
            if (row >= tops_[index(layer)][index(column)])
                return kHills[layer];
        const double dx = column - sunX_, dy = row - sunY_, distance = std::sqrt(dx * dx + dy * dy);
        constexpr double kSun = 34;
        if (distance < kSun)
            return {226, 98, 144};
        // From blue above to orange at the horizon, with a glow around the sun.
        const double down = row / 150.0, glow = std::exp((kSun - distance) / 45);
        return {std::min(225.0, 88 + 80 * down + 55 * glow), 150 - 40 * down - 18 * glow,
                124 + 36 * down + 6 * glow};
    }

    std::array<std::array<int32_t, kWidth>, kLayers> tops_ = {};
    double sunX_ = 0, sunY_ = 0;
};

class RawFrames : public FrameSource {
public:
    RawFrames(int file, Size size, double framesPerSecond)
        : FrameSource(size, framesPerSecond), file_(file), partial_(frame().size()) {}
    ~RawFrames() override {
        if (file_ != STDIN_FILENO)
            close(file_);
    }
    RawFrames(const RawFrames &) = delete;
    RawFrames &operator=(const RawFrames &) = delete;

private:
    // Takes what there is, and never waits.
    bool next(std::vector<uint8_t> &frame) override {
        while (count_ < partial_.size()) {
            pollfd ready = {file_, POLLIN, 0};
            if (poll(&ready, 1, 0) <= 0)
                return false;
            const ssize_t got = read(file_, partial_.data() + count_, partial_.size() - count_);
            if (got < 0 || (got == 0 && !rewound()))
                return false;
            count_ += static_cast<size_t>(got);
        }
        frame.swap(partial_);
        count_ = 0;
        return true;
    }

    // A file begins again if it holds a frame; at the end of a pipe its last frame stays.
    bool rewound() {
        count_ = 0;
        return lseek(file_, 0, SEEK_END) >= static_cast<off_t>(partial_.size()) &&
               lseek(file_, 0, SEEK_SET) == 0;
    }

    int file_;
    std::vector<uint8_t> partial_;
    size_t count_ = 0; // bytes of the next frame so far
};

} // namespace

std::unique_ptr<FrameSource> makeGeneratedFrames() {
    return std::make_unique<GeneratedFrames>();
}

std::unique_ptr<FrameSource> openRawFrames(const std::string &fileName, Size size,
                                           double framesPerSecond) {
    const int file = fileName == "-" ? STDIN_FILENO : open(fileName.c_str(), O_RDONLY | O_CLOEXEC);
    if (file < 0)
        throw std::runtime_error(fileName + ": " + std::generic_category().message(errno));
    return std::make_unique<RawFrames>(file, size, framesPerSecond);
}

} // namespace desktop
