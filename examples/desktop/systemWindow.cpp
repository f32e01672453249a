// The desktop in a window of the system's, by SDL.
#include "output.h"

#include <SDL.h>

#include <stdexcept>

namespace desktop {

namespace {

[[noreturn]] void fail(const char *what) {
    throw std::runtime_error(std::string(what) + ": " + SDL_GetError());
}

class SystemWindow : public Output {
public:
    explicit SystemWindow(Size size) {
        SDL_SetMainReady();
        SDL_SetHint(SDL_HINT_FRAMEBUFFER_ACCELERATION, "0"); // plain memory is all it takes
        if (SDL_Init(SDL_INIT_VIDEO) != 0)
            fail("there is no display");
        window_ =
            SDL_CreateWindow("libquillon desktop", SDL_WINDOWPOS_CENTERED, SDL_WINDOWPOS_CENTERED,
                             size.width, size.height, SDL_WINDOW_RESIZABLE);
        if (window_ == nullptr) {
            SDL_Quit();
            fail("there is no window");
        }
        SDL_ShowCursor(SDL_DISABLE); // the desktop draws its own
        SDL_StartTextInput();
    }
    ~SystemWindow() override {
        SDL_DestroyWindow(window_);
        SDL_Quit();
    }
    SystemWindow(const SystemWindow &) = delete;
    SystemWindow &operator=(const SystemWindow &) = delete;

    bool handleInput(Desktop &desktop, int milliseconds) override {
        SDL_Event event;
        bool isOn = true;
        for (int found = SDL_WaitEventTimeout(&event, milliseconds); found != 0 && isOn;
             found = SDL_PollEvent(&event))
            isOn = handle(desktop, event);
        return isOn && !isInterrupted;
    }

    void show(const Image &screen, const Region &painted) override {
        SDL_Surface *const target = SDL_GetWindowSurface(window_);
        if (target == nullptr)
            fail("the window has no surface");
        Surface surface(target->pixels, target->pitch, {target->w, target->h}, formatOf(*target));
        // A surface that is new has nothing of the screen yet.
        const Region parts = target == shown_ && !isExposed_ ? painted : Region(screen.bounds());
        shown_ = target;
        isExposed_ = false;
        std::vector<SDL_Rect> rects;
        for (const Rect part : parts) {
            const Rect drawn = surface.copy(part.corner(), screen, part);
            if (!drawn.isEmpty())
                rects.push_back({drawn.left, drawn.top, drawn.width(), drawn.height()});
        }
        if (!rects.empty())
            SDL_UpdateWindowSurfaceRects(window_, rects.data(), static_cast<int>(rects.size()));
    }

private:
    static quillon::Format formatOf(const SDL_Surface &surface) {
        switch (surface.format->format) {
        case SDL_PIXELFORMAT_RGB888:
        case SDL_PIXELFORMAT_ARGB8888:
            return quillon::Format::kBgra32;
        case SDL_PIXELFORMAT_BGR24:
            return quillon::Format::kBgr24;
        case SDL_PIXELFORMAT_RGB565:
            return quillon::Format::kRgb16;
        case SDL_PIXELFORMAT_RGB555:
            return quillon::Format::kRgb15;
        default:
            throw std::runtime_error("the window has pixels of an unknown format");
        }
    }

    bool handle(Desktop &desktop, const SDL_Event &event) {
        switch (event.type) {
        case SDL_QUIT:
            return false;
        case SDL_WINDOWEVENT:
            if (event.window.event == SDL_WINDOWEVENT_SIZE_CHANGED)
                desktop.resize({event.window.data1, event.window.data2});
            isExposed_ = true;
            break;
        case SDL_MOUSEMOTION:
            desktop.movePointer({event.motion.x, event.motion.y});
            break;
        case SDL_MOUSEBUTTONDOWN:
        case SDL_MOUSEBUTTONUP:
            desktop.movePointer({event.button.x, event.button.y});
            if (event.button.button != SDL_BUTTON_LEFT && event.button.button != SDL_BUTTON_RIGHT)
                break;
            if (event.type == SDL_MOUSEBUTTONUP)
                desktop.release(buttonOf(event));
            else
                desktop.press(buttonOf(event));
            break;
        case SDL_MOUSEWHEEL:
            desktop.wheel(event.wheel.y);
            break;
        case SDL_TEXTINPUT:
            for (const char *c = event.text.text; *c != '\0'; ++c)
                desktop.typed(*c);
            break;
        case SDL_KEYDOWN:
            return handleKey(desktop, event.key.keysym);
        default:
            break;
        }
        return true;
    }

    static Button buttonOf(const SDL_Event &event) {
        return event.button.button == SDL_BUTTON_LEFT ? Button::kLeft : Button::kRight;
    }

    static bool handleKey(Desktop &desktop, const SDL_Keysym &key) {
        if (key.sym >= SDLK_F1 && key.sym <= SDLK_F12)
            desktop.functionKey(key.sym - SDLK_F1 + 1);
        else if (key.sym == SDLK_RETURN || key.sym == SDLK_KP_ENTER)
            desktop.typed('\n');
        else if (key.sym == SDLK_BACKSPACE)
            desktop.typed('\b');
        return key.sym != SDLK_q || (key.mod & KMOD_CTRL) == 0;
    }

    SDL_Window *window_ = nullptr;
    const SDL_Surface *shown_ = nullptr;
    bool isExposed_ = true;
};

} // namespace

std::unique_ptr<Output> openSystemWindow(Size size) {
    return std::make_unique<SystemWindow>(size);
}

} // namespace desktop
