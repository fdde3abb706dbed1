// Detection windows drawn on a picture.
#ifndef HOST_PICTURE_WINDOW_DRAWING_H_
#define HOST_PICTURE_WINDOW_DRAWING_H_

#include "host/picture/picture.h"
#include "vexa/io_info.h"

namespace vexa::host {

// Each window that has an area becomes a frame in its own colour with its number in the upper left corner: bold when it
// is switched on, else thin; crossed out when it masks. Areas are in ten-thousandths of the picture's sides; what lies
// outside is cut off.
void draw_windows(Picture& picture, const SLibDDetectionParam& setting);

}  // namespace vexa::host

#endif  // HOST_PICTURE_WINDOW_DRAWING_H_
