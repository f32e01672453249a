// Where the desktop is shown, and where its input comes from.
#ifndef DESKTOP_OUTPUT_H
#define DESKTOP_OUTPUT_H

#include "desktop.h"

#include <atomic>

namespace desktop {

class Output {
public:
    virtual ~Output() = default;
    // Waits a moment for input and hands it to the desktop; returns false at the end.
    virtual bool handleInput(Desktop &desktop, int milliseconds) = 0;
    // Shows what has been painted.
    virtual void show(const Image &screen, const Region &painted) = 0;
};

// A window of the system's.
std::unique_ptr<Output> openSystemWindow(Size size);
// A screen for remote viewers.
std::unique_ptr<Output> openRemoteScreen(Desktop &desktop, const std::string &address, int port);

// Set when the program has been told to end.
extern std::atomic<bool> isInterrupted;

} // namespace desktop

#endif // DESKTOP_OUTPUT_H
