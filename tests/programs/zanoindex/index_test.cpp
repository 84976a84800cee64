#include "index_test.h"

#include <iomanip>
#include <memory>
#include <sstream>

#include "mediadb/query/parse.h"
#include "platform/mediadb/cluster.h"

namespace zano::index {

IndexTest::IndexTest() {
    fs::create_directory(music());
    location_ = mediadb::locationForTest(databaseFile());
}

std::string IndexTest::sample(const std::string &suffix) {
    return std::string(ZANOINDEX_SAMPLES) + "/sample." + suffix;
}

std::string IndexTest::add(const std::string &name, const std::string &suffix) const {
    const fs::path path = music() + "/" + name;
    fs::create_directories(path.parent_path());
    fs::copy_file(sample(suffix), path, fs::copy_options::overwrite_existing);
    return path;
}

std::vector<std::string> IndexTest::argumentsOf(const std::vector<std::string> &arguments) const {
    std::vector<std::string> all = {"zanoindex", "--database", location()};
    all.insert(all.end(), arguments.begin(), arguments.end());
    return all;
}

Ended IndexTest::run(const std::vector<std::string> &arguments) const {
    return Process({ZANOINDEX_PROGRAM, argumentsOf(arguments)}).wait();
}

std::string IndexTest::failsAt(const std::vector<std::string> &arguments) const {
    const auto ended = run(arguments);
    EXPECT_EQ(ended.status, 1) << ended.err;
    return ended.err;
}

Ended IndexTest::runFaulty(const std::vector<std::string> &arguments) const {
    return Process({ZANOINDEX_FAULTY, argumentsOf(arguments)}).wait();
}

Json::Value IndexTest::summaryOf(std::vector<std::string> arguments, int status) const {
    arguments.insert(arguments.begin(), "--json");
    const auto ended = run(arguments);
    EXPECT_EQ(ended.status, status) << ended.err;
    return parsed(ended.out);
}

std::string IndexTest::nameOf(const ZANO_MEDIA_INFO &row) const {
    return fs::path(row.path).lexically_relative(music()).string();
}

std::vector<std::string> IndexTest::rows(
    const std::function<std::string(const ZANO_MEDIA_INFO &)> &toLine, const char *select,
    mediadb::Table table) const {
    const auto engine = this->engine();
    mediadb::Query query;
    query.table = table;
    query.select = mediadb::parseSelect(table, select);
    mediadb::parseOrder("path", query);
    const auto cursor = engine->open(query);
    std::vector<std::string> lines;
    const auto row = std::make_unique<ZANO_MEDIA_INFO>();
    while (cursor->next(*row)) {
        lines.push_back(toLine(*row));
    }
    return lines;
}

std::vector<std::string> IndexTest::songs() const {
    const auto albumArtists = rows(
        [](const ZANO_MEDIA_INFO &row) { return std::string(row.title); }, "album_artist as title");
    auto albumArtist = albumArtists.begin();
    return rows([&](const ZANO_MEDIA_INFO &row) {
        std::ostringstream line;
        line << nameOf(row) << '|' << row.title << '|' << row.artist << '|' << row.album << '|'
             << *albumArtist++ << '|' << row.genre << '|' << row.year << '|' << row.track << '|'
             << row.disc;
        return line.str();
    });
}

std::vector<std::string> IndexTest::playlists() const {
    return rows(
        [this](const ZANO_MEDIA_INFO &row) {
            return nameOf(row) + '|' + row.title + '|' + row.album;
        },
        nullptr, mediadb::Table::Playlists);
}

std::vector<std::string> IndexTest::paths() const {
    return rows([this](const ZANO_MEDIA_INFO &row) { return nameOf(row); });
}

std::vector<std::string> IndexTest::sounds() const {
    return rows([this](const ZANO_MEDIA_INFO &row) {
        std::ostringstream line;
        line << nameOf(row) << ' ' << std::fixed << std::setprecision(1) << row.duration << " s "
             << row.bitrate << " bit/s " << row.frequency << " Hz";
        return line.str();
    });
}

std::string counts(const Json::Value &summary) {
    std::string text;
    for (const char *name : {"added", "updated", "unchanged", "removed", "kept", "failed"}) {
        const Json::Value &value = summary[name];
        const unsigned count = value.isArray() ? value.size() : value.asUInt();
        if (count > 0) {
            text += (text.empty() ? "" : ", ") + std::string(name) + " " + std::to_string(count);
        }
    }
    return text;
}

}  // namespace zano::index
