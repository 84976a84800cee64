#include "transfer.h"

#include <zanoplatform/error.h>

#include "located.h"

namespace zano::mediadb {
namespace {

std::string counted(std::int64_t count, const char *what) {
    return std::to_string(count) + " " + what + (count == 1 ? "" : "s");
}

void requireRoom(Replacement &target, bool replace) {
    const Contents former = target.contents();
    if (!replace && former.songs + former.playlists + former.notices > 0) {
        throw DatabaseError(KLIB_ERR_DATABASE_FILLED,
                            "it holds " + counted(former.songs, "song") + " and " +
                                counted(former.playlists, "playlist") + " already" +
                                (former.notices > 0 ? ", and " + counted(former.notices, "notice") +
                                                          " that zanoindex has to take"
                                                    : ""));
    }
}

class Copy {
  public:
    Copy(const std::string &from, const std::string &to)
        : from_(from),
          to_(to),
          source_(at(from, [&] { return openSnapshot(from); })),
          target_(at(to, [&] { return openReplacement(to); })) {}

    Contents run(bool replace, const CopyProgress &progress) {
        at(to_, [&] {
            if (source_->identity() == target_->identity()) {
                throw DatabaseError(KLIB_ERR_BAD_PARAMETER,
                                    "it is the database to copy from, by another name perhaps");
            }
            requireRoom(*target_, replace);
        });
        const Contents lastIds = at(from_, [&] {
            total_ = source_->contents();
            return source_->lastIds();
        });
        at(to_, [&] { target_->clear(); });
        at(from_, [&] {
            source_->forEachSong(adding<SongRow>(progress));
            source_->forEachPlaylist(adding<PlaylistRow>(progress));
            source_->forEachNotice(adding<Notice>(progress));
        });
        at(to_, [&] { target_->commit(lastIds); });
        return total_;
    }

  private:
    template <typename Row>
    std::function<void(const Row &)> adding(const CopyProgress &progress) {
        return [this, &progress](const Row &row) {
            at(to_, [&] { target_->add(row); });
            ++done_;
            if (progress.rows) {
                progress.rows(done_, total_.songs + total_.playlists + total_.notices);
            }
        };
    }

    const std::string &from_;
    const std::string &to_;
    std::unique_ptr<Snapshot> source_;
    std::unique_ptr<Replacement> target_;
    Contents total_;
    std::int64_t done_ = 0;
};

void finishCopy(const std::string &to, const Catalogue::Progress &progress) {
    try {
        openCatalogue(to)->finish(progress);
    } catch (const DatabaseError &error) {
        throw DatabaseError(error.code(),
                            std::string("all rows were copied, but the orders and the search index "
                                        "are still to be made: ") +
                                error.what());
    }
}

}  // namespace

Contents copyDatabase(const std::string &from, const std::string &to, bool replace,
                      const CopyProgress &progress) {
    const Contents copied = Copy(from, to).run(replace, progress);
    at(to, [&] { finishCopy(to, progress.indexes); });
    return copied;
}

}  // namespace zano::mediadb
