#include "terminal.h"

#include <charconv>

namespace desktop {

namespace {

constexpr int32_t kMargin = 8;
constexpr size_t kMaxLines = 400, kMaxInput = 120;
constexpr std::string_view kPrompt = "quillon $ ";

} // namespace

Terminal::Terminal(const Rect &frame) : Window("Terminal", frame) {
    place(frame);
}

// ---- What is in it --------------------------------------------------------

void Terminal::type(std::string_view characters) {
    for (const char character : characters)
        typed(character);
}

void Terminal::typed(char character) {
    if (scrolledBack_ != 0) {
        const int32_t oldFirst = firstShown();
        scrolledBack_ = 0;
        scrolled(oldFirst);
    }
    if (character == '\n') {
        const std::string command = std::exchange(input_, std::string());
        print({{std::string(kPrompt), kGreen}, {command, kInk}});
        execute(command);
    } else if (character == '\b') {
        if (!input_.empty())
            input_.pop_back();
    } else if (character >= gallery::kFirstGlyph && character <= gallery::kLastGlyph &&
               input_.size() < kMaxInput) {
        input_ += character;
    }
    showLine(lineCount() - 1);
}

void Terminal::execute(const std::string &command) {
    const size_t space = std::min(command.find(' '), command.size());
    const std::string name = command.substr(0, space);
    const std::string argument = command.substr(std::min(space + 1, command.size()));
    if (name == "help") {
        print({{"about  colors  echo TEXT  seq N  clear", kYellow}});
    } else if (name == "about") {
        print({{"libquillon ", kAccent}, {QUILLON_VERSION_STRING, kInk}});
        print({{"Every pixel here is drawn by it, in plain memory:", kFadedInk}});
        print({{"  text", kViolet}, {"     bits expanded to pixels"}});
        print({{"  scroll", kViolet}, {"   copies that overlap"}});
        print({{"  shadows", kViolet}, {"  blends by alpha"}});
        print({{"  video", kViolet}, {"    YUV, scaled, through a colour key"}});
        print({{"  damage", kViolet}, {"   lists of rectangles (F2 shows them)"}});
    } else if (name == "colors") {
        Line line;
        for (const Color color : {kRed, kYellow, kGreen, kAccent, kViolet, kFadedInk})
            line.push_back({"     ", kInk, color});
        print(std::move(line));
    } else if (name == "echo") {
        print({{argument}});
    } else if (name == "seq") {
        int count = 0;
        std::from_chars(argument.data(), argument.data() + argument.size(), count);
        for (int i = 1; i <= std::min(count, 1000); ++i)
            print({{std::to_string(i), i % 10 == 0 ? kYellow : kInk}});
    } else if (name == "clear") {
        lines_.clear();
        redraw();
    } else if (!name.empty()) {
        print({{name, kRed}, {": no such command; try "}, {"help", kYellow}});
    }
}

void Terminal::print(Line line) {
    int32_t oldFirst = firstShown();
    lines_.push_back(std::move(line));
    if (lines_.size() > kMaxLines) {
        lines_.pop_front();
        --oldFirst;
    }
    scrolled(oldFirst);
    showLine(lineCount() - 2);
    showLine(lineCount() - 1);
}

Terminal::Line Terminal::inputLine() const {
    return {{std::string(kPrompt), kGreen}, {input_, kInk}};
}

// ---- What is seen of it ---------------------------------------------------

int32_t Terminal::rows() const {
    return std::max(1, (contentBounds().height() - 2 * kMargin) / kLineHeight);
}

int32_t Terminal::firstShown() const {
    return std::max(0, std::max(0, lineCount() - rows()) - scrolledBack_);
}

Rect Terminal::rowRect(int32_t row) const {
    return {kMargin, kMargin + row * kLineHeight, contentBounds().width() - 2 * kMargin,
            kLineHeight};
}

void Terminal::layOut() {
    scrolledBack_ = 0;
}

void Terminal::drawAll(Layers &layers) const {
    layers.content.fill(kBackground);
    for (int32_t row = 0; row < rows(); ++row)
        drawRow(layers.content, row);
}

void Terminal::drawRow(Surface &content, int32_t row) const {
    const int32_t index = firstShown() + row;
    Surface part = content.part(rowRect(row));
    part.fill(kBackground);
    if (index >= lineCount())
        return;
    const bool isInput = index == lineCount() - 1;
    Point at(0, (kLineHeight - kGlyphHeight) / 2 + 1);
    for (const Span &span : isInput ? inputLine() : lines_[static_cast<size_t>(index)]) {
        part.text(at, kFont, span.text, span.color, span.background);
        at.x += textWidth(span.text);
    }
    if (isInput)
        part.combine({at.x, 0, kGlyphWidth, kLineHeight}, kInk.argb() & 0xFFFFFF,
                     quillon::Rop::kXor);
}

void Terminal::showLine(int32_t line) {
    const int32_t row = line - firstShown();
    if (row < 0 || row >= rows())
        return;
    drawRow(layers_.content, row);
    damage(rowRect(row));
}

void Terminal::wheel(Point /*at*/, int32_t steps) {
    constexpr int32_t kLinesPerStep = 3;
    const int32_t oldFirst = firstShown();
    scrolledBack_ =
        std::clamp(scrolledBack_ + steps * kLinesPerStep, 0, std::max(0, lineCount() - rows()));
    scrolled(oldFirst);
}

void Terminal::scrolled(int32_t oldFirst) {
    const int32_t up = firstShown() - oldFirst, count = rows();
    if (up == 0)
        return;
    const Rect all = rowRect(0).united(rowRect(count - 1));
    // What stays visible is moved, the rows that appear are drawn.
    Surface text = layers_.content.part(all);
    text.copy({0, -up * kLineHeight}, text);
    const int32_t first = up > 0 ? std::max(0, count - up) : 0;
    const int32_t end = up > 0 ? count : std::min(count, -up);
    for (int32_t row = first; row < end; ++row)
        drawRow(layers_.content, row);
    damage(all);
}

} // namespace desktop
