// The annotator as the fuzz entries drive it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>

#include "host/design/ndm.h"

namespace lun_fuzz {

// A fresh example design annotated with one constraint file: data[0] chooses the options (bit
// 0: an NCF, else a UCF; bit 1: set the case sensitivity to bit 2; bit 3: second pass; bit 4:
// best effort; bit 5: allow unmatched location constraints), the rest is the file. Null for
// empty data and after a fatal message.
std::unique_ptr<Ndm_Design> AnnotatedBlinky(const uint8_t* data, size_t size);

}  // namespace lun_fuzz
