#include "videoWindow.h"

#include <cmath>
#include <cstdio>

namespace desktop {

VideoWindow::VideoWindow(const Rect &frame, std::shared_ptr<const FrameSource> source)
    : Window("Video", frame), source_(std::move(source)) {
    place(frame);
}

// As large as the window has room for, in the middle.
Rect VideoWindow::videoRect() const {
    const Size room = contentBounds().size(), size = source_->size();
    const double zoom =
        std::min(double{1} * room.width / size.width, double{1} * room.height / size.height);
    const Size scaled = {std::max(1, static_cast<int32_t>(std::lround(size.width * zoom))),
                         std::max(1, static_cast<int32_t>(std::lround(size.height * zoom)))};
    return {{(room.width - scaled.width) / 2, (room.height - scaled.height) / 2}, scaled};
}

Image VideoWindow::scaledFrame() const {
    Image frame = created(source_->size());
    frame.copyVideo({0, 0},
                    {source_->frame().data(), quillon::VideoFormat::kI420, source_->size()});
    const Size size = videoRect().size();
    if (size == frame.size())
        return frame;
    Image scaled = resized(frame, size);
    scaled.fillAlpha(scaled.bounds(), 255); // which scaling leaves a little lower
    return scaled;
}

std::string VideoWindow::label() const {
    const auto seconds =
        static_cast<int64_t>(static_cast<double>(source_->number()) / source_->framesPerSecond());
    char text[64];
    std::snprintf(text, sizeof text, "%d:%02d  %dx%d", static_cast<int>(seconds / 60),
                  static_cast<int>(seconds % 60), source_->size().width, source_->size().height);
    return text;
}

// The colour key, and what is shown above the video: wherever it is drawn, the video is not.
void VideoWindow::drawContent(Surface &content) const {
    content.fill(0xFF000000);
    content.fill(videoRect(), kKey);
    const std::string text = label();
    const Rect tray(10, contentBounds().bottom - 32, textWidth(text) + 16, 22);
    Canvas canvas(content, content.bounds());
    canvas.blend(tray, tray_);
    canvas.text({tray.left + 8, tray.top + 6}, text, kInk);
}

void VideoWindow::drawAll(Layers &layers) const {
    drawContent(layers.content);
    layers.overlay = scaledFrame();
    layers.overlayCorner = videoRect().corner();
}

void VideoWindow::videoChanged() {
    drawContent(layers_.content);
    layers_.overlay = scaledFrame();
    damage(contentBounds());
}

} // namespace desktop
