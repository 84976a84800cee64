/* What queries give, compared with a list of songs that is sorted and searched by hand. */
#include <algorithm>
#include <cstring>
#include <functional>
#include <map>
#include <set>
#include <tuple>

#include "engines.h"
#include "text/fold.h"

namespace zano::mediadb {
namespace {

auto tailOf(const Song &song) {
    return std::tuple(foldedKey(song.album), song.disc, song.track, foldedKey(song.title),
                      foldedKey(song.artist), foldedKey(song.genre), song.year, song.path,
                      song.duration);
}

/* A column that leads an order, and by what it sorts. */
struct Leading {
    std::string name;
    std::function<std::pair<std::string, double>(const Song &)> keyOf;
};

const std::vector<Leading> &leadingColumns() {
    static const std::vector<Leading> columns = {
        {"lower(title)", [](const Song &song) { return std::pair(foldedKey(song.title), 0.0); }},
        {"artist", [](const Song &song) { return std::pair(foldedKey(song.artist), 0.0); }},
        {"lower(album)", [](const Song &song) { return std::pair(foldedKey(song.album), 0.0); }},
        {"genre", [](const Song &song) { return std::pair(foldedKey(song.genre), 0.0); }},
        {"year", [](const Song &song) { return std::pair("", song.year); }},
        {"duration", [](const Song &song) { return std::pair("", song.duration); }},
        {"path", [](const Song &song) { return std::pair(song.path, 0.0); }},
        {"track", [](const Song &song) { return std::pair("", song.track); }},
    };
    return columns;
}

constexpr const char *kTail = ", album, disc, track, title, artist, genre, year, path, duration ";

/* Songs whose few values meet in every column, so that ties reach down to the path. */
class Songs {
  public:
    explicit Songs(unsigned seed) : random_(seed) {}

    Song make() {
        Song song;
        song.path =
            "/music/" + std::to_string(number(0, 9)) + "/" + std::to_string(next_++) + ".mp3";
        song.title =
            pick({"Alpha", "alpha", "\u00C1lpha", "Beta", "ab", "a", "\u30C9", "100%", ""});
        song.album = pick({"One", "one", "Two", ""});
        song.artist =
            pick({"Beyonc\u00E9", "beyonce", "ABBA", "\u0413\u0440\u0443\u043F\u043F\u0430"});
        song.genre = pick({"Pop", "Rock"});
        song.disc = number(0, 1);
        song.track = number(0, 2);
        song.year = 1999 + number(0, 2);
        song.duration = number(0, 3) + 0.5;
        song.stamp.size = next_;
        return song;
    }
    int number(int low, int high) { return std::uniform_int_distribution(low, high)(random_); }

  private:
    std::string pick(const std::vector<std::string> &values) {
        return values[static_cast<size_t>(number(0, static_cast<int>(values.size()) - 1))];
    }
    std::mt19937 random_;
    int next_ = 0;
};

class ListingTest : public EngineTest {
  protected:
    using Model = std::map<std::string, Song>;

    static std::vector<std::string> expected(const Model &model, const Leading &leading,
                                             bool descending,
                                             const std::function<bool(const Song &)> &keep) {
        std::vector<Song> songs;
        for (const auto &[path, song] : model) {
            if (keep(song)) {
                songs.push_back(song);
            }
        }
        std::sort(songs.begin(), songs.end(), [&](const Song &a, const Song &b) {
            const auto first = leading.keyOf(a);
            const auto second = leading.keyOf(b);
            return first == second ? tailOf(a) < tailOf(b) : descending != (first < second);
        });
        std::vector<std::string> paths;
        for (const Song &song : songs) {
            paths.push_back(song.path);
        }
        return paths;
    }

    static std::vector<std::string> slice(const std::vector<std::string> &all, Page page) {
        const auto begin = std::min(all.size(), static_cast<size_t>(page.offset));
        const auto end = page.limit == 0
                             ? all.size()
                             : std::min(all.size(), begin + static_cast<size_t>(page.limit));
        return {all.begin() + static_cast<std::ptrdiff_t>(begin),
                all.begin() + static_cast<std::ptrdiff_t>(end)};
    }

    /* Every order and direction, a few pages, with and without searches. */
    static void compareAll(const Model &model, const std::string &when) {
        struct Filter {
            std::string condition;
            std::function<bool(const Song &)> keep;
        };
        const auto has = [](const std::string &text, const std::string &part) {
            return foldedKey(text).find(foldedKey(part)) != std::string::npos;
        };
        const std::vector<Filter> filters = {
            {"", [](const Song &) { return true; }},
            {"path like '/music/%' and title ilike '%ALPHA%'",
             [&](const Song &song) { return has(song.title, "alpha"); }},
            {"path like '/music/3/%' and title ilike '%a%'",
             [&](const Song &song) {
                 return has(song.title, "a") && song.path.substr(0, 9) == "/music/3/";
             }},
            {"title ilike '%AB%'", [&](const Song &song) { return has(song.title, "ab"); }},
            {"artist ilike '%\u0440\u0423\u041F%'",
             [&](const Song &song) { return has(song.artist, "\u0440\u0443\u043F"); }},
            {"title ilike '%p_a%'", [&](const Song &song) { return has(song.title, "pha"); }},
            {"(title ilike '%ab%' or artist ilike '%ab%' or album ilike '%ab%')",
             [&](const Song &song) { return has(song.title, "ab") || has(song.artist, "ab"); }},
            {"artist ilike '%yonc%' and genre ilike '%po%' and year > 1999",
             [&](const Song &song) {
                 return has(song.artist, "yonc") && has(song.genre, "po") && song.year > 1999;
             }},
            {"title ilike '%zzz%'", [](const Song &) { return false; }},
            {"not title ilike '%a%'", [&](const Song &song) { return !has(song.title, "a"); }},
            {"title ilike '%100\\%%'", [&](const Song &song) { return has(song.title, "100%"); }},
        };
        for (const Filter &filter : filters) {
            const char *condition = filter.condition.empty() ? nullptr : filter.condition.c_str();
            for (const Leading &leading : leadingColumns()) {
                for (const bool descending : {false, true}) {
                    const auto all = expected(model, leading, descending, filter.keep);
                    const std::string order =
                        " " + leading.name + (descending ? " desc" : " ") + kTail;
                    for (const Page page :
                         {Page{0, 0}, Page{0, 7}, Page{5, 7}, Page{140, 7}, Page{290, 50}}) {
                        ASSERT_EQ(rows(condition, order.c_str(), page), slice(all, page))
                            << when << ": " << filter.condition << order << page.offset;
                    }
                }
            }
            const auto all = expected(model, leadingColumns()[0], false, filter.keep);
            ASSERT_EQ(MediaInfoDBGetCount(0, "*", condition, 0, 0), static_cast<int>(all.size()))
                << when << ": " << filter.condition;
        }
        compareDistinct(model, when);
    }

    static void compareDistinct(const Model &model, const std::string &when) {
        std::set<std::pair<std::string, std::string>> artists;
        std::set<std::string> rockAlbums;
        for (const auto &[path, song] : model) {
            artists.emplace(foldedKey(song.artist), song.artist);
            if (song.genre == "Rock") {
                rockAlbums.insert(song.album);
            }
        }
        std::vector<std::string> names;
        for (const auto &[key, name] : artists) {
            names.push_back(name);
        }
        ASSERT_EQ(rows(nullptr, "lower(artist)", {0, 0}, "artist", " artist as title "), names)
            << when;
        ASSERT_EQ(MediaInfoDBGetCount(0, "DISTINCT artist", nullptr, 0, 0),
                  static_cast<int>(names.size()));
        ASSERT_EQ(rows("genre='Rock'", "album", {0, 0}, "album", "album as title").size(),
                  rockAlbums.size());
        ASSERT_EQ(MediaInfoDBGetCount(0, "DISTINCT album", "genre='Rock'", 0, 0),
                  static_cast<int>(rockAlbums.size()));
    }
};

TEST_P(ListingTest, EveryOrderSearchAndPageAgreesWithAListKeptByHand) {
    Songs songs(1);
    Model model;
    auto catalogue = openCatalogue(location());
    catalogue->begin();
    for (int i = 0; i < 300; ++i) {
        const Song song = songs.make();
        model[song.path] = song;
        catalogue->putSong(song);
    }
    catalogue->commit();
    compareAll(model, "before the end of the first scan");
    catalogue->finish({});
    catalogue->check();
    compareAll(model, "after the first scan");

    for (int batch = 0; batch < 3; ++batch) {
        catalogue->begin();
        for (int i = 0; i < 40; ++i) {
            const Song song = songs.make();
            model[song.path] = song;
            catalogue->putSong(song);
        }
        for (int i = 0; i < 30; ++i) {
            auto victim =
                std::next(model.begin(), songs.number(0, static_cast<int>(model.size()) - 1));
            if (i % 3 == 0) {
                EXPECT_TRUE(catalogue->removeSong(victim->first));
                model.erase(victim);
            } else {
                Song changed = songs.make();
                changed.path = victim->first;
                victim->second = changed;
                catalogue->putSong(changed);
            }
        }
        catalogue->commit();
        catalogue->check();
    }
    compareAll(model, "with stale anchors");
    catalogue->finish({});
    catalogue->check();
    compareAll(model, "after the next scan");
}

/* Each song goes right before the one put before it, so that every gap is used up. */
TEST_P(ListingTest, SongsPutIntoOneGapKeepTheirOrder) {
    auto catalogue = openCatalogue(location());
    put(*catalogue, {song("/m/first", "a"), song("/m/last", "z")});
    std::vector<std::string> expectedOrder = {"/m/last"};
    for (int i = 0; i < 200; ++i) {
        const std::string name = std::to_string(1999 - i);
        catalogue->begin();
        catalogue->putSong(song("/m/" + name, "m" + name));
        catalogue->commit();
        expectedOrder.insert(expectedOrder.begin(), "/m/" + name);
    }
    expectedOrder.insert(expectedOrder.begin(), "/m/first");
    catalogue->check();
    EXPECT_EQ(rows(nullptr,
                   "lower(title)"
                   " , album, disc, track, title, artist, genre, year, path, duration"),
              expectedOrder);
    EXPECT_EQ(found("m18").size(), 100U);
}

TEST_P(ListingTest, SearchIsWhatPeopleMeanByIt) {
    auto catalogue = openCatalogue(location());
    std::vector<Song> songs;
    for (const char *title :
         {"R.E.M.", "Bj\u00F6rk", "AC\u2010DC", "AC\u2011DC", "AC\u2212DC", "\u00D8rsted",
          "Beyonc\u00E9", "\u30C9\u30E9", "\u5317\u4EAC", "Mot\u00F6rhead", "100% \\ 'x' _y",
          "Beyonce\u0301 live", "\u041F\u0415\u0421\u041D\u042F",
          "\u03C3\u03AF\u03C3\u03C5\u03C6\u03BF\u03C2"}) {
        songs.push_back(song("/m/" + std::to_string(songs.size()), title));
    }
    put(*catalogue, songs);
    const std::map<size_t, std::vector<const char *>> byCount = {
        {0, {"\u30C8", "x_y", "beyonce live x"}},
        {1,
         {"MOTORHEAD", "bjork", "orsted", "\u00D8RS", "\u03A3\u038A\u03A3\u03A5\u03A6\u039F\u03A3",
          "\u043F\u0435\u0441\u043D\u044F", "\u30C9", "r.e", "''x''", "100\\%", "\\_y", "\\\\",
          "\u4EAC"}},
        {2, {"beyonce"}},
        {3, {"ac-dc"}},
        {songs.size(), {"", "%", "\u0301"}}};
    for (const auto &[count, keywords] : byCount) {
        for (const char *keyword : keywords) {
            EXPECT_EQ(found(keyword).size(), count) << keyword;
        }
    }
    for (const Song &each : songs) {
        std::vector<std::string> characters;
        for (std::string_view rest = each.title; !rest.empty();) {
            const std::string_view before = rest;
            takeCharacter(rest);
            characters.emplace_back(before.substr(0, before.size() - rest.size()));
        }
        for (size_t begin = 0; begin < characters.size(); ++begin) {
            std::string part;
            for (size_t end = begin; end < characters.size(); ++end) {
                const std::string &c = characters[end];
                part += c == "'" ? "''" : c == "%" || c == "_" || c == "\\" ? "\\" + c : c;
                const auto hits = found(part);
                EXPECT_NE(std::find(hits.begin(), hits.end(), each.path), hits.end())
                    << each.title << " by " << part;
            }
        }
    }
}

TEST_P(ListingTest, FilesOfAFolderAreThoseAtAndBelowIt) {
    auto catalogue = openCatalogue(location());
    put(*catalogue, {song("/m/a/2", "x"), song("/m/a-b/1", "x"), song("/m/a", "x"),
                     song("/m/a/1", "x"), song("/m/b", "x"), song("/m/a0", "x")});
    const auto below = [&catalogue](const std::string &folder) {
        std::string paths;
        catalogue->forEachFile(folder, [&paths](std::string_view path, const FileStamp &) {
            paths.append(path).append(" ");
        });
        return paths;
    };
    EXPECT_EQ(below("/m/a"), "/m/a /m/a/1 /m/a/2 ");
    EXPECT_EQ(below("/m"), "/m/a /m/a-b/1 /m/a/1 /m/a/2 /m/a0 /m/b ");
    EXPECT_EQ(below("/other"), "");
    EXPECT_EQ(below(""), below("/m"));
}

TEST_P(ListingTest, RandomGivesDifferentSongsEachOnce) {
    auto catalogue = openCatalogue(location());
    std::vector<Song> songs;
    for (int i = 0; i < 500; ++i) {
        songs.push_back(song("/m/" + std::to_string(i), i % 2 == 0 ? "even" : "odd"));
    }
    put(*catalogue, songs);
    catalogue->begin();
    for (int i = 0; i < 500; i += 3) {
        catalogue->removeSong("/m/" + std::to_string(i));
    }
    catalogue->commit();
    const auto few = rows(nullptr, "RANDOM()", {0, 50});
    EXPECT_EQ(std::set(few.begin(), few.end()).size(), 50U);
    EXPECT_NE(few, rows(nullptr, "RANDOM()", {0, 50}));
    const auto all = rows(nullptr, "random()");
    EXPECT_EQ(std::set(all.begin(), all.end()).size(), 333U);
    const auto odd = rows("title='odd'", "RANDOM()", {0, 20});
    EXPECT_EQ(odd.size(), 20U);
    for (const std::string &path : odd) {
        EXPECT_EQ(std::stoi(path.substr(3)) % 2, 1);
    }
    EXPECT_EQ(rows(nullptr, "RANDOM()", {330, 50}).size(), 3U);
    EXPECT_EQ(rows(nullptr, "RANDOM()", {0, 0}, "title", "title").size(), 2U);
    EXPECT_EQ(rows(nullptr, nullptr, {0, 0}, "title", "title"),
              rows("id>0", nullptr, {0, 0}, "title", "title"));
    MEDIA_DB_RESULT *playlists = MediaInfoDBOpen(3, "*", nullptr, nullptr, "RANDOM()", 0, 0, 0);
    EXPECT_NE(playlists, nullptr) << KLIBCErrTextGet();
    MediaInfoDBClose(playlists);
}

TEST_P(ListingTest, RecordsHoldTheRowAndNothingElse) {
    auto catalogue = openCatalogue(location());
    Song full = song("/m/\xFF.mp3", std::string(252, 'x') + "\u00E9\u00E9");
    full.album = "Album";
    full.artist = "Artist";
    full.albumArtist = "Somebody";
    full.genre = "Genre";
    full.track = 3;
    full.disc = 2;
    full.year = 1999;
    full.duration = 12.5;
    full.bitrate = 320000;
    full.frequency = 44100;
    put(*catalogue, {full});
    ZANO_MEDIA_INFO record;
    std::memset(&record, 0x55, sizeof record);
    MEDIA_DB_RESULT *result = MediaInfoDBOpen(4, "*", " id=1 ", nullptr, nullptr, 0, 0, 0);
    ASSERT_NE(result, nullptr) << KLIBCErrTextGet();
    EXPECT_EQ(MediaInfoDBGet(result, &record), 0);
    ZANO_MEDIA_INFO wanted{};
    wanted.id = 1;
    std::strcpy(wanted.path, full.path.c_str());
    std::strcpy(wanted.title, (std::string(252, 'x') + "\u00E9").c_str());
    std::strcpy(wanted.album, "Album");
    std::strcpy(wanted.artist, "Artist");
    std::strcpy(wanted.genre, "Genre");
    wanted.track = 3;
    wanted.disc = 2;
    wanted.year = 1999;
    wanted.duration = 12.5F;
    wanted.bitrate = 320000;
    wanted.frequency = 44100;
    EXPECT_EQ(std::memcmp(&record, &wanted, sizeof record), 0);
    std::memset(&record, 0x55, sizeof record);
    const ZANO_MEDIA_INFO untouched = record;
    EXPECT_EQ(MediaInfoDBGet(result, &record), -1);
    EXPECT_EQ(std::memcmp(&record, &untouched, sizeof record), 0);
    MediaInfoDBClose(result);
}

TEST_P(ListingTest, PlaylistsAreSavedFoundChangedAndDeleted) {
    ZANO_MEDIA_INFO row{};
    std::strcpy(row.path, "/music/pl/a.m3u");
    std::strcpy(row.title, "Sp\u00E4ter");
    std::strcpy(row.album, "Playlists");
    ASSERT_EQ(MediaInfoDBSave(3, &row), 0) << KLIBCErrTextGet();
    std::strcpy(row.path, "/music/b.m3u");
    std::strcpy(row.title, "earlier");
    ASSERT_EQ(MediaInfoDBSave(3, &row), 0);
    const auto titles = [](const char *condition) {
        std::string all;
        MEDIA_DB_RESULT *result =
            MediaInfoDBOpen(3, "*", condition, nullptr, "lower(title) asc, lower(album) ", 0, 0, 1);
        EXPECT_NE(result, nullptr) << KLIBCErrTextGet();
        auto record = std::make_unique<ZANO_MEDIA_INFO>();
        while (MediaInfoDBGet(result, record.get()) == 0) {
            all += std::to_string(record->id) + record->title + ";";
        }
        MediaInfoDBClose(result);
        return all;
    };
    EXPECT_EQ(titles("path like '/music/%' and album ilike 'playlists'"), "2earlier;1Sp\u00E4ter;");
    std::strcpy(row.title, "renamed");
    ASSERT_EQ(MediaInfoDBSave(3, &row), 0);
    row.id = 1;
    std::strcpy(row.path, "/music/c.m3u");
    ASSERT_EQ(MediaInfoDBUpdate(3, &row), 0);
    EXPECT_EQ(titles(nullptr), "1renamed;2renamed;");
    row.id = 77;
    EXPECT_EQ(MediaInfoDBUpdate(3, &row), -1);
    EXPECT_EQ(MediaInfoDBSave(0, &row), -1);
    EXPECT_EQ(MediaInfoDBDelete(3, "/music/c.m3u"), 0);
    EXPECT_EQ(titles(nullptr), "2renamed;");
    EXPECT_EQ(MediaInfoDBGetCount(3, "*", nullptr, 0, 0), 1);

    auto catalogue = openCatalogue(location());
    catalogue->begin();
    catalogue->addPlaylist({"/music/b.m3u", "of a scan", "music"});
    catalogue->addPlaylist({"/music/\xFF.pls", "\u00C9t\u00E9", "PlayLists"});
    catalogue->addPlaylist({"/music-2/x.wpl", "x", "music-2"});
    catalogue->commit();
    EXPECT_EQ(MediaInfoDBGetCount(
                  3, "*", "album ilike 'playlists' and lower(title) = '\u00E9t\u00E9'", 0, 0),
              1);
    EXPECT_EQ(titles("path like '/music/b%'"), "2renamed;") << "a row stays as it is";
    EXPECT_EQ(catalogue->playlists("/music"),
              (std::vector<std::string>{"/music/b.m3u", "/music/\xFF.pls"}));
    EXPECT_EQ(catalogue->playlists("").size(), 3U);
    EXPECT_EQ(catalogue->playlists("/music/b.m3u").size(), 1U);
}

ZANO_FOR_EVERY_ENGINE(ListingTest);

}  // namespace
}  // namespace zano::mediadb
