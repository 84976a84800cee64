/* Lists all songs. */
#include <stdio.h>
#include <vorelix/vorelix.h>
#include <zanoplatform/media_database.h>

int main(void) {
    ZANO_PLAYLIST_REC *songs = NULL;
    int count = -1;
    if (ZANOMusicListAll(&songs, 0, NULL, NULL, 1, 0, 0) != 0 ||
        ZANOPageTotalRowCount(1, 0, NULL, &count) != 0) {
        fprintf(stderr, "the library cannot be listed\n");
        return 1;
    }
    printf("%u songs listed, %d counted\n", ZANOPlaylistRecCount(songs), count);
    for (const ZANO_PLAYLIST_REC *song = songs; song != NULL; song = song->next) {
        printf("%s: %s\n", song->info.artist, song->info.title);
    }
    ZANOPlaylistRecFree(songs);
    return 0;
}
