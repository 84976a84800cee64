#include "dropped_texts.h"

#include <taglib/flacfile.h>
#include <taglib/id3v2synchdata.h>
#include <taglib/mp4atom.h>
#include <taglib/mp4file.h>
#include <taglib/oggfile.h>
#include <taglib/tpropertymap.h>
#include <algorithm>
#include <array>
#include <cstdint>
#include <string_view>

#include "file_stream.h"
#include "text.h"

namespace zano::index {
namespace {

using TagLib::ByteVector;
using TagLib::PropertyMap;

/* No text that is kept is longer, and a damaged file may claim any size. */
constexpr unsigned long kMostBytes = 1UL << 20U;

std::string_view viewOf(const ByteVector &bytes) {
    return {bytes.data(), bytes.size()};
}

ByteVector readAt(FileStream &stream, long offset, unsigned long size) {
    stream.seek(offset, TagLib::IOStream::Beginning);
    return stream.readBlock(std::min(size, kMostBytes));
}

void addUnlessUtf8(std::string_view key, std::string_view value, PropertyMap &properties) {
    if (!isUtf8(value)) {
        const TagLib::String text(toUtf8(value), TagLib::String::UTF8);
        const TagLib::String name(std::string(key), TagLib::String::Latin1);
        properties.insert(name, TagLib::StringList(text));
    }
}

/* The names that formats have for a property. */
struct NamedKey {
    std::string_view name;
    std::string_view key;
};

template <std::size_t N>
std::string_view keyOf(const std::array<NamedKey, N> &names, std::string_view name) {
    for (const auto &row : names) {
        if (row.name == name) {
            return row.key;
        }
    }
    return {};
}

// Ogg and FLAC

std::uint32_t littleEndian(std::string_view bytes) {
    std::uint32_t value = 0;
    for (std::size_t i = 4; i-- > 0;) {
        value = value << 8U | static_cast<unsigned char>(bytes[i]);
    }
    return value;
}

/* Takes a length and that many bytes from the front; empty when they are not all there. */
std::string_view takeCounted(std::string_view &rest) {
    if (rest.size() < 4 || littleEndian(rest) > rest.size() - 4) {
        rest = {};
        return {};
    }
    const auto taken = rest.substr(4, littleEndian(rest));
    rest.remove_prefix(4 + taken.size());
    return taken;
}

/* comments: the maker's name, the number of entries, the entries KEY=value. */
void addFromComments(std::string_view comments, PropertyMap &properties) {
    takeCounted(comments);
    if (comments.size() < 4) {
        return;
    }
    auto count = littleEndian(comments);
    comments.remove_prefix(4);
    for (; count > 0 && !comments.empty(); --count) {
        const auto entry = takeCounted(comments);
        const auto equals = entry.find('=');
        if (equals != std::string_view::npos) {
            addUnlessUtf8(entry.substr(0, equals), entry.substr(equals + 1), properties);
        }
    }
}

/* The second packet of every format in Ogg is its comments, behind a few bytes that name it. */
void addFromOgg(TagLib::Ogg::File &file, PropertyMap &properties) {
    constexpr std::size_t kFlacHeader = 4;
    const auto packet = file.packet(1);
    auto comments = viewOf(packet);
    for (const std::string_view magic : {"\x03vorbis", "OpusTags"}) {
        if (comments.starts_with(magic)) {
            addFromComments(comments.substr(magic.size()), properties);
            return;
        }
    }
    const bool isFlac = !comments.empty() && (comments.front() & 0x7F) == 4;
    addFromComments(comments.substr(isFlac ? kFlacHeader : 0), properties);
}

/* A chain of blocks: a type (its first bit marks the last one), a length of 24 bits, and the
 * content. */
void addFromFlac(TagLib::FLAC::File &file, FileStream &stream, PropertyMap &properties) {
    constexpr unsigned kLast = 0x80;
    constexpr unsigned kComments = 4;
    const long marker = file.find("fLaC");
    unsigned type = 0;
    for (long at = marker + 4; marker >= 0 && (type & kLast) == 0;) {
        const auto header = readAt(stream, at, 4);
        if (header.size() < 4) {
            return;
        }
        type = static_cast<unsigned char>(header[0]);
        const auto size = header.toUInt(1, 3, true);
        if ((type & ~kLast) == kComments) {
            const auto content = readAt(stream, at + 4, size);
            addFromComments(viewOf(content), properties);
        }
        at += 4 + static_cast<long>(size);
    }
}

// ID3v2

constexpr std::array kFrames = {
    NamedKey{"TIT2", "TITLE"},       NamedKey{"TALB", "ALBUM"}, NamedKey{"TPE1", "ARTIST"},
    NamedKey{"TPE2", "ALBUMARTIST"}, NamedKey{"TCON", "GENRE"},
};

void addFromFrames(std::string_view frames, PropertyMap &properties) {
    constexpr std::size_t kHeader = 10;
    constexpr char kUtf8 = 3;
    while (frames.size() > kHeader && frames.front() != '\0') {
        const auto key = keyOf(kFrames, frames.substr(0, 4));
        const auto size = TagLib::ID3v2::SynchData::toUInt(ByteVector(frames.data() + 4, 4));
        const bool isPlain = frames[8] == 0 && frames[9] == 0;
        frames.remove_prefix(kHeader);
        if (size == 0 || size > frames.size()) {
            return;
        }
        if (!key.empty() && isPlain && frames.front() == kUtf8) {
            addUnlessUtf8(key, frames.substr(1, size - 1), properties);
        }
        frames.remove_prefix(size);
    }
}

/* Only version 4 has texts in UTF-8. */
void addFromId3v2(FileStream &stream, PropertyMap &properties) {
    constexpr unsigned long kHeader = 10;
    constexpr std::string_view kBegin("ID3\x04", 4);
    const auto header = readAt(stream, 0, kHeader);
    const bool isPlain = header.size() == kHeader && header[5] == 0;
    if (!isPlain || !viewOf(header).starts_with(kBegin)) {
        return;
    }
    const auto size = TagLib::ID3v2::SynchData::toUInt(header.mid(6, 4));
    const auto frames = readAt(stream, kHeader, size);
    addFromFrames(viewOf(frames), properties);
}

// APE

/* Each item: the length of its value, flags, its name (in any case) and a zero, the value. */
void addFromItems(std::string_view items, PropertyMap &properties) {
    constexpr std::size_t kHeader = 8;
    constexpr unsigned kBinary = 6;
    while (items.size() > kHeader) {
        const std::size_t size = littleEndian(items);
        const bool isText = (littleEndian(items.substr(4)) & kBinary) == 0;
        items.remove_prefix(kHeader);
        const auto name = items.substr(0, items.find('\0'));
        items.remove_prefix(std::min(items.size(), name.size() + 1));
        if (size > items.size()) {
            return;
        }
        if (isText) {
            addUnlessUtf8(name, items.substr(0, size), properties);
        }
        items.remove_prefix(size);
    }
}

/* The tag ends the file, or stands before an old tag of 128 bytes; its length, which counts the
 * footer but not the header, is in its footer. */
void addFromApe(FileStream &stream, PropertyMap &properties) {
    constexpr unsigned long kFooter = 32;
    constexpr long kOldTag = 128;
    constexpr std::size_t kLengthAt = 12;
    for (const long end : {stream.length(), stream.length() - kOldTag}) {
        const long footerAt = end - static_cast<long>(kFooter);
        const auto footer = footerAt < 0 ? ByteVector() : readAt(stream, footerAt, kFooter);
        if (viewOf(footer).starts_with("APETAGEX")) {
            const long size = littleEndian(viewOf(footer).substr(kLengthAt));
            const auto items =
                readAt(stream, std::max(0L, end - size),
                       static_cast<unsigned long>(std::max(0L, size - static_cast<long>(kFooter))));
            addFromItems(viewOf(items), properties);
            return;
        }
    }
}

// MP4

constexpr std::array kAtoms = {
    NamedKey{"\251nam", "TITLE"},    NamedKey{"\251alb", "ALBUM"}, NamedKey{"\251ART", "ARTIST"},
    NamedKey{"aART", "ALBUMARTIST"}, NamedKey{"\251gen", "GENRE"},
};

void addFromMp4(TagLib::MP4::File &file, FileStream &stream, PropertyMap &properties) {
    constexpr long kAtomHeader = 8;
    constexpr std::size_t kDataHeader = 16;  // its own header, the kind of data, a locale
    TagLib::MP4::Atoms atoms(&file);
    const auto *items = atoms.find("moov", "udta", "meta", "ilst");
    if (items == nullptr) {
        return;
    }
    for (const auto *item : items->children) {
        const auto key = keyOf(kAtoms, viewOf(item->name));
        if (!key.empty() && item->length > kAtomHeader) {
            const auto data = readAt(stream, item->offset + kAtomHeader,
                                     static_cast<unsigned long>(item->length - kAtomHeader));
            addUnlessUtf8(key, viewOf(data).substr(std::min<std::size_t>(kDataHeader, data.size())),
                          properties);
        }
    }
}

}  // namespace

bool addDroppedTexts(TagLib::File &file, FileStream &stream, PropertyMap &properties) {
    const auto before = properties;
    if (auto *ogg = dynamic_cast<TagLib::Ogg::File *>(&file)) {
        addFromOgg(*ogg, properties);
    } else if (auto *flac = dynamic_cast<TagLib::FLAC::File *>(&file)) {
        addFromFlac(*flac, stream, properties);
    } else if (auto *mp4 = dynamic_cast<TagLib::MP4::File *>(&file)) {
        addFromMp4(*mp4, stream, properties);
    } else {
        addFromId3v2(stream, properties);
        addFromApe(stream, properties);
    }
    return properties != before;
}

}  // namespace zano::index
