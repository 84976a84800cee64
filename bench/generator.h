/* Makes the songs of a catalogue of any size: the same ones every time, skewed as real libraries
 * are (a few artists have many albums, a few genres most songs), with titles in several scripts.
 *
 * For searches of known frequency, titles hold these words and no other title holds their first
 * letters: "wavelike" every second song, "quixotic" one in 200, "zyzzyvas" twelve in all. No
 * text has a "j".
 */
#pragma once

#include <cstdint>
#include <functional>

#include "mediadb/catalogue.h"

namespace zano::bench {

/* Song number `index` (from 0) of a catalogue of `count`. */
mediadb::Song makeSong(std::int64_t index, std::int64_t count);

/* Puts `count` songs into an empty catalogue and ends the scan. */
using Progress = std::function<void(std::int64_t done)>;
void fill(mediadb::Catalogue &catalogue, std::int64_t count, const Progress &progress);

}  // namespace zano::bench
