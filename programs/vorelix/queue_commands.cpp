/* queue show, save, append and random. */
#include <limits>

#include "commands.h"
#include "failure.h"
#include "json.h"
#include "paging.h"
#include "playlist_answers.h"
#include "playlist_entries.h"
#include "playlist_input.h"
#include "queue_file.h"
#include "text.h"

namespace vorelix {

namespace {

Deadline deadlineOf(const Request &request) {
    return vorelix::deadlineOf(request.playlist.waitSeconds);
}

std::string pathOf(const Request &request) {
    return absolutePath(request.state.name);
}

/* {"path", "state"} */
Json::Value queueObject(const std::string &path, const PlaylistInfo &queue) {
    Json::Value object(Json::objectValue);
    object["path"] = validUtf8(path);
    for (const int word : queue.playerInfo->state) {
        object["state"].append(word);
    }
    return object;
}

template <std::size_t Size>
void terminate(char (&text)[Size]) {
    text[Size - 1] = '\0';
}

/* The records of a file may be anything. */
void terminateTexts(ZANO_MEDIA_INFO &song) {
    terminate(song.path);
    terminate(song.title);
    terminate(song.artist);
    terminate(song.album);
    terminate(song.genre);
}

/* A page of a queue, whose total is that of all songs. */
Queue pageOf(const std::string &path, const Span &span, Deadline deadline) {
    // The library places songs with 32 bits.
    constexpr auto kMostOffset =
        std::numeric_limits<unsigned>::max() / static_cast<unsigned>(sizeof(ZANO_MEDIA_INFO));
    Queue queue = readQueue(path, 0, -1, deadline);
    if (span.offset >= queue->playerInfo->total) {
        return queue;
    }
    if (static_cast<unsigned>(span.offset) > kMostOffset) {
        throw Failure("could not show songs behind the first " + std::to_string(kMostOffset) +
                      " of a queue");
    }
    return readQueue(path, span.offset, span.limit, deadline);
}

std::string textOfQueue(const std::vector<Placed> &page, int total, const Request &request,
                        const Terminal &terminal) {
    if (total == 0) {
        return "no songs yet; add some by their ids: vorelix queue append\n";
    }
    const std::string table = page.empty() ? "" : entryTable(page, terminal) + "\n";
    return table + pageLine("songs", request, static_cast<int>(page.size()), total) + "\n";
}

std::string textOfState(const PlaylistInfo &queue) {
    std::string text = "the player's state:";
    for (const int word : queue.playerInfo->state) {
        text += " " + std::to_string(word);
    }
    return text + "\n";
}

/* What a command left in the file. */
struct Written {
    Json::Value queue;
    size_t total = 0;
};

/* Puts what make() gives in the place of the file. */
Written written(const Request &request, const std::function<Queue()> &make) {
    Written outcome;
    const std::string path = pathOf(request);
    replaceQueue(path, deadlineOf(request), [&] {
        Queue queue = make();
        outcome = {queueObject(path, *queue), queue->songs.size()};
        return queue;
    });
    return outcome;
}

Outcome answerOf(const Request &request, const Written &outcome, const std::string &what) {
    if (request.json) {
        Json::Value answer(Json::objectValue);
        answer["queue"] = outcome.queue;
        answer["total"] = Json::UInt64{outcome.total};
        return {documentOf(answer), ""};
    }
    const std::string songs =
        std::to_string(outcome.total) + (outcome.total == 1 ? " song" : " songs");
    return {what + " " + printable(pathOf(request)) + ", which has " + songs + " now\n", ""};
}

void requireQueue(const std::string &path, const char *otherwise) {
    if (trailingBytesOf(path) != 0) {
        throw Failure("could not change " + printable(path) +
                      ": by its size it is no queue, or a damaged one; " + otherwise);
    }
}

/* A new queue in the place of any that is there. */
Outcome made(const Request &request, const Entries &songs) {
    if (!request.playlist.force) {
        requireQueue(pathOf(request), "--force replaces it");
    }
    const Written outcome = written(request, [&] {
        auto queue = std::make_unique<PlaylistInfo>();
        appendSongs(*queue, songs);
        return queue;
    });
    return answerOf(request, outcome, "saved");
}

}  // namespace

Outcome queueShowCommand(const Request &request, const Terminal &terminal) {
    const std::string path = pathOf(request);
    const Queue queue = pageOf(path, request.span, deadlineOf(request));
    const int total = queue->playerInfo->total;
    std::vector<Placed> page;
    for (ZANO_MEDIA_INFO *song : queue->songs) {
        terminateTexts(*song);
        page.push_back({static_cast<size_t>(request.span.offset) + page.size() + 1, song});
    }
    const long long trailing = trailingBytesOf(path);
    if (request.json) {
        Json::Value answer(Json::objectValue);
        answer["queue"] = queueObject(path, *queue);
        answer["entries"] = entryArray(page);
        answer["trailingBytes"] = Json::Int64{trailing};
        return {documentOf(withSpan(answer, request.span, total)), ""};
    }
    const std::string rest =
        trailing == 0 ? ""
                      : "bytes at the end that are no song: " + std::to_string(trailing) + "\n";
    return {textOfQueue(page, total, request, terminal) + textOfState(*queue) + rest, ""};
}

Outcome queueSaveCommand(const Request &request, const Terminal &) {
    const SongList list = newEntries(wantedEntries(request.playlist.songs, request.playlist.paths));
    return made(request, entriesOf(list));
}

/* Not by PlaylistRandomCreate, which makes an empty queue when the media database cannot answer. */
Outcome queueRandomCommand(const Request &request, const Terminal &) {
    const Listing listing = listSongs({}, {.by = "random"}, {.limit = request.span.limit});
    return made(request, entriesOf(listing.songs));
}

Outcome queueAppendCommand(const Request &request, const Terminal &) {
    const SongList list = newEntries(wantedEntries(request.playlist.songs, request.playlist.paths));
    const std::string path = pathOf(request);
    const Written outcome = written(request, [&] {
        Queue queue = readQueue(path, 0, 0, deadlineOf(request));
        requireQueue(path, "make a new one: vorelix queue save --force");
        appendSongs(*queue, entriesOf(list));
        return queue;
    });
    return answerOf(request, outcome, "appended to");
}

}  // namespace vorelix
