// Placeholder: replaced by the file implementation.
#include "qkcore/qk_image.h"

int32_t QKImage_saveToFile(const QKImage*, const char*, int32_t) { return QK_ERROR_UNKNOWN; }
int32_t QKImage_loadFromFile(QKImage*, const char*) { return QK_ERROR_IO_FAILED; }
void save_to_file(const char*, unsigned char*, unsigned int) {}
int64_t fsize(FILE*) { return -1; }
