// A window whose content lets video through where it has the key colour.
#ifndef DESKTOP_VIDEO_WINDOW_H
#define DESKTOP_VIDEO_WINDOW_H

#include "frames.h"
#include "window.h"

namespace desktop {

class VideoWindow : public Window {
public:
    VideoWindow(const Rect &frame, std::shared_ptr<const FrameSource> source);

    void videoChanged() override;

protected:
    void drawAll(Layers &layers) const override;

private:
    Rect videoRect() const;
    Image scaledFrame() const;
    void drawContent(Surface &content) const;
    std::string label() const;

    std::shared_ptr<const FrameSource> source_;
    Sliced tray_ = roundedBox(0xFF1B1F28, 7);
};

} // namespace desktop

#endif // DESKTOP_VIDEO_WINDOW_H
