// A stranger's program in C++: every kind of object, without a cast.
#include <quillon/quillon.hpp>

using namespace quillon; // leaves only the name Rect ambiguous

int main() {
    std::uint32_t memory[64 * 32] = {};
    const int stride = sizeof memory[0] * 64;
    Surface screen(memory, stride, {64, 32}, Format::kBgra32);
    Region damage;
    damage.add(screen.fill({60, -4, 100, 10}, {255, 128, 0}));

    std::optional<Image> icon = Image::create({8, 8}, Format::kRgb16);
    if (!icon)
        return 1;
    icon->fill(0xFF00FF00);
    damage.add(screen.copy({2, 3}, *icon));
    damage.add(screen.combine({0, 0, 4, 4}, 0xFFFFFF, Rop::kXor));
    if (const auto drawn = screen.copyScaled({10, 10, 4, 4}, *icon))
        damage.add(*drawn);

    const std::uint8_t glyphs[] = {0x18, 0x24, 0x42, 0x81};
    damage.add(screen.text({20, 20}, Font{glyphs, {8, 4}, 'v', 1}, "vv", {0, 0, 255}));
    std::size_t parts = 0;
    for (const quillon::Rect rect : damage)
        if (!screen.part(rect).isEmpty())
            ++parts;

    const std::optional<Cursor> cursor = Cursor::withAlpha(*icon, {1, 1});
    const std::optional<Bytes> png = screen.encodePng(Alpha::kDrop);
    if (!cursor || !png || !Image::decodePng(png->data(), png->size()))
        return 1;
    screen.draw({63, 31}, *cursor);
    return parts == damage.size() && screen.row(5)[63 * 4 + 2] == 255 ? 0 : 1;
}
