/* The header line Range (RFC 9110, section 14). */
#pragma once

#include <cstdint>
#include <string_view>

namespace webapi {

enum class Wanted {
    kWhole,  // no range, or one that is passed over: of another unit, malformed, or several
    kPart,
    kNothing,  // a range beyond the end
};

struct ByteRange {
    Wanted wanted;
    std::int64_t first;  // of kPart, both inclusive
    std::int64_t last;
};

/* What is wanted of `size` bytes by the value of a line Range; "" for none. */
ByteRange byteRangeOf(std::string_view range, std::int64_t size);

}  // namespace webapi
