/* Drawing pixels and images into a device context or window, at one-to-one scale or zoomed. */
#ifndef ZQVISSVC_DISPLAY_H
#define ZQVISSVC_DISPLAY_H

#include "types.h"

ZQ_BEGIN_C

/* A device context or a window of the system (HDC, HWND), or a canvas, which is both at once.
 * Borrowed by every call; used by one thread at a time. */
typedef void* ZqDeviceContext;
typedef void* ZqWindow;

/* Flags of the drawing calls: at most one format, with or without ZQ_DRAW_BOTTOM_UP. */
enum {
    ZQ_DRAW_GREY_8 = 0,
    ZQ_DRAW_BOTTOM_UP = 1, /* upside down: the buffer's first row at the bottom */
    ZQ_DRAW_COLOUR_24 = 2, /* blue, green, red */
    ZQ_DRAW_COLOUR_32 = 4, /* blue, green, red and one unused byte */
    ZQ_DRAW_GREY_16_BY_2 =
        8, /* 16-bit samples shifted right by 2; below 0 is 0, above 255 is 255 */
    ZQ_DRAW_GREY_16_BY_4 = 16,
    ZQ_DRAW_GREY_16_BY_6 = 32,
    ZQ_DRAW_GREY_16_BY_8 = 64
};

/* Draws a rectangle of a buffer at one-to-one scale.
 * pixels          borrowed; top + height rows of exactly left + width pixels each, without padding.
 * left, top, width, height  the rectangle in the buffer, in pixels. Nothing is drawn for an empty
 * one, one too large for memory, and one that starts before the buffer (unless it goes to (left,
 * top) and the clip box leaves only what is inside).
 * x, y            logical units; where the rectangle's top-left pixel goes.
 * flags           see above.
 * Returns 0, also when the system refuses to draw; else, found in this order,
 * ZQ_ERR_BUFFER_NULL_PATH without a device context, ZQ_ERR_BUFFER_NULL_BUFFER without pixels,
 * ZQ_ERR_BUFFER_MODE for unknown flags. */
ZQ_API uint32_t ZQ_CALL Gen_PlotImageToDC(ZqDeviceContext dc, const void* pixels, int32_t left,
                                          int32_t top, int32_t width, int32_t height, int32_t x,
                                          int32_t y, uint32_t flags);

/* The same into a window; ZQ_ERR_BUFFER_NULL_PATH also for a window without device context. */
ZQ_API uint32_t ZQ_CALL Gen_PlotImage(ZqWindow window, const void* pixels, int32_t left,
                                      int32_t top, int32_t width, int32_t height, int32_t x,
                                      int32_t y, uint32_t flags);

/* Draws a whole buffer at an integer zoom over a window's client area, centred where it is smaller
 * and scrolled where it is larger, with the background pattern around it.
 * window   null: an empty client area.
 * pixels   height rows of width pixels; null: the client area shows the background alone.
 * zoom     1 to 16 enlarges, -1 to -16 shrinks so many times, 0 is one-to-one; others count as the
 * nearest of these.
 * xOffset, yOffset  device pixels that lie left of and above the client area.
 * dc       null: the window's own, got and released.
 * Returns 0 or the codes of Gen_PlotImageToDC (unknown flags matter with pixels only). The device
 * context keeps the mapping that was set. */
ZQ_API uint32_t ZQ_CALL Gen_PlotZoomedImage(ZqWindow window, const void* pixels, int32_t zoom,
                                            int32_t width, int32_t height, int32_t xOffset,
                                            int32_t yOffset, uint32_t flags, ZqDeviceContext dc);

/* The same for an image of any type, which is locked meanwhile. 16-bit grey shows its bit depth, or
 * without one smallest to largest sample; floats smallest to largest; complex pixels the spectrum.
 * image    null: the background alone.
 * bottomUp not 0: upside down.
 * Also returns ZQ_ERR_NOT_AN_IMAGE and ZQ_ERR_NOT_ENOUGH_MEMORY; 0 and draws nothing for an image
 * that another thread disposes while the call waits for its lock. */
ZQ_API ZqError ZQ_CALL ZqDrawImage(ZqWindow window, ZqImageHandle image, int32_t zoom,
                                   int32_t xOffset, int32_t yOffset, int32_t bottomUp,
                                   ZqDeviceContext dc);

/* Position in a window as a position in the image that is drawn there: x and y scaled by the
 * context's logical over its device extents, less the offsets.
 * rectangle  written: left, top, left + scaled x, top + scaled y.
 * Returns 0, ZQ_ERR_BUFFER_NULL_PATH without a window, ZQ_ERR_NULL_POINTER without a rectangle. */
ZQ_API uint32_t ZQ_CALL Gen_GetImageClientPos(ZqWindow window, int32_t x, int32_t y,
                                              int32_t xOffset, int32_t yOffset,
                                              ZqCoordinates* rectangle);

/* Fills a rectangle behind an image, brush origin at its top-left corner.
 * rectangle   logical units; the mapping is one-to-one without origins afterwards.
 * excluded    not painted, its corners in any order; null: none. Afterwards it belongs to the clip
 * region.
 * colour, backgroundColour  0x00BBGGRR.
 * brushStyle  0 plain; 1 none; 2 hatched with `hatch` (0 to 5); 3 and 5 to 8 the button-face
 * pattern.
 * Returns the last system call's result: 0 without a device context or rectangle, and for a brush
 * that cannot be made when nothing is excluded; else 1. */
ZQ_API int32_t ZQ_CALL DrawImageBackground2(ZqDeviceContext dc, const ZqCoordinates* rectangle,
                                            const ZqCoordinates* excluded, uint32_t colour,
                                            uint32_t backgroundColour, int32_t brushStyle,
                                            int32_t hatch);

/* 1 where bitmaps of more than 1024 pixels a side can be drawn at once, else 0. */
ZQ_API int32_t ZQ_CALL CanDisplayLargeBitmaps(void);

/* ---- Canvases: windows in memory, the same on every system. */

/* Makes a black canvas. *canvas is owned by the caller, who frees it with ZqDisposeCanvas.
 * Returns 0, ZQ_ERR_NULL_POINTER, ZQ_ERR_INVALID_PARAMETER for a side below 1 or above 32767,
 * ZQ_ERR_NOT_ENOUGH_MEMORY. */
ZQ_API ZqError ZQ_CALL ZqNewCanvas(int32_t width, int32_t height, ZqDeviceContext* canvas);

/* Returns 0, or ZQ_ERR_NOT_AN_OBJECT for what is no living canvas. */
ZQ_API ZqError ZQ_CALL ZqDisposeCanvas(ZqDeviceContext canvas);

/* Rows of width pixels 0x00RRGGBB, top row first, valid while the canvas lives; null for what is no
 * living canvas. */
ZQ_API uint32_t* ZQ_CALL ZqGetCanvasPixels(ZqDeviceContext canvas);

/* Limits drawing to a rectangle in pixels; null: the whole canvas. Returns as ZqDisposeCanvas. */
ZQ_API ZqError ZQ_CALL ZqSetCanvasClip(ZqDeviceContext canvas, const ZqCoordinates* clip);

ZQ_END_C

#endif
