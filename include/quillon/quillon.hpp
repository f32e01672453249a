/** @file quillon.hpp
 *
 * The C++ face of libquillon: surfaces, images, regions and cursors as objects.
 *
 * Header only, C++17, without exceptions.  A drawing call is a clip and one call of the C
 * interface; where it is more, its description says so.
 *
 *     #include <quillon/quillon.hpp>
 *
 *     std::optional<quillon::Image> photo = quillon::Image::readPng("photo.png");
 *     quillon::Surface screen(memory, stride, {1920, 1080}, quillon::Format::kBgra32);
 *     quillon::Rect drawn = screen.copy({100, 50}, *photo);
 *
 * **Everything clips.**  A rectangle may lie anywhere, the limits of int32_t included: what
 * is outside of a surface is left out, on the destination and on the source.  No pixel that
 * is not of the surfaces is accessed.  A drawing call returns the rectangle of the destination
 * that it has drawn to, all zero when there was nothing to draw.
 *
 * **Order of arguments.**  The destination is the object.  Where to draw comes first, as
 * the rectangle, or as the point where the top left corner of the source goes; then the
 * source, and the part of it; then colours and modes.
 *
 * **Errors.**  What can fail returns a std::optional or a [[nodiscard]] bool.  What no
 * caller may do, such as a format that an operation does not have, is an assertion where
 * NDEBUG is not defined; otherwise nothing is drawn.
 *
 * **Names.**  The C interface has a Rect of its own in the global namespace.  Behind
 * `using namespace quillon` the name alone is ambiguous: write quillon::Rect, or braces.
 *
 * **Threads.**  As in raster.h: calls may run at once on separate memory.
 */
#ifndef QUILLON_QUILLON_HPP
#define QUILLON_QUILLON_HPP

#include <quillon/face/bits.hpp>
#include <quillon/face/cursor.hpp>
#include <quillon/face/format.hpp>
#include <quillon/face/image.hpp>
#include <quillon/face/rect.hpp>
#include <quillon/face/region.hpp>
#include <quillon/face/scale.hpp>
#include <quillon/face/surface.hpp>
#include <quillon/face/video.hpp>
#include <quillon/quillon.h>

#endif /* QUILLON_QUILLON_HPP */
