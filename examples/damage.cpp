// damage: keeps a 32-bit screen up to date with the 16-bit frame buffer of a
// client, converting only what has changed.
//
//     c++ -std=c++17 damage.cpp $(pkg-config --cflags --libs quillon)
#include <quillon/raster.h>
#include <quillon/version.h>

#include <algorithm>
#include <cstdio>
#include <random>
#include <string_view>
#include <vector>

namespace {

constexpr char kHelp[] =
    "usage: damage\n"
    "\n"
    "Keeps a 32-bit screen up to date with a 16-bit one for 500 refreshes, and prints how many\n"
    "pixels were converted instead of all.\n"
    "\n"
    "  --help, --version   show this text; show the version\n";

constexpr int32_t kWidth = 640, kHeight = 400;
constexpr int32_t kClientStep = kWidth * 2, kScreenStep = kWidth * 4;

// Columns and rows, within the screen.
struct Part {
    uint32_t x, y, width, height;
};

struct DamagedScreen {
    std::vector<uint8_t> client = std::vector<uint8_t>(size_t{kClientStep} * kHeight);
    std::vector<uint8_t> screen = std::vector<uint8_t>(size_t{kScreenStep} * kHeight);
    RasterRectList stale = {}; // where the two differ, and perhaps more
    uint32_t staleArea = 0;
    // To be told in the end.
    uint64_t converted = 0;
    int outside = 0, boxes = 0, uncut = 0;
};

// Nothing in the library clips.  A part with nothing on the screen gets a side of 0.
Part clipped(int32_t x, int32_t y, int32_t width, int32_t height) {
    const int32_t left = std::clamp(x, 0, kWidth), right = std::clamp(x + width, 0, kWidth);
    const int32_t top = std::clamp(y, 0, kHeight), bottom = std::clamp(y + height, 0, kHeight);
    return {static_cast<uint32_t>(left), static_cast<uint32_t>(top),
            static_cast<uint32_t>(right - left), static_cast<uint32_t>(bottom - top)};
}

// The client fills a part of its frame buffer.
void draw(DamagedScreen &s, const Part &part, uint32_t color) {
    Raster_RectFill(s.client.data(), kClientStep, 2, color, part.x, part.y, part.width,
                    part.height);
    const uint32_t area =
        Raster_AddRect(&s.stale, static_cast<int32_t>(part.x), static_cast<int32_t>(part.y),
                       static_cast<int32_t>(part.width), static_cast<int32_t>(part.height));
    if (area == 0) {
        // Does not say that nothing is stale, but that there was nothing to add:
        // the list is what it was before.
        ++s.outside;
        return;
    }
    // A region that needs more than 15 rectangles has become its bounding box.
    // That covers all that is stale, and pixels that are not: converting those is
    // a waste, but no mistake.  Only so can it grow by more than what was added.
    if (area > s.staleArea + part.width * part.height)
        ++s.boxes;
    s.staleArea = area;
}

void convert(DamagedScreen &s, const Part &part) {
    Raster_ConvertPixels(s.screen.data(), kScreenStep, 32, s.client.data(), kClientStep, 16, false,
                         nullptr, part.x, part.y, part.x, part.y, part.width, part.height);
    s.converted += uint64_t{part.width} * part.height;
}

// Shows a part at once, ahead of the rest: a line that is being typed, say.
void refreshPart(DamagedScreen &s, const Part &part) {
    convert(s, part);
    const uint32_t area =
        Raster_SubRect(&s.stale, static_cast<int32_t>(part.x), static_cast<int32_t>(part.y),
                       static_cast<int32_t>(part.width), static_cast<int32_t>(part.height));
    if (area == 0 && s.stale.entries[0].width > 0)
        ++s.uncut; // not a cut that fits: the part stays listed, and is converted again
    else
        s.staleArea = area;
}

// Shows all that is stale.
void refresh(DamagedScreen &s) {
    for (const RasterRectListEntry &entry : s.stale.entries) {
        if (entry.width == 0)
            break; // entries in use stand first
        convert(s, clipped(entry.x, entry.y, entry.width, entry.height));
    }
    Raster_ClearRectList(&s.stale);
    s.staleArea = 0;
}

} // namespace

int main(int argc, char **argv) {
    const std::string_view option = argc == 2 ? argv[1] : "";
    if (option == "--help")
        return std::fputs(kHelp, stdout) < 0;
    if (option == "--version")
        return std::puts("damage " QUILLON_VERSION_STRING) < 0;
    if (argc != 1)
        return std::fputs(kHelp, stderr), 2;
    constexpr int kRefreshes = 500;
    DamagedScreen s;
    convert(s, {0, 0, kWidth, kHeight}); // from here on the screen is true
    std::minstd_rand random;             // gives the same numbers everywhere
    const auto below = [&random](int32_t limit) {
        return static_cast<int32_t>(random() % static_cast<uint32_t>(limit));
    };

    for (int i = 0; i < kRefreshes; ++i) {
        // Little things in one neighbourhood, which may lie over an edge.
        const int32_t x = below(kWidth) - 40, y = below(kHeight) - 40;
        for (int count = below(16); count > 0; --count) {
            const int32_t left = x + below(80), top = y + below(80);
            const int32_t width = 1 + below(20), height = 1 + below(20);
            draw(s, clipped(left, top, width, height), static_cast<uint32_t>(below(0x10000)));
        }
        refreshPart(s, clipped(x + 20, y + 35, 40, 10));
        refresh(s);
    }

    const std::vector<uint8_t> shown = s.screen;
    const uint64_t converted = s.converted;
    convert(s, {0, 0, kWidth, kHeight});
    if (s.screen != shown) {
        std::fputs("damage: the screen is not what the client has drawn\n", stderr);
        return 1;
    }
    const uint64_t whole = uint64_t{kRefreshes} * kWidth * kHeight;
    std::printf("%d refreshes converted %.2f%% of the pixels and saved %llu.\n", kRefreshes,
                100.0 * static_cast<double>(converted) / static_cast<double>(whole),
                static_cast<unsigned long long>(whole - converted));
    std::printf("%d updates were outside, %d lists became boxes, %d parts could not be cut.\n",
                s.outside, s.boxes, s.uncut);
    return 0;
}
