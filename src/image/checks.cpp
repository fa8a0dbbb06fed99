#include "image/checks.h"

#include <stdint.h>

#include "qkcore/qk_image.h"

namespace qk {

bool buffer_holds_image(const QKImage& image) {
    uint64_t needed = QKImage_requiredSize(image.width, image.height, image.format);
    if (needed == 0) {
        // Dimensions whose picture passes the largest byte count fit no
        // buffer, whatever size it records. Without a size rule or with a
        // dimension below 1 there is no picture to read.
        return image.width < 1 || image.height < 1 || QKImage_requiredSize(1, 1, image.format) == 0;
    }
    if (image.size != 0 && image.chromaOffset != 0 && is_yuv420_format(image.format)) {
        needed = yuv420_extent(chroma_base(image), image.width, image.height);
    }
    return QKImage_size(&image) >= needed;
}

}  // namespace qk
