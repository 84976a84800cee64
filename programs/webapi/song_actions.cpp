#include "song_actions.h"

#include <vorelix/users/audiousers.h>

#include "music_folder.h"
#include "rights.h"
#include "song_answers.h"
#include "songs.h"
#include "span.h"

namespace webapi {

namespace {

constexpr const char *kCategories[] = {"any", "title", "artist", "album", "genre"};
constexpr const char *kSorts[] = {"title", "artist", "album", "genre", "year", "duration", "track"};
constexpr const char *kDirections[] = {"asc", "desc"};
constexpr const char *kColumns[] = {"artist", "album", "genre"};

bool isDescending(const Parameters &parameters) {
    return parameters.choice("direction", kDirections) == kDirections[1];
}

/* Songs elsewhere are not shown, for they cannot be played. */
vorelix::Filter belowMusicFolder() {
    vorelix::Filter filter;
    filter.folder = MusicFolder().path();
    return filter;
}

vorelix::Filter filterOf(const Parameters &parameters) {
    vorelix::Filter filter = belowMusicFolder();
    filter.keyword = parameters.text("keyword");
    filter.in = parameters.choice("category", kCategories);
    for (const char *column : kColumns) {
        if (parameters.has(column)) {  // "" are the songs without
            filter.exact.push_back({column, parameters.text(column)});
        }
    }
    return filter;
}

}  // namespace

Json::Value RightsAction::answer() {
    const unsigned mask = AudioUsers::GetUserPermission(request().user);
    Json::Value answer;
    answer["user"] = request().user;
    answer["mask"] = mask;
    for (const vorelix::Right &right : vorelix::kRights) {
        answer[right.name] = (mask & right.bit) != 0;
    }
    return answer;
}

Json::Value SongsAction::answer() {
    const vorelix::Filter filter = filterOf(parameters());
    const vorelix::Order order{parameters().choice("sort", kSorts), isDescending(parameters())};
    const auto listing = vorelix::listSongs(filter, order, spanOf(parameters()));
    Json::Value answer;
    answer["songs"] = songArray(listing.songs.get());
    // Of this very query. ZANOPageTotalRowCount counts other songs for an exact artist, and for a
    // keyword with a % in it, and would count a second time what ZANOMusicBrowse has counted.
    answer["total"] = listing.total;
    return answer;
}

Json::Value BrowseAction::answer() {
    if (!parameters().has("by")) {
        throw Refusal(kBadRequest, "by");
    }
    const vorelix::Order order{"", isDescending(parameters())};
    const auto listing = vorelix::listValues(parameters().choice("by", kColumns),
                                             belowMusicFolder(), order, spanOf(parameters()));
    Json::Value answer;
    Json::Value &names = answer["names"] = Json::Value(Json::arrayValue);
    for (const auto *row = listing.songs.get(); row != nullptr; row = row->next) {
        names.append(row->info.title);
    }
    answer["total"] = listing.total;
    return answer;
}

Json::Value RandomAction::answer() {
    const vorelix::Span span{0, spanOf(parameters()).limit};
    const auto listing = vorelix::listSongs(belowMusicFolder(), {.by = "random"}, span);
    Json::Value answer;
    answer["songs"] = songArray(listing.songs.get());
    return answer;
}

}  // namespace webapi
