/** @file quillon.h
 *
 * All of libquillon.
 */
#ifndef QUILLON_QUILLON_H
#define QUILLON_QUILLON_H

#include <quillon/imageUtil.h>
#include <quillon/raster.h>
#include <quillon/rasterCursor.h>
#include <quillon/rasterVideo.h>
#include <quillon/rect.h>
#include <quillon/version.h>

#endif /* QUILLON_QUILLON_H */
