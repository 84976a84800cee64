/* Writes a media database with three songs.   make_catalogue LOCATION */
#include <exception>
#include <iostream>
#include <memory>
#include <string>

#include "mediadb/catalogue.h"

namespace {

zano::mediadb::Song song(const std::string &artist, const std::string &title, int year) {
    zano::mediadb::Song song;
    song.path = "/volume1/music/" + title + ".mp3";
    song.artist = artist;
    song.title = title;
    song.year = year;
    return song;
}

}  // namespace

int main(int argc, char **argv) {
    if (argc != 2) {
        std::cerr << "usage: make_catalogue LOCATION\n";
        return 2;
    }
    try {
        const auto catalogue = zano::mediadb::openCatalogue(std::string(argv[1]));
        catalogue->begin();
        catalogue->putSong(song("Motörhead", "Overkill", 1979));
        catalogue->putSong(song("Motörhead", "Bomber's", 1980));
        catalogue->putSong(song("Björk", "Army of Me", 1995));
        catalogue->commit();
        catalogue->finish({});
    } catch (const std::exception &error) {
        std::cerr << error.what() << '\n';
        return 1;
    }
}
