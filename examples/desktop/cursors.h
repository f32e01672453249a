// The shapes of the mouse cursor, at one size.
#ifndef DESKTOP_CURSORS_H
#define DESKTOP_CURSORS_H

#include "window.h"

#include <vector>

namespace desktop {

class Cursors {
public:
    Cursors();

    const quillon::Cursor &operator[](CursorShape shape) const {
        const auto index = static_cast<size_t>(shape);
        return scaled_.empty() ? shapes_[index] : scaled_[index];
    }
    // From small to large, and back to small.
    void nextSize();

private:
    std::vector<quillon::Cursor> shapes_, scaled_;
    size_t size_ = 0;
};

} // namespace desktop

#endif // DESKTOP_CURSORS_H
