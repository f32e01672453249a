// A window of text: bits expanded to pixels, scrolled by copies that overlap.
#ifndef DESKTOP_TERMINAL_H
#define DESKTOP_TERMINAL_H

#include "window.h"

#include <deque>

namespace desktop {

class Terminal : public Window {
public:
    explicit Terminal(const Rect &frame);

    void type(std::string_view characters);
    void typed(char character) override;
    void wheel(Point at, int32_t steps) override;
    CursorShape cursorShape() const override { return CursorShape::kText; }

protected:
    void layOut() override;
    void drawAll(Layers &layers) const override;

private:
    // A piece of a line.
    struct Span {
        std::string text;
        Color color = kInk;
        Color background = kBackground;
    };
    using Line = std::vector<Span>;

    void execute(const std::string &command);
    void print(Line line);
    Line inputLine() const;

    // Lines are counted from the oldest; the last is the one that is typed on.
    int32_t lineCount() const { return static_cast<int32_t>(lines_.size()) + 1; }
    int32_t rows() const;
    int32_t firstShown() const;
    Rect rowRect(int32_t row) const;
    void drawRow(Surface &content, int32_t row) const;
    void showLine(int32_t line);
    // Shows lines from another one on than before.
    void scrolled(int32_t oldFirst);

    std::deque<Line> lines_;
    std::string input_;
    int32_t scrolledBack_ = 0; // lines below the lowest row
};

} // namespace desktop

#endif // DESKTOP_TERMINAL_H
