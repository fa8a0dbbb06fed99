// A client of the installed library; main.cpp compiles the same code as C++.
// The log hook, an NV21 frame to RGBA, the result to JPEG and back through
// the codec module installed beside the library, and the image object's
// layout as the language sees it.
#include <qkcore/qkcore.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#define AT(image, field) (int)((char*)&(image)->field - (char*)(image))

static int errors;
static int count(int level, ...) { return errors += level == QK_LOG_ERROR; }

static const char* name(uint32_t format) {
    switch (format) {  // format codes are constant expressions
        case QK_FORMAT_NV21: return "NV21";
        case QK_FORMAT_RGBA: return "RGBA";
        case QK_FORMAT_JPEG: return "JPEG";
        default: return "other";
    }
}

int main(void) {
    HX_LogMsg = count;
    QKStatus refused = (QKStatus)QKImage_convert(NULL, NULL);
    QKImage* frame = QKImage_createNew(64, 48, QK_FORMAT_NV21);
    QKImage* rgba = QKImage_createNew(64, 48, QK_FORMAT_RGBA);
    QKImage* back = QKImage_createEmpty(1, 1, QK_FORMAT_RGBA);
    printf("layout %d: %d %d %d %d %d %d %d; refused %d, %d error\n", (int)sizeof(QKImage), AT(frame, data),
           AT(frame, width), AT(frame, height), AT(frame, format), AT(frame, isWrapped), AT(frame, size),
           AT(frame, chromaOffset), refused, errors);

    memset(frame->data, 81, 64 * 48);  // luma, then V and U pairs: a red
    for (uint64_t i = 64 * 48; i < frame->size; i += 2) frame->data[i] = 240, frame->data[i + 1] = 90;
    int32_t status = QKImage_convert(frame, rgba);
    const uint8_t* p = rgba->data;
    printf("%s to %s: %d, pixel %u %u %u %u\n", name(frame->format), name(rgba->format), status, p[0], p[1], p[2],
           p[3]);
    QKImage* jpeg = QKImage_encodeToJpeg(rgba, 90);
    if (jpeg == NULL) return 1;
    status = QKImage_decodeFromJpeg(back, jpeg->data, jpeg->size);
    printf("%s %02x%02x: decoded %d, %dx%d, red within 3: %d\n", name(jpeg->format), jpeg->data[0], jpeg->data[1],
           status, back->width, back->height, abs(back->data[0] - p[0]) <= 3);
    QKImage_destroy(jpeg);
    QKImage_destroy(back);
    QKImage_destroy(rgba);
    QKImage_destroy(frame);
    return 0;
}
