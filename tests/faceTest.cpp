// The drawing functions of the C++ face.  Rectangles from anywhere, and surfaces in fenced
// memory: each call is held to a model that visits every pixel of the destination, and
// to the call of the C interface that it stands for.
#include "reference/pixels.h"
#include "support/anywhere.h"
#include "support/fence.h"

#include <gtest/gtest.h>

#include <functional>
#include <vector>

namespace {

using namespace quillon;
using test::anyPoint;
using test::anyRect;
using test::FencedBuffer;
using test::Random;
using QRect = quillon::Rect;

const std::vector<Format> kAll = {Format::kBgra32, Format::kBgr24,  Format::kRgb16,
                                  Format::kRgb15,  Format::kSmall8, Format::kSmall6,
                                  Format::kSmall3, Format::kIndex8};
const std::vector<Format> kColored(kAll.begin(), kAll.end() - 1);
const std::vector<Format> kOnly32 = {Format::kBgra32};

const Palette &palette() {
    static const Palette colors = [] {
        Palette made = {};
        Random(1).fill(made.data(), sizeof made);
        return made;
    }();
    return colors;
}

// Fenced pixels, or bits, and a window on them, which may be a part of the surface.
struct Canvas {
    Canvas(Random &random, Format pixelFormat, bool bits = false)
        : format(pixelFormat), isBits(bits),
          bytes(bytesPerPixel(format)), whole{random.between(1, 40), random.between(1, 24)},
          rowBytes(isBits ? (whole.width + 7) / 8 : whole.width * bytes),
          step(rowBytes + bytes * random.between(0, 5)),
          memory(static_cast<size_t>(step * (whole.height - 1) + rowBytes),
                 random.oneIn(2) ? FencedBuffer::Flush::kBehind : FencedBuffer::Flush::kBefore) {
        if (random.oneIn(3))
            step = -step;
        first = memory.data() + (step < 0 ? -int64_t{step} * (whole.height - 1) : 0);
        random.fill(memory.data(), memory.size());
        window = {{0, 0}, whole};
        if (!isBits && random.oneIn(2))
            window = window.intersected(anyRect(random));
        kept.assign(memory.data(), memory.end());
    }

    Surface surface() { return Surface(first, step, whole, format, &palette()).part(window); }
    Bitmap bitmap() const { return {first, step, whole}; }

    uint8_t *at(int64_t x, int64_t y) {
        return first + step * (window.top + y) + (isBits ? x / 8 : bytes * (window.left + x));
    }
    uint32_t get(int64_t x, int64_t y) {
        uint32_t pixel = 0;
        if (isBits)
            return *at(x, y) >> (7 - x % 8) & 1;
        std::memcpy(&pixel, at(x, y), static_cast<size_t>(bytes));
        return pixel;
    }
    void set(int64_t x, int64_t y, uint32_t pixel) {
        std::memcpy(at(x, y), &pixel, static_cast<size_t>(bytes));
    }
    std::vector<uint8_t> contents() const { return {memory.data(), memory.end()}; }
    void restore() { std::copy(kept.begin(), kept.end(), memory.data()); }

    Format format;
    bool isBits;
    int32_t bytes;
    Size whole;
    int32_t rowBytes, step;
    FencedBuffer memory;
    uint8_t *first;
    QRect window;
    std::vector<uint8_t> kept;
};

// A pixel of any format as 32 bits, and the other way.
uint32_t widened(uint32_t pixel, Format format) {
    return format == Format::kIndex8 ? palette()[pixel]
                                     : reference::converted(pixel, depthOf(format), 32);
}
uint32_t narrowed(uint32_t argb, Format format) {
    return reference::converted(argb, 32, depthOf(format));
}
uint32_t convertedTo(Format to, uint32_t pixel, Format from) {
    return to == from ? pixel : narrowed(widened(pixel, from), to);
}

enum class Source { kNone, kPixels, kSameFormat, kBits };

// A call with its source, where the part `from` of the source goes to the point `to`;
// without a source from is the rectangle.
struct Call {
    Canvas &dst, &src;
    Point to;
    QRect from;
    Color color = 0, other = 0;
    Rop rop = Rop::kCopy;

    uint32_t pixelOf(Color c) const {
        const bool isRaw = dst.format == Format::kIndex8;
        return isRaw ? c.argb() : narrowed(c.argb(), dst.format);
    }
};

struct Drawing {
    const char *name;
    Source source;
    const std::vector<Format> &formats, &sources;
    std::function<QRect(Surface, const Call &)> draw;
    // The pixel that is stored.
    std::function<uint32_t(uint32_t src, uint32_t dst, const Call &)> model;
    // The bare call on what has been clipped, or nothing where it is not one call.
    std::function<void(const Call &, const QRect &dst, Point src)> bare = nullptr;
};

uint32_t u(int32_t value) {
    return static_cast<uint32_t>(value);
}

const std::vector<Drawing> &drawings() {
    static const std::vector<Drawing> all = {
        {"fill", Source::kNone, kAll, kAll,
         [](Surface s, const Call &c) { return s.fill(c.from, c.color); },
         [](uint32_t, uint32_t, const Call &c) { return c.pixelOf(c.color); },
         [](const Call &c, const QRect &r, Point) {
             Raster_RectFill(c.dst.at(r.left, r.top), c.dst.step, c.dst.bytes, c.pixelOf(c.color),
                             0, 0, u(r.width()), u(r.height()));
         }},
        {"fillAlpha", Source::kNone, kOnly32, kAll,
         [](Surface s, const Call &c) { return s.fillAlpha(c.from, 77); },
         [](uint32_t, uint32_t d, const Call &) { return (d & 0xFFFFFF) | 77u << 24; },
         [](const Call &c, const QRect &r, Point) {
             Raster_RectFillAlpha(c.dst.at(r.left, r.top), c.dst.step, 77, 0, 0, u(r.width()),
                                  u(r.height()));
         }},
        {"combine pixel", Source::kNone, kAll, kAll,
         [](Surface s, const Call &c) { return s.combine(c.from, c.color.argb(), c.rop); },
         [](uint32_t, uint32_t d, const Call &c) {
             return reference::combined(static_cast<uint32_t>(c.rop), c.color.argb(), d);
         },
         [](const Call &c, const QRect &r, Point) {
             Raster_RectROPfill(c.dst.at(r.left, r.top), c.dst.step, c.dst.bytes, c.color.argb(),
                                static_cast<uint32_t>(c.rop), 0, 0, u(r.width()), u(r.height()));
         }},
        {"combine", Source::kSameFormat, kAll, kAll,
         [](Surface s, const Call &c) { return s.combine(c.to, c.src.surface(), c.from, c.rop); },
         [](uint32_t s, uint32_t d, const Call &c) {
             return reference::combined(static_cast<uint32_t>(c.rop), s, d);
         },
         [](const Call &c, const QRect &r, Point p) {
             Raster_RectROPcopy(c.dst.at(r.left, r.top), c.dst.step, c.src.at(p.x, p.y), c.src.step,
                                c.dst.bytes, 0, 0, static_cast<uint32_t>(c.rop), 0, 0, u(r.width()),
                                u(r.height()));
         }},
        {"copy", Source::kSameFormat, kAll, kAll,
         [](Surface s, const Call &c) { return s.copy(c.to, c.src.surface(), c.from); },
         [](uint32_t s, uint32_t, const Call &) { return s; },
         [](const Call &c, const QRect &r, Point p) {
             Raster_RectCopy(c.dst.at(r.left, r.top), c.dst.step, c.src.at(p.x, p.y), c.src.step,
                             c.dst.bytes, 0, 0, 0, 0, u(r.width()), u(r.height()));
         }},
        {"copy converted", Source::kPixels, kColored, kAll,
         [](Surface s, const Call &c) { return s.copy(c.to, c.src.surface(), c.from); },
         [](uint32_t s, uint32_t, const Call &c) {
             return convertedTo(c.dst.format, s, c.src.format);
         }},
        {"blend", Source::kSameFormat, kOnly32, kOnly32,
         [](Surface s, const Call &c) { return s.blend(c.to, c.src.surface(), c.from); },
         [](uint32_t s, uint32_t d, const Call &) { return reference::blended(s, d); },
         [](const Call &c, const QRect &r, Point p) {
             Raster_AlphaBlendOver(c.dst.at(r.left, r.top), 0, 0, c.dst.step, c.src.at(p.x, p.y), 0,
                                   0, c.src.step, u(r.width()), u(r.height()));
         }},
        {"blend on any format", Source::kPixels, kColored, kAll,
         [](Surface s, const Call &c) { return s.blend(c.to, c.src.surface(), c.from); },
         [](uint32_t s, uint32_t d, const Call &c) {
             const Format to = c.dst.format;
             return convertedTo(to, reference::blended(widened(s, c.src.format), widened(d, to)),
                                Format::kBgra32);
         }},
        {"copyBits", Source::kBits, kAll, kAll,
         [](Surface s, const Call &c) {
             return s.copyBits(c.to, c.src.bitmap(), c.from, c.color, c.other);
         },
         [](uint32_t s, uint32_t, const Call &c) { return c.pixelOf(s != 0 ? c.color : c.other); }},
        {"stencil", Source::kBits, kAll, kAll,
         [](Surface s, const Call &c) { return s.stencil(c.to, c.src.bitmap(), c.from, c.color); },
         [](uint32_t s, uint32_t d, const Call &c) { return s != 0 ? c.pixelOf(c.color) : d; }},
        {"premultiply", Source::kNone, kOnly32, kAll,
         [](Surface s, const Call &c) { return s.premultiply(c.from); },
         [](uint32_t, uint32_t d, const Call &) {
             const double a = d >> 24;
             uint32_t result = d & 0xFF000000;
             for (int shift = 0; shift < 24; shift += 8)
                 result |= static_cast<uint32_t>((d >> shift & 0xFF) * a / 255 + 0.5) << shift;
             return result;
         }},
        {"exchangeRedBlue", Source::kNone, kOnly32, kAll,
         [](Surface s, const Call &c) { return s.exchangeRedBlue(c.from); },
         [](uint32_t, uint32_t d, const Call &) {
             return (d & 0xFF00FF00) | (d & 0xFF) << 16 | (d >> 16 & 0xFF);
         }},
    };
    return all;
}

// Applies the model to the destination; returns what it has drawn to.
QRect applyModel(const Drawing &drawing, const Call &c, Point &corner) {
    const bool hasSource = drawing.source != Source::kNone;
    const Size size = c.src.isBits ? c.src.whole : c.src.window.size();
    const auto isInside = [&](int64_t s, int32_t low, int32_t high, int32_t limit) {
        return s >= low && s < high && (!hasSource || (s >= 0 && s < limit));
    };
    QRect drawn;
    for (int32_t y = 0; y < c.dst.window.height(); ++y)
        for (int32_t x = 0; x < c.dst.window.width(); ++x) {
            const int64_t sx = int64_t{x} - c.to.x + c.from.left;
            const int64_t sy = int64_t{y} - c.to.y + c.from.top;
            if (!isInside(sx, c.from.left, c.from.right, size.width) ||
                !isInside(sy, c.from.top, c.from.bottom, size.height))
                continue;
            if (drawn.isEmpty() && hasSource)
                corner = {static_cast<int32_t>(sx), static_cast<int32_t>(sy)};
            drawn = drawn.united({x, y, 1, 1});
            c.dst.set(x, y, drawing.model(hasSource ? c.src.get(sx, sy) : 0, c.dst.get(x, y), c));
        }
    return drawn;
}

TEST(Face, DrawsWhatTheModelDraws) {
    test::forEachCase(40000, [](Random &random) {
        const Drawing &drawing = random.oneOf(drawings());
        const bool isBits = drawing.source == Source::kBits;
        Canvas dst(random, random.oneOf(drawing.formats));
        const Format format = drawing.source == Source::kSameFormat ? dst.format
                              : isBits                              ? Format::kSmall8
                                                                    : random.oneOf(drawing.sources);
        Canvas src(random, format, isBits);
        Call call = {dst, src, anyPoint(random), anyRect(random)};
        call.color = random.word();
        call.other = random.word();
        call.rop = static_cast<Rop>(random.below(16));
        if (drawing.source == Source::kNone)
            call.to = call.from.corner();
        SCOPED_TRACE(drawing.name);

        Point corner;
        const QRect expected = applyModel(drawing, call, corner);
        const std::vector<uint8_t> modelled = dst.contents();
        dst.restore();
        EXPECT_EQ(drawing.draw(dst.surface(), call), expected);
        EXPECT_EQ(dst.contents(), modelled);
        if (drawing.bare && !expected.isEmpty()) {
            dst.restore();
            drawing.bare(call, expected, corner);
            EXPECT_EQ(dst.contents(), modelled);
        }
    });
}

// Parts that overlap have corners of their own, and are still copied in the right order.
TEST(Face, CopiesBetweenPartsOfOneSurface) {
    test::forEachCase(5000, [](Random &random) {
        Canvas canvas(random, random.oneOf(kAll));
        canvas.window = {{0, 0}, canvas.whole};
        Surface all = canvas.surface();
        const QRect a = anyRect(random).intersected(all.bounds());
        const QRect b = anyRect(random).intersected(all.bounds());
        const Rop rop = random.oneOf({Rop::kCopy, Rop::kXor});
        const std::optional<Image> before = Image::copyOf(all);
        ASSERT_TRUE(before);
        Surface part = all.part(a);
        const QRect drawn = part.combine({0, 0}, all.part(b), rop);
        const std::vector<uint8_t> contents = canvas.contents();
        canvas.restore();
        EXPECT_EQ(part.combine({0, 0}, before->part(b), rop), drawn);
        EXPECT_EQ(canvas.contents(), contents);
    });
}

// Every colour at every alpha.
TEST(Face, UnpremultipliesToTheNearestColor) {
    for (uint32_t alpha = 0; alpha < 256; ++alpha) {
        std::vector<uint32_t> row(256);
        for (uint32_t color = 0; color < 256; ++color)
            row[color] = alpha << 24 | color << 8;
        Surface(row.data(), 1024, {256, 1}, Format::kBgra32).unpremultiply();
        for (uint32_t color = 0; color < 256; ++color) {
            const uint32_t nearest =
                alpha == 0 ? 0 : static_cast<uint32_t>(color * 255.0 / alpha + 0.5);
            ASSERT_EQ(row[color], alpha << 24 | std::min(nearest, 255u) << 8) << alpha;
        }
    }
}

TEST(Face, DrawsTextGlyphByGlyph) {
    test::forEachCase(2000, [](Random &random) {
        Canvas dst(random, random.oneOf(kAll));
        uint8_t glyphs[3 * 2 * 5];
        random.fill(glyphs, sizeof glyphs);
        const Font font = {glyphs, {random.between(1, 16), 5}, 'a', 3};
        const Point to = anyPoint(random);
        const bool isOpaque = random.oneIn(2);
        const auto draw = [&](Point at, std::string_view characters) {
            Surface s = dst.surface();
            return isOpaque ? s.text(at, font, characters, 0xFF112233, 0xFF445566)
                            : s.text(at, font, characters, 0xFF112233);
        };
        const QRect drawn = draw(to, "a cb");
        const std::vector<uint8_t> contents = dst.contents();
        dst.restore();
        const QRect first = draw(to, "a"), second = draw(to + Point(2 * font.size.width, 0), "c");
        EXPECT_EQ(first.united(second).united(draw(to + Point(3 * font.size.width, 0), "b")),
                  drawn);
        EXPECT_EQ(dst.contents(), contents);
    });
}

TEST(Face, KeysOverlaysByColor) {
    test::forEachCase(5000, [](Random &random) {
        Canvas dst(random, Format::kBgra32), overlay(random, Format::kBgra32);
        Canvas background(random, Format::kBgra32);
        Canvas keys(random, random.oneOf({Format::kBgra32, Format::kRgb16, Format::kRgb15,
                                          Format::kSmall6, Format::kIndex8}));
        const Color key = 0xAA204060;
        const uint32_t keyPixel = key.pixel(keys.format) & (keys.bytes == 1 ? 0xFF : 0xFFFFFF);
        const Point to = anyPoint(random);
        QRect expected;
        for (int32_t y = 0; y < keys.window.height(); ++y)
            for (int32_t x = 0; x < keys.window.width(); ++x)
                if (random.oneIn(2))
                    keys.set(x, y, keyPixel);
        const QRect all = QRect(Point(), dst.window.size())
                              .intersected(QRect(Point(), keys.window.size()))
                              .intersected(QRect(Point(), background.window.size()));
        for (int32_t y = 0; y < all.height(); ++y)
            for (int32_t x = 0; x < all.width(); ++x) {
                const int64_t sx = int64_t{x} - to.x, sy = int64_t{y} - to.y;
                if (sx < 0 || sy < 0 || sx >= overlay.window.width() ||
                    sy >= overlay.window.height())
                    continue;
                const bool isKey = (keys.get(x, y) & 0xFFFFFF) == keyPixel;
                dst.set(x, y, isKey ? overlay.get(sx, sy) : background.get(x, y));
                expected = expected.united({x, y, 1, 1});
            }
        const std::vector<uint8_t> modelled = dst.contents();
        dst.restore();
        EXPECT_EQ(dst.surface().copyKeyed(to, overlay.surface(), keys.surface(), key,
                                          background.surface()),
                  expected);
        EXPECT_EQ(dst.contents(), modelled);
    });
}

// What no caller may do, without assertions.
#ifdef NDEBUG
TEST(Face, DrawsNothingWhereNothingCanBeDrawn) {
    uint32_t memory[16] = {};
    Surface s(memory, 16, {4, 4}, Format::kBgra32);
    Surface indices(memory, 16, {16, 4}, Format::kIndex8);
    EXPECT_TRUE(Surface(nullptr, 16, {4, 4}, Format::kBgra32).isEmpty());
    EXPECT_TRUE(Surface(memory, 15, {4, 4}, Format::kBgra32).isEmpty());
    EXPECT_TRUE(Surface(memory, 18, {4, 2}, Format::kBgra32).isEmpty());
    EXPECT_TRUE(Surface(memory, 16, {-4, 4}, Format::kBgra32).isEmpty());
    EXPECT_TRUE(s.copy({0, 0}, indices).isEmpty());
    EXPECT_TRUE(indices.copy({0, 0}, s).isEmpty());
    EXPECT_TRUE(indices.blend({0, 0}, s).isEmpty());
    EXPECT_TRUE(indices.combine({0, 0}, s, Rop::kXor).isEmpty());
    EXPECT_TRUE(indices.fillAlpha(indices.bounds(), 1).isEmpty());
    EXPECT_TRUE(indices.premultiply().isEmpty());
}
#endif

} // namespace
