/* The page that a listing is asked for. */
#pragma once

#include "parameters.h"
#include "songs.h"

namespace webapi {

inline constexpr int kMostRows = 500;
inline constexpr int kUsualRows = 50;

inline vorelix::Span spanOf(const Parameters &parameters) {
    return {parameters.numberOr(0, "offset", {}),
            parameters.numberOr(kUsualRows, "limit", {1, kMostRows})};
}

}  // namespace webapi
