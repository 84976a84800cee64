// Searches in artists.
#include <vorelix/vorelix.h>
#include <zanoplatform/error.h>
#include <zanoplatform/media_database.h>

#include <iostream>
#include <memory>

int main(int argc, char **argv) {
    if (argc != 2) {
        return 2;
    }
    ZANO_PLAYLIST_REC *found = nullptr;
    if (ZANOMusicListAll(&found, 2, argv[1], "year", 0, 0, 10) != 0) {
        std::cerr << "the library cannot be searched\n";
        return 1;
    }
    const std::unique_ptr<ZANO_PLAYLIST_REC, decltype(&ZANOPlaylistRecFree)> songs(
        found, ZANOPlaylistRecFree);
    if (KLIBCErrGet() != KLIB_ERR_NONE) {
        std::cerr << KLIBCErrTextGet() << '\n';
        return 1;
    }
    for (const ZANO_PLAYLIST_REC *song = found; song != nullptr; song = song->next) {
        std::cout << song->info.year << ' ' << song->info.title << '\n';
    }
}
