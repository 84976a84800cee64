#include "tag_phase.h"

#include <algorithm>
#include <utility>

#include "planner.h"
#include "text.h"

namespace zano::index {
namespace {

constexpr std::size_t kBatchBytes = std::size_t{16} << 20U;
constexpr std::chrono::seconds kBatchAge(2);
/* While a batch is written, readers get new work after this many songs. */
constexpr std::size_t kSongsBetweenPumps = 64;
/* A process for fewer files than this is not worth its start. */
constexpr std::size_t kFilesPerReader = 16;

constexpr std::chrono::milliseconds kWait(100);

mediadb::Song songOf(const ListedFile &file, Tags &&tags) {
    mediadb::Song song;
    song.path = file.path;
    song.stamp = file.stamp;
    song.Tags::operator=(std::move(tags));
    if (song.title.empty()) {
        song.title = titleOfPath(file.path);
    }
    return song;
}

std::size_t bytesOf(const mediadb::Song &song) {
    return sizeof song + song.path.size() + song.title.size() + song.album.size() +
           song.artist.size() + song.albumArtist.size() + song.genre.size();
}

std::size_t readersFor(std::size_t files, std::size_t most) {
    return std::clamp<std::size_t>(files / kFilesPerReader, 1, std::max<std::size_t>(most, 1));
}

}  // namespace

TagPhase::TagPhase(Session &session, const PathList &files, const Options &options)
    : session_(session),
      files_(files),
      total_(static_cast<std::int64_t>(files.size())),
      batchSongs_(options.batchSongs),
      pool_(*this, readersFor(files.size(), options.readers), options.limits) {}

void TagPhase::run() {
    while (!session_.stop.isMade() && pool_.pump(kWait)) {
        session_.progress.show(Phase::kReading, done_, total_);
        if (isBatchDue()) {
            writeBatch();
        }
    }
    while (!pending_.empty()) {
        writeBatch();
    }
}

void TagPhase::answer(const ListedFile &file, ReadAnswer &&answer) {
    ++done_;
    if (answer.status == ReadStatus::kRead) {
        addPending({songOf(file, std::move(answer.tags)),
                    file.isKnown ? &Summary::updated : &Summary::added});
        return;
    }
    session_.fileFailed(file.path, reasonText(answer));
    if (isFaultOfFile(answer.status)) {
        // Such a file may well be music, so it is listed by its name.
        auto song = songOf(file, {});
        song.stamp = faultyStamp(song.stamp);
        addPending({std::move(song), nullptr});
    }
}

void TagPhase::addPending(PendingSong &&pending) {
    if (pending_.empty()) {
        firstPending_ = Clock::now();
    }
    pendingBytes_ += bytesOf(pending.song);
    pending_.push_back(std::move(pending));
}

bool TagPhase::isBatchDue() const {
    return !pending_.empty() && (pending_.size() >= batchSongs_ || pendingBytes_ >= kBatchBytes ||
                                 Clock::now() - firstPending_ >= kBatchAge);
}

void TagPhase::writeBatch() {
    const auto songs = std::exchange(pending_, {});
    pendingBytes_ = 0;
    Batch batch(session_.catalogue);
    for (std::size_t i = 0; i < songs.size(); ++i) {
        session_.catalogue.putSong(songs[i].song);
        if (i % kSongsBetweenPumps == 0 && !session_.stop.isMade()) {
            pool_.pump(std::chrono::milliseconds(0));
        }
    }
    batch.commit();
    for (const auto &song : songs) {
        if (song.count != nullptr) {
            ++(session_.summary.*song.count);
        }
    }
}

}  // namespace zano::index
