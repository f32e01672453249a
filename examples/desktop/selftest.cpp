#include "selftest.h"

#include <array>
#include <cinttypes>
#include <cstdio>
#include <cstring>
#include <random>

namespace desktop {

namespace {

class RandomUser {
public:
    RandomUser(Desktop &desktop, uint32_t seed)
        : desktop_(desktop), random_(seed), largest_{desktop.screen().width() * 3 / 2,
                                                     desktop.screen().height() * 3 / 2} {}

    // Does something, and returns its name.
    const char *act() {
        const Action &action = kActions[below(kActions.size())];
        (this->*action.act)();
        return action.name;
    }

private:
    struct Action {
        const char *name;
        void (RandomUser::*act)();
    };

    uint32_t below(size_t limit) { return static_cast<uint32_t>(random_() % limit); }
    int32_t between(int32_t first, int32_t last) {
        return first + static_cast<int32_t>(below(static_cast<size_t>(last - first) + 1));
    }
    Button anyButton() { return below(3) == 0 ? Button::kRight : Button::kLeft; }

    void jump() {
        at_ = {between(-20, desktop_.screen().width() + 20),
               between(-20, desktop_.screen().height() + 20)};
        desktop_.movePointer(at_);
    }
    void moveABit() {
        at_ = at_ + Point(between(-30, 30), between(-30, 30));
        desktop_.movePointer(at_);
    }
    void press() { desktop_.press(anyButton()); }
    void release() { desktop_.release(Button::kLeft); }
    void click() {
        jump();
        press();
        release();
    }
    // From anywhere: it moves, resizes, selects, pans.
    void startDrag() {
        desktop_.release(Button::kLeft);
        jump();
        press();
        moveABit();
    }
    void type() {
        static constexpr std::array<const char *, 6> kTexts = {
            "seq 7\n", "help\n",          "echo The quick brown fox\n",
            "\b\b",    "colors\nabout\n", "clear\n"};
        if (below(3) == 0) {
            for (const char *c = kTexts[below(kTexts.size())]; *c != '\0'; ++c)
                desktop_.typed(*c);
        } else {
            desktop_.typed(static_cast<char>(between(' ', '~')));
        }
    }
    void turnWheel() { desktop_.wheel(between(-3, 3)); }
    void letTimePass() { desktop_.advance(0.05); }
    void pressFunctionKey() { desktop_.functionKey(between(1, 7)); }
    void tellTimes() {
        desktop_.setTimes(std::vector<std::string>(below(4), std::string(below(24), 'x')));
    }
    void resizeScreen() {
        if (below(8) == 0)
            desktop_.resize({between(64, largest_.width), between(64, largest_.height)});
    }

    static constexpr std::array<Action, 13> kActions = {{
        {"a jump of the pointer", &RandomUser::jump},
        {"a move of the pointer", &RandomUser::moveABit},
        {"a move of the pointer", &RandomUser::moveABit},
        {"a drag", &RandomUser::startDrag},
        {"a button pressed", &RandomUser::press},
        {"a button released", &RandomUser::release},
        {"a click", &RandomUser::click},
        {"typing", &RandomUser::type},
        {"the wheel", &RandomUser::turnWheel},
        {"a video frame", &RandomUser::letTimePass},
        {"a function key", &RandomUser::pressFunctionKey},
        {"other times", &RandomUser::tellTimes},
        {"another size of the screen", &RandomUser::resizeScreen},
    }};

    Desktop &desktop_;
    std::mt19937 random_;
    Size largest_;
    Point at_;
};

// The first pixel that differs, if any does.
std::optional<Point> firstDifference(const Image &a, const Image &b) {
    for (int32_t y = 0; y < a.height(); ++y)
        for (int32_t x = 0; x < a.width(); ++x)
            if (std::memcmp(a.row(y) + std::ptrdiff_t{4} * x, b.row(y) + std::ptrdiff_t{4} * x,
                            4) != 0)
                return Point(x, y);
    return std::nullopt;
}

bool areEqual(const Image &a, const Image &b) {
    for (int32_t y = 0; y < a.height(); ++y)
        if (std::memcmp(a.row(y), b.row(y), static_cast<size_t>(a.width()) * 4) != 0)
            return false;
    return true;
}

} // namespace

bool passSelftest(Desktop &desktop, int32_t actions, uint32_t seed) {
    RandomUser user(desktop, seed);
    uint64_t painted = 0, compared = 0;
    for (int32_t i = 0; i < actions; ++i) {
        const char *const action = user.act();
        painted += desktop.paint().area();
        const Image &screen = desktop.screen();
        const Image whole = desktop.redrawn();
        compared += static_cast<uint64_t>(screen.width()) * static_cast<uint64_t>(screen.height());
        if (areEqual(screen, whole))
            continue;
        const Point where = *firstDifference(screen, whole);
        std::printf("Seed %" PRIu32 ": after action %" PRId32 ", %s, pixel (%" PRId32 ", %" PRId32
                    ") differs from a screen drawn anew\n",
                    seed, i, action, where.x, where.y);
        return false;
    }
    std::printf("%" PRId32 " random actions painted %" PRIu64 " pixels; all %" PRIu64
                " pixels compared equal those of a screen drawn anew\n",
                actions, painted, compared);
    return true;
}

} // namespace desktop
