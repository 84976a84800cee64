/* What the library writes is read back entry for entry in each form, whatever the names are, and
 * although most of the files are not there. */
#include <vorelix/playlists/playlist.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>
#include <deque>

#include "platform/playlists/music.h"

namespace zano::playlists {
namespace {

template <std::size_t Size>
void fill(char (&field)[Size], const std::string &text) {
    std::memset(field, 0, Size);
    ASSERT_LT(text.size(), Size);
    std::copy(text.begin(), text.end(), field);
}

class RoundTripTest : public MusicTest {
  protected:
    RoundTripTest() {
        MEDIA_DB_RESULT *rows =
            MediaInfoDBOpen(MEDIA_TABLE_SONGS, "*", nullptr, nullptr, nullptr, 0, 100, 0);
        for (songs_.emplace_back(); MediaInfoDBGet(rows, &songs_.back()) == 0;) {
            songs_.emplace_back();
        }
        songs_.pop_back();
        MediaInfoDBClose(rows);
    }

    int below(int end) { return std::uniform_int_distribution(0, end - 1)(random_); }
    bool oneIn(int cases) { return below(cases) == 0; }

    template <typename Value>
    const Value &oneOf(const std::vector<Value> &values) {
        return values[static_cast<std::size_t>(below(static_cast<int>(values.size())))];
    }

    /* Every printable character of ASCII but /, and others of each length. */
    std::string text(int length, const std::vector<std::string> &others) {
        std::string made;
        while (static_cast<int>(made.size()) < length) {
            const char c = static_cast<char>(' ' + below('~' - ' ' + 1));
            made += oneIn(8) ? oneOf(others) : std::string(1, c == '/' ? 'x' : c);
        }
        return made;
    }
    std::string name(int length) {
        return text(length, {"\u00e9", "e\u0301", "\u20ac", "\U0001F3B5", "\xff", "\xc3", "&amp;",
                             "%20", "..", "\\", "\"/>"});
    }
    std::string tag(int length) {
        return text(length, {"\u00e9", "\U0001F3B5", "&lt;", "#EXTINF:"});
    }

    /* One letter keeps names apart from the steps "." and "..". */
    std::string path() {
        std::string made = "a" + name(1 + below(30));
        for (int depth = below(5); depth > 0; --depth) {
            made += "/b" + name(below(20));
        }
        return oneIn(20) ? made + std::string(4000 - made.size(), 'l') : made;
    }

    /* An entry, and what it is once it has been written and read. */
    struct Entry {
        ZANO_MEDIA_INFO given{};
        ZANO_MEDIA_INFO read{};
    };

    void tagged(ZANO_MEDIA_INFO &info) {
        fill(info.title, oneIn(3) ? "" : tag(below(200)));
        fill(info.artist, oneIn(2) ? "" : tag(below(200)));
        fill(info.album, oneIn(2) ? "" : tag(below(200)));
        fill(info.genre, oneIn(2) ? "" : tag(below(50)));
        info.year = below(3) * 1000;
        info.disc = below(3);
        info.track = below(100);
        info.duration = static_cast<float>(below(400000)) / 100 - 1;
    }

    Entry entry(bool withTags) {
        if (oneIn(4)) {
            const ZANO_MEDIA_INFO &song = oneOf(songs_);
            return {song, song};
        }
        Entry made;
        tagged(made.given);
        if (withTags) {
            made.read = made.given;
            made.read.duration = made.given.title[0] == '\0' ? 0 : std::trunc(made.given.duration);
        }
        const std::string folder = (music() / "").string();
        const auto place =
            oneOf<std::string>({folder, music().parent_path().string() + "/", "http://radio/", ""});
        const std::string &readAt = place.empty() ? folder : place;
        const std::string rest = path().substr(0, 4095 - readAt.size());
        fill(made.given.path, place + rest);
        fill(made.read.path, readAt + rest);
        return made;
    }

  private:
    std::vector<ZANO_MEDIA_INFO> songs_;
    std::mt19937 random_{20};
};

TEST_F(RoundTripTest, WhatIsWrittenIsReadBack) {
    for (int round = 0; round < 300; ++round) {
        const char *const form =
            std::array{"m3u", "pls", "wpl"}.at(static_cast<std::size_t>(round % 3));
        const std::string file = (music() / "list.").string() + form;
        std::deque<Entry> entries;
        std::vector<ZANO_MEDIA_INFO *> given;
        std::string expected;
        for (int left = below(12); left > 0; --left) {
            entries.push_back(entry(form == std::string("m3u")));
            given.push_back(&entries.back().given);
            const ZANO_PLAYLIST_REC read{entries.back().read, {nullptr}};
            expected += dump(&read, 1);
        }
        given.push_back(nullptr);
        ASSERT_EQ(ZANOWriteMusicPlaylistWithMediaList(given.data(), file.c_str()), 0);
        ASSERT_EQ(dump(file), expected) << file << " in round " << round;
    }
}

}  // namespace
}  // namespace zano::playlists
