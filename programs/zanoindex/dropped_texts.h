/* Texts in tags that claim to be UTF-8 and are not, which TagLib drops. */
#pragma once

#include <taglib/tfile.h>
#include <taglib/tpropertymap.h>

namespace zano::index {

class FileStream;

/* Adds to the properties of an open file what TagLib dropped, made UTF-8: from the comments of
 * Ogg and FLAC, the text frames of an ID3v2.4 tag at the beginning, the items of an APE tag at the
 * end, and those of MP4. true when there was any. */
bool addDroppedTexts(TagLib::File &file, FileStream &stream, TagLib::PropertyMap &properties);

}  // namespace zano::index
