// The desktop as a screen for remote viewers, by libvncserver.
#include "output.h"

#include <rfb/keysym.h>
#include <rfb/rfb.h>

#include <new>
#include <stdexcept>

#include <arpa/inet.h>

namespace desktop {

namespace {

// Input of any of the viewers goes to the one desktop.
void handleKey(rfbBool isDown, rfbKeySym key, rfbClientPtr client) {
    auto &desktop = *static_cast<Desktop *>(client->screen->screenData);
    if (isDown == 0)
        return;
    if (key >= XK_F1 && key <= XK_F12)
        desktop.functionKey(static_cast<int32_t>(key - XK_F1) + 1);
    else if (key == XK_Return || key == XK_KP_Enter)
        desktop.typed('\n');
    else if (key == XK_BackSpace)
        desktop.typed('\b');
    else if (key < 0x80)
        desktop.typed(static_cast<char>(key));
}

void handlePointer(int buttons, int x, int y, rfbClientPtr client) {
    auto &desktop = *static_cast<Desktop *>(client->screen->screenData);
    // The buttons of this viewer before.
    const auto before = static_cast<int>(reinterpret_cast<intptr_t>(client->clientData));
    client->clientData = reinterpret_cast<void *>(static_cast<intptr_t>(buttons));
    desktop.movePointer({x, y});
    const int pressed = buttons & ~before, released = before & ~buttons;
    constexpr int kLeft = 1, kRight = 4, kUp = 8, kDown = 16;
    for (const auto &[mask, button] : {std::pair(kLeft, Button::kLeft), {kRight, Button::kRight}}) {
        if ((released & mask) != 0)
            desktop.release(button);
        if ((pressed & mask) != 0)
            desktop.press(button);
    }
    if ((pressed & (kUp | kDown)) != 0)
        desktop.wheel((pressed & kUp) != 0 ? 1 : -1);
    // Lets libvncserver know who may resize and the like.
    rfbDefaultPtrAddEvent(buttons, x, y, client);
}

// Tells what the pixels are: the desktop's own, 0xAARRGGBB as a word.
void describePixels(rfbScreenInfo &screen, const Image &image) {
    screen.frameBuffer = const_cast<char *>(reinterpret_cast<const char *>(image.pixels()));
    screen.paddedWidthInBytes = image.stride();
    screen.serverFormat.redShift = 16;
    screen.serverFormat.greenShift = 8;
    screen.serverFormat.blueShift = 0;
}

// A viewer's window has another size.
int handleSize(int width, int height, int /*screens*/, rfbExtDesktopScreen * /*layout*/,
               rfbClientPtr client) {
    constexpr int kSmallest = 64, kLargest = 4096;
    if (std::min(width, height) < kSmallest || std::max(width, height) > kLargest)
        return rfbExtDesktopSize_InvalidScreenLayout;
    rfbScreenInfo &screen = *client->screen;
    auto &desktop = *static_cast<Desktop *>(screen.screenData);
    try {
        desktop.resize({width, height});
    } catch (const std::bad_alloc &) {
        return rfbExtDesktopSize_OutOfResources;
    }
    rfbNewFramebuffer(&screen, nullptr, width, height, 8, 3, 4);
    describePixels(screen, desktop.screen());
    rfbClientIteratorPtr clients = rfbGetClientIterator(&screen);
    while (rfbClientPtr any = rfbClientIteratorNext(clients))
        screen.setTranslateFunction(any);
    rfbReleaseClientIterator(clients);
    return rfbExtDesktopSize_Success;
}

class RemoteScreen : public Output {
public:
    RemoteScreen(Desktop &desktop, const std::string &address, int port) {
        const Image &image = desktop.screen();
        rfbLogEnable(0);
        screen_.reset(rfbGetScreen(nullptr, nullptr, image.width(), image.height(), 8, 3, 4));
        if (screen_ == nullptr)
            throw std::runtime_error("there is no memory for a screen for remote viewers");
        describePixels(*screen_, image);
        screen_->desktopName = "libquillon desktop";
        screen_->screenData = &desktop;
        screen_->cursor = nullptr; // the desktop draws its own
        screen_->alwaysShared = TRUE;
        screen_->kbdAddEvent = handleKey;
        screen_->ptrAddEvent = handlePointer;
        screen_->setDesktopSizeHook = handleSize;
        screen_->port = port;
        screen_->ipv6port = -1;
        in_addr listen = {};
        if (inet_pton(AF_INET, address.c_str(), &listen) != 1)
            throw std::runtime_error("'" + address + "' is not an address such as 127.0.0.1");
        screen_->listenInterface = listen.s_addr;
        rfbInitServer(screen_.get());
        if (screen_->listenSock < 0)
            throw std::runtime_error("port " + std::to_string(port) + " of " + address +
                                     " cannot be listened on");
    }
    ~RemoteScreen() override { rfbShutdownServer(screen_.get(), TRUE); }
    RemoteScreen(const RemoteScreen &) = delete;
    RemoteScreen &operator=(const RemoteScreen &) = delete;

    bool handleInput(Desktop & /*desktop*/, int milliseconds) override {
        rfbProcessEvents(screen_.get(), 1000L * milliseconds);
        return !isInterrupted;
    }

    // Viewers are sent parts of the desktop's own screen.
    void show(const Image & /*screen*/, const Region &painted) override {
        for (const Rect part : painted)
            rfbMarkRectAsModified(screen_.get(), part.left, part.top, part.right, part.bottom);
    }

private:
    struct CleanUp {
        void operator()(rfbScreenInfoPtr screen) const { rfbScreenCleanup(screen); }
    };
    std::unique_ptr<rfbScreenInfo, CleanUp> screen_;
};

} // namespace

std::unique_ptr<Output> openRemoteScreen(Desktop &desktop, const std::string &address, int port) {
    return std::make_unique<RemoteScreen>(desktop, address, port);
}

} // namespace desktop
