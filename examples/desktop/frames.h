// Where video comes from.
#ifndef DESKTOP_FRAMES_H
#define DESKTOP_FRAMES_H

#include "theme.h"

#include <memory>
#include <string>
#include <vector>

namespace desktop {

// Frames of I420, one after the other.
class FrameSource {
public:
    virtual ~FrameSource() = default;
    // Lets time pass; tells whether there is a new frame.
    bool advance(double seconds);

    Size size() const { return size_; }
    const std::vector<uint8_t> &frame() const { return frame_; }
    int64_t number() const { return number_; }
    double framesPerSecond() const { return framesPerSecond_; }

protected:
    FrameSource(Size size, double framesPerSecond);
    // Makes the next frame, if there is one by now.
    virtual bool next(std::vector<uint8_t> &frame) = 0;

private:
    Size size_;
    double framesPerSecond_, waiting_ = 0;
    std::vector<uint8_t> frame_;
    int64_t number_ = 0;
};

// Hills at sunset that pass by for ever.
std::unique_ptr<FrameSource> makeGeneratedFrames();

// Raw frames from a file, over and over, or from a pipe; throws std::runtime_error.
std::unique_ptr<FrameSource> openRawFrames(const std::string &fileName, Size size,
                                           double framesPerSecond);

} // namespace desktop

#endif // DESKTOP_FRAMES_H
