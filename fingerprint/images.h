// Random calls of imageUtil.h.  What is summed up is what the library decides: pixels
// and records, files of BMP, the chunks of a PNG but for its compressed pixels, which
// are zlib's affair.
#pragma once

#include "support/random.h"

namespace quillon::fingerprint {

void decode(test::Random &random); // PNG files of every kind that is read
void encode(test::Random &random); // to PNG, and back
void encodeBmp(test::Random &random);
void combine(test::Random &random);
void cropAndScale(test::Random &random);

} // namespace quillon::fingerprint
