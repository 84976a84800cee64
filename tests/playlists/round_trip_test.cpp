/* What the library writes is read back entry for entry in each form, whatever the names are, and
 * although most of the files are not there. */
#include <vorelix/playlists/playlist.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>

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

    /* Every printable character of ASCII but /, and others of each length. */
    std::string text(int length, const std::vector<std::string> &others) {
        std::string made;
        while (static_cast<int>(made.size()) < length) {
            const char c = static_cast<char>(' ' + below('~' - ' ' + 1));
            made += oneIn(8)
                        ? others[static_cast<std::size_t>(below(static_cast<int>(others.size())))]
                        : std::string(1, c == '/' ? 'x' : c);
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
        ZANO_PLAYLIST_REC given{};
        ZANO_PLAYLIST_REC read{};
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
        Entry made;
        ZANO_MEDIA_INFO &given = made.given.info;
        ZANO_MEDIA_INFO &read = made.read.info;
        if (oneIn(4)) {
            given = read = songs_[static_cast<std::size_t>(below(static_cast<int>(songs_.size())))];
            return made;
        }
        tagged(given);
        if (withTags) {
            read = given;
            read.duration = given.title[0] == '\0' ? 0 : std::trunc(given.duration);
        }
        const std::array<std::array<std::string, 2>, 4> kinds = {{
            {(music() / "").string(), (music() / "").string()},
            {music().parent_path().string() + "/", music().parent_path().string() + "/"},
            {"http://radio/", "http://radio/"},
            {"", (music() / "").string()},
        }};
        const auto &kind = kinds.at(static_cast<std::size_t>(below(4)));
        const std::string rest = path().substr(0, 4095 - kind[1].size());

        fill(given.path, kind[0] + rest);
        fill(read.path, kind[1] + rest);
        return made;
    }

    static void join(std::vector<Entry> &entries) {
        for (std::size_t i = 1; i < entries.size(); ++i) {
            entries[i - 1].given.next = &entries[i].given;
            entries[i - 1].read.next = &entries[i].read;
        }
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
        std::vector<Entry> entries;
        for (int left = below(12); left > 0; --left) {
            entries.push_back(entry(form == std::string("m3u")));
        }
        join(entries);
        ASSERT_EQ(
            ZANOWriteMusicPlaylist(entries.empty() ? nullptr : &entries[0].given, file.c_str()), 0);
        const std::string read = dump(file);
        ASSERT_EQ(read, dump(entries.empty() ? nullptr : &entries[0].read,
                             static_cast<int>(entries.size())))
            << file << " in round " << round;
    }
}

}  // namespace
}  // namespace zano::playlists
