#include "songs.h"

#include <utility>

#include "../query/statements.h"
#include "text/fold.h"

namespace zano::mediadb::postgresql {
namespace {

constexpr std::string_view kColumns =
    "path, title, album, artist, genre, track, disc, year, duration, bitrate, frequency, "
    "album_artist, title_key, album_key, artist_key, genre_key, path_key, album_artist_key, "
    "size, modified, changed";

}  // namespace

void FacetArrays::add(const FacetChanges::key_type &facet, std::int64_t change) {
    isEmpty_ = false;
    number_.add(std::get<0>(facet));
    key_.add(std::string_view(std::get<1>(facet)));
    name_.add(std::string_view(std::get<2>(facet)));
    change_.add(change);
}

Sql FacetArrays::withArrays(std::string_view before, std::string_view after) {
    Sql sql = newSql(before);
    sql.add("unnest(").bind(number_.take()).add("::integer[],").bind(key_.take());
    sql.add("::text[],").bind(name_.take()).add("::text[],").bind(change_.take());
    sql.add("::bigint[]) WITH ORDINALITY AS new(facet, key, name, songs, place)").add(after);
    isEmpty_ = true;
    return sql;
}

Sql FacetArrays::addition() {
    return withArrays("INSERT INTO facets SELECT facet, key, name, songs FROM ",
                      " ORDER BY place ON CONFLICT(facet, key, name) DO UPDATE SET "
                      "songs=facets.songs+EXCLUDED.songs RETURNING facet, key, name, songs");
}

Sql FacetArrays::removal() {
    return withArrays("DELETE FROM facets USING ",
                      " WHERE facets.facet=new.facet AND facets.key=new.key AND "
                      "facets.name=new.name");
}

void SongArrays::add(const Song &song, std::int64_t id) {
    isEmpty_ = false;
    id_.add(id);
    path_.addPath(song.path);
    title_.add(std::string_view(song.title));
    album_.add(std::string_view(song.album));
    artist_.add(std::string_view(song.artist));
    genre_.add(std::string_view(song.genre));
    track_.add(song.track);
    disc_.add(song.disc);
    year_.add(song.year);
    duration_.add(song.duration);
    bitrate_.add(song.bitrate);
    frequency_.add(song.frequency);
    albumArtist_.add(std::string_view(song.albumArtist));
    titleKey_.add(std::string_view(foldedKey(song.title)));
    albumKey_.add(std::string_view(foldedKey(song.album)));
    artistKey_.add(std::string_view(foldedKey(song.artist)));
    genreKey_.add(std::string_view(foldedKey(song.genre)));
    pathKey_.add(std::string_view(foldedKey(song.path)));
    albumArtistKey_.add(std::string_view(foldedKey(song.albumArtist)));
    bytes_.add(song.stamp.size);
    modified_.add(song.stamp.modified);
    changed_.add(song.stamp.changed);
}

/* `before`, the arrays as a table `new` with the columns above and the place of each, `after`. */
Sql SongArrays::withArrays(std::string_view before, std::string_view after) {
    const std::pair<ArrayText *, std::string_view> arrays[] = {
        {&id_, "::bigint[]"},           {&path_, "::bytea[]"},      {&title_, "::text[]"},
        {&album_, "::text[]"},          {&artist_, "::text[]"},     {&genre_, "::text[]"},
        {&track_, "::integer[]"},       {&disc_, "::integer[]"},    {&year_, "::integer[]"},
        {&duration_, "::float8[]"},     {&bitrate_, "::integer[]"}, {&frequency_, "::integer[]"},
        {&albumArtist_, "::text[]"},    {&titleKey_, "::text[]"},   {&albumKey_, "::text[]"},
        {&artistKey_, "::text[]"},      {&genreKey_, "::text[]"},   {&pathKey_, "::text[]"},
        {&albumArtistKey_, "::text[]"}, {&bytes_, "::bigint[]"},    {&modified_, "::bigint[]"},
        {&changed_, "::bigint[]"}};
    Sql sql = newSql(before);
    std::string_view separator = "unnest(";
    for (const auto &[array, cast] : arrays) {
        sql.add(separator).bind(array->take()).add(cast);
        separator = ",";
    }
    sql.add(") WITH ORDINALITY AS new(id, ").add(kColumns).add(", place)").add(after);
    isEmpty_ = true;
    return sql;
}

Sql SongArrays::insertion() {
    std::string before = "INSERT INTO songs(";
    before.append(kColumns).append(") SELECT ").append(kColumns).append(" FROM ");
    return withArrays(before, " ORDER BY place");
}

Sql SongArrays::replacement() {
    return withArrays(
        "UPDATE songs SET title=new.title, album=new.album, artist=new.artist, genre=new.genre, "
        "track=new.track, disc=new.disc, year=new.year, duration=new.duration, "
        "bitrate=new.bitrate, frequency=new.frequency, album_artist=new.album_artist, "
        "title_key=new.title_key, album_key=new.album_key, artist_key=new.artist_key, "
        "genre_key=new.genre_key, album_artist_key=new.album_artist_key, size=new.size, "
        "modified=new.modified, changed=new.changed FROM ",
        " WHERE songs.id=new.id");
}

std::map<std::string, StoredSong> loadSongs(Connection &connection, std::span<const Song> songs) {
    ArrayText paths;
    for (const Song &song : songs) {
        paths.addPath(song.path);
    }
    Sql sql = newSql(
        "SELECT id, path, title, album, artist, genre, track, disc, year, duration FROM songs "
        "WHERE path=ANY(");
    sql.bind(paths.take()).add("::bytea[])");
    const Result rows = connection.run(sql);
    std::map<std::string, StoredSong> stored;
    for (int i = 0; i < rows.size(); ++i) {
        const Row row = rows[i];
        const auto text = [&row](int column) { return std::string(row.text(column)); };
        const auto number = [&row](int column) { return static_cast<int>(row.integer(column)); };
        stored.emplace(text(1), StoredSong{row.integer(0), text(1), text(2), text(3), text(4),
                                           text(5), number(6), number(7), number(8), row.real(9)});
    }
    return stored;
}

void countFacets(FacetChanges &changes, const std::string &artist, const std::string &album,
                 const std::string &genre, int by) {
    const std::pair<Column, std::string_view> values[] = {
        {Column::Artist, artist}, {Column::Album, album}, {Column::Genre, genre}};
    for (const Facet &facet : facets()) {
        for (const auto &[column, value] : values) {
            if (column == facet.column) {
                changes[{facet.number, foldedKey(value), std::string(value)}] += by;
            }
        }
    }
}

}  // namespace zano::mediadb::postgresql
