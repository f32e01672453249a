// An arbitrary image record as a BMP: the sizes in its headers are those of the file.

#include "imageInput.h"
#include <hearth/hearth.h>

#include <cstring>

using namespace quillon::fuzz;

namespace {

uint32_t fieldAt(const DynBuf &file, size_t offset) {
    uint32_t field;
    std::memcpy(&field, file.data + offset, sizeof field);
    return field;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    Input input(data, size);
    chooseTarget(input.byte());
    const InputImage image(input);
    DynBuf file = {};
    try {
        if (ImageUtil_ConstructBMPBuffer(&image.info, &file)) {
            require(file.size >= 54 && file.size == fieldAt(file, 2));
            require(file.size == uint64_t{fieldAt(file, 10)} + fieldAt(file, 34));
            require(fieldAt(file, 18) == image.info.width &&
                    fieldAt(file, 22) == image.info.height);
        }
    } catch (const Panicked &) { // a depth that does not exist
    }
    DynBuf_Destroy(&file);
    return 0;
}
