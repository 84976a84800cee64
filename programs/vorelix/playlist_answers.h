/* What the playlist commands answer with. */
#pragma once

#include <json/value.h>
#include <string>

#include "playlist_catalogue.h"
#include "playlist_entries.h"
#include "terminal.h"

namespace vorelix {

/* An entry and its position, from 1. */
struct Placed {
    size_t position;
    const ZANO_MEDIA_INFO *entry;
};

/* 'Road' (playlist 5) */
std::string shownName(const Playlist &playlist);

/* "1 entry", "2 entries" */
std::string entryCount(size_t count);

std::string entryTable(const std::vector<Placed> &entries, const Terminal &terminal);

/* {"id", "title", "folder", "path"}; see songObject for a path that is not UTF-8. */
Json::Value playlistObject(const Playlist &playlist);

Json::Value entryArray(const std::vector<Placed> &entries);

}  // namespace vorelix
