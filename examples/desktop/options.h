// The command line.
#ifndef DESKTOP_OPTIONS_H
#define DESKTOP_OPTIONS_H

#include "theme.h"

#include <string>

namespace desktop {

enum class Mode : uint8_t { kWindow, kRemote, kSelftest, kScreenshot, kHelp, kVersion };

struct Options {
    Mode mode = Mode::kWindow;
    Size size = {1120, 700};
    std::string wallpaper, picture, video, screenshot;
    Size videoSize = {640, 360};
    int32_t framesPerSecond = 25;
    int32_t port = 0;
    std::string address = "127.0.0.1";
    int32_t actions = 1000;
    uint32_t seed = 1;
};

extern const char kHelp[];

// Throws std::runtime_error.
Options parseOptions(int argc, char **argv);

} // namespace desktop

#endif // DESKTOP_OPTIONS_H
