/* Notices that other programs leave for the indexer (KLIBZanoFileIndexAdd). */
#pragma once

#include <functional>
#include <string>

#include "indexer.h"
#include "session.h"

namespace zano::index {

/* "playlist /music/a.m3u was added" */
std::string noticeText(const mediadb::Notice &notice);

/* Works off all notices that are there: those of songs bring the catalogue up to date with the
 * file; a playlist's row was written by who left the notice. Each goes to onNotice and to the
 * summary, and is removed once all was done for it. */
void consumeNotices(Session &session, Indexer &indexer,
                    const std::function<void(const mediadb::Notice &)> &onNotice);

}  // namespace zano::index
