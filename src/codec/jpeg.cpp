// Placeholder: replaced by the codec implementation.
#include "qkcore/qk_image.h"

QKImage* QKImage_encodeToJpeg(const QKImage*, int32_t) { return nullptr; }
int32_t QKImage_decodeFromJpeg(QKImage*, const void*, uint64_t) { return QK_ERROR_CODEC_FAILED; }
