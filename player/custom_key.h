/* The four custom keys of the audio application, each with a type, a value and a title, whose
 * meaning is the application's. They stand in "/usr/zano/etc/audio/custom_key.json":
 *
 *     { "items" : [ { "id" : 1, "title" : "", "type" : "", "value" : "" }, ... ] }
 *
 * where key n, from 1 to 4, is element n - 1; "id" is written with a new file and never read. There
 * is no lock, and the file is written in place: of two programs that set keys at once the last one
 * wins, and a write that fails can leave a part of the file. Texts are UTF-8.
 *
 * All functions return 0, or -1, logged. Every call reads the file afresh. Nothing throws.
 * C++ only, as jsoncpp is. */
#ifndef VORELIX_PLAYER_CUSTOM_KEY_H
#define VORELIX_PLAYER_CUSTOM_KEY_H

#ifndef __cplusplus
#error "C++ only"
#endif

#include <json/json.h>
#include <vorelix/export.h>

#include <string>

/* Reads the file, whatever the shape of its JSON is, in place of root; where there is no file,
 * root["items"] becomes four empty keys, and nothing is written. -1, with root as it was: the file
 * cannot be read or holds no JSON. */
VORELIX_API int ZANOAudioCustomLoadJson(Json::Value &root);

/* One key, by its number from 1 to 4. Of an element or a member that is missing the texts are
 * empty; numbers and true and false are given as text. -1, with the texts as they were: another
 * number, a file that cannot be read, that has no "items", or whose JSON has another shape. */
VORELIX_API int ZANOAudioCustomGet(int key, std::string &type, std::string &value,
                                   std::string &title);

/* Changes one key, by its number from 1 to 4, and writes the whole file. Whatever else the file
 * holds stays, comments included. A file without "items" gets them, null before the changed one.
 * -1 with the file as it was: another number, or a file that cannot be read, whose JSON has another
 * shape, or a name with a NUL, which could not be written. -1 also when the file cannot be written,
 * of which a part may be left then. */
VORELIX_API int ZANOAudioCustomSet(int key, const std::string &type, const std::string &value,
                                   const std::string &title);

#endif
