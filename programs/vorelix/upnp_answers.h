/* Objects of media servers as rows and documents. */
#pragma once

#include <json/value.h>

#include <string>
#include <vector>

#include "content_directory.h"
#include "terminal.h"

namespace vorelix {

/* Its title, or where it has none its id. */
std::string shownTitle(const MediaObject &object);

/* Time as servers write it ("0:03:05.120", "3:05") as people read it; "" when it is none. */
std::string mediaTimeText(const std::string &duration);

std::string objectTable(const std::vector<MediaObject> &objects, const Terminal &terminal);

Json::Value objectDocument(const MediaObject &object);

/* {"name", "controlUrl"} */
Json::Value serverDocument(const ServerAddress &server);

/* "2 objects of it could not be read"; "" for none. */
std::string lostText(int lost);

}  // namespace vorelix
