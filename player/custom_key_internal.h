/* The file of the custom keys. */
#pragma once

#include <json/json.h>

namespace vorelix::custom_key {

/* Makes items the array of four empty keys, and returns it. */
Json::Value &BuildDefaultItems(Json::Value &items);

/* 0, or -1, logged, with root as it was. root takes what the file holds; where there is no file,
 * its "items" become the default ones. Throws what the parser throws, for nesting too deep or a
 * folder in the place of the file, and std::bad_alloc. */
int ReadJsonFile(const char *path, Json::Value &root);

/* 0, or -1, logged. Writes in place. Throws std::bad_alloc with the file as it was. */
int WriteJsonFile(const char *path, const Json::Value &root);

}  // namespace vorelix::custom_key
