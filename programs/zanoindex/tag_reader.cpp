#include "tag_reader.h"

#include <taglib/aifffile.h>
#include <taglib/apefile.h>
#include <taglib/asffile.h>
#include <taglib/flacfile.h>
#include <taglib/id3v1tag.h>
#include <taglib/id3v2framefactory.h>
#include <taglib/id3v2tag.h>
#include <taglib/infotag.h>
#include <taglib/mp4file.h>
#include <taglib/mpcfile.h>
#include <taglib/mpegfile.h>
#include <taglib/oggflacfile.h>
#include <taglib/opusfile.h>
#include <taglib/speexfile.h>
#include <taglib/tpropertymap.h>
#include <taglib/trueaudiofile.h>
#include <taglib/vorbisfile.h>
#include <taglib/wavfile.h>
#include <taglib/wavpackfile.h>
#include <algorithm>
#include <array>
#include <charconv>
#include <cstring>
#include <memory>

#include "dropped_texts.h"
#include "file_stream.h"
#include "formats.h"
#include "text.h"

namespace zano::index {
namespace {

using TagLib::AudioProperties;
using FilePointer = std::unique_ptr<TagLib::File>;

template <class File>
FilePointer open(TagLib::IOStream *stream) {
    return std::make_unique<File>(stream, true, AudioProperties::Average);
}

template <class File>
FilePointer openWithFrames(TagLib::IOStream *stream) {
    return std::make_unique<File>(stream, TagLib::ID3v2::FrameFactory::instance(), true,
                                  AudioProperties::Average);
}

struct Kind {
    Format format;
    bool (*holds)(TagLib::IOStream *);
    FilePointer (*open)(TagLib::IOStream *);
};

/* One format may have several kinds of content. MPEG comes last: almost anything can be taken
 * for it. */
constexpr std::array kKinds = {
    Kind{Format::kOgg, TagLib::Ogg::Vorbis::File::isSupported, open<TagLib::Ogg::Vorbis::File>},
    Kind{Format::kOpus, TagLib::Ogg::Opus::File::isSupported, open<TagLib::Ogg::Opus::File>},
    Kind{Format::kSpeex, TagLib::Ogg::Speex::File::isSupported, open<TagLib::Ogg::Speex::File>},
    Kind{Format::kOgg, TagLib::Ogg::FLAC::File::isSupported, open<TagLib::Ogg::FLAC::File>},
    Kind{Format::kFlac, TagLib::FLAC::File::isSupported, openWithFrames<TagLib::FLAC::File>},
    Kind{Format::kMp4, TagLib::MP4::File::isSupported, open<TagLib::MP4::File>},
    Kind{Format::kAsf, TagLib::ASF::File::isSupported, open<TagLib::ASF::File>},
    Kind{Format::kAiff, TagLib::RIFF::AIFF::File::isSupported, open<TagLib::RIFF::AIFF::File>},
    Kind{Format::kWav, TagLib::RIFF::WAV::File::isSupported, open<TagLib::RIFF::WAV::File>},
    Kind{Format::kApe, TagLib::APE::File::isSupported, open<TagLib::APE::File>},
    Kind{Format::kMpc, TagLib::MPC::File::isSupported, open<TagLib::MPC::File>},
    Kind{Format::kWavPack, TagLib::WavPack::File::isSupported, open<TagLib::WavPack::File>},
    Kind{Format::kTrueAudio, TagLib::TrueAudio::File::isSupported, open<TagLib::TrueAudio::File>},
    Kind{Format::kMpeg, TagLib::MPEG::File::isSupported, openWithFrames<TagLib::MPEG::File>},
};

/* Texts that a tag claims to be Latin-1, and those of RIFF, which claim nothing. */
TagLib::String textOfUnknownEncoding(const TagLib::ByteVector &data) {
    const std::string_view bytes(data.data(), data.size());
    // Fields of fixed size are filled up with zeros.
    return {toUtf8(bytes.substr(0, bytes.find('\0'))), TagLib::String::UTF8};
}

struct Id3v1Text : TagLib::ID3v1::StringHandler {
    TagLib::String parse(const TagLib::ByteVector &data) const override {
        return textOfUnknownEncoding(data).stripWhiteSpace();
    }
};

struct Id3v2Text : TagLib::ID3v2::Latin1StringHandler {
    TagLib::String parse(const TagLib::ByteVector &data) const override {
        return {toUtf8({data.data(), data.size()}), TagLib::String::UTF8};
    }
};

struct RiffText : TagLib::RIFF::Info::StringHandler {
    TagLib::String parse(const TagLib::ByteVector &data) const override {
        return textOfUnknownEncoding(data);
    }
};

void setTextHandlers() {
    static const Id3v1Text id3v1;
    static const Id3v2Text id3v2;
    static const RiffText riff;
    TagLib::ID3v1::Tag::setStringHandler(&id3v1);
    TagLib::ID3v2::Tag::setLatin1StringHandler(&id3v2);
    TagLib::RIFF::Info::Tag::setStringHandler(&riff);
}

std::string textOf(const TagLib::String &text) {
    return storableText(text.to8Bit(true));
}

struct TextRow {
    std::string Tags::*field;
    std::array<const char *, 3> keys;  // the first that is there counts
    TagLib::String (TagLib::Tag::*fallback)() const;
};

const std::array kTextRows = {
    TextRow{&Tags::title, {"TITLE"}, &TagLib::Tag::title},
    TextRow{&Tags::album, {"ALBUM"}, &TagLib::Tag::album},
    TextRow{&Tags::artist, {"ARTIST"}, &TagLib::Tag::artist},
    TextRow{&Tags::albumArtist, {"ALBUMARTIST", "ALBUM ARTIST", "ALBUM_ARTIST"}, nullptr},
    TextRow{&Tags::genre, {"GENRE"}, &TagLib::Tag::genre},
};

struct NumberRow {
    int Tags::*field;
    std::array<const char *, 3> keys;
    unsigned int (TagLib::Tag::*fallback)() const;
};

const std::array kNumberRows = {
    NumberRow{&Tags::year, {"DATE", "YEAR", "ORIGINALDATE"}, &TagLib::Tag::year},
    NumberRow{&Tags::track, {"TRACKNUMBER"}, &TagLib::Tag::track},
    NumberRow{&Tags::disc, {"DISCNUMBER"}, nullptr},
};

/* "3/12" is 3, "2004-05-01" is 2004; what does not begin with a number, or is out of all reason,
 * is 0. */
int leadingNumber(const std::string &text) {
    constexpr int kMost = 99'999;
    int number = 0;
    std::from_chars(text.data(), text.data() + text.size(), number);
    return number > 0 && number <= kMost ? number : 0;
}

/* Several values of one field are all kept: "A; B". */
std::string joined(const TagLib::StringList &values) {
    std::string text;
    for (const auto &value : values) {
        const auto part = textOf(value);
        if (!part.empty()) {
            text.append(text.empty() ? "" : "; ").append(part);
        }
    }
    return storableText(text);
}

template <std::size_t N>
std::string valueOf(const TagLib::PropertyMap &properties,
                    const std::array<const char *, N> &keys) {
    std::string text;
    for (std::size_t i = 0; i < N && keys[i] != nullptr && text.empty(); ++i) {
        const auto found = properties.find(keys[i]);
        if (found != properties.end()) {
            text = joined(found->second);
        }
    }
    return text;
}

/* Whether a text that nearly every song has is missing, which may be because it was dropped. */
bool lacksText(const Tags &tags) {
    return std::any_of(kTextRows.begin(), kTextRows.end(),
                       [&](const TextRow &row) { return (tags.*row.field).empty(); });
}

void fillFromTags(Tags &tags, const TagLib::File &file, const TagLib::PropertyMap &properties) {
    const auto *tag = file.tag();
    for (const auto &row : kTextRows) {
        tags.*row.field = valueOf(properties, row.keys);
        // A file may have two tags, of which the properties are those of the first.
        if ((tags.*row.field).empty() && row.fallback != nullptr && tag != nullptr) {
            tags.*row.field = textOf((tag->*row.fallback)());
        }
    }
    for (const auto &row : kNumberRows) {
        tags.*row.field = leadingNumber(valueOf(properties, row.keys));
        if (tags.*row.field == 0 && row.fallback != nullptr && tag != nullptr) {
            tags.*row.field = leadingNumber(std::to_string((tag->*row.fallback)()));
        }
    }
}

void fillFromAudio(Tags &tags, const AudioProperties *audio) {
    if (audio == nullptr) {
        return;
    }
    constexpr int kMostKilobits = 2'000'000;
    tags.duration = std::max(0, audio->lengthInMilliseconds()) / 1000.0;
    tags.bitrate = std::clamp(audio->bitrate(), 0, kMostKilobits) * 1000;
    tags.frequency = std::max(0, audio->sampleRate());
}

bool holdsAnything(const Tags &tags) {
    return tags.frequency > 0 || tags.duration > 0 || !tags.title.empty() || !tags.artist.empty() ||
           !tags.album.empty();
}

/* true when the stream was of this kind, and tags were filled. */
bool readAs(const Kind &kind, FileStream &stream, Tags &tags) {
    stream.seek(0, TagLib::IOStream::Beginning);
    const auto file = kind.open(&stream);
    if (!file || !file->isValid()) {
        return false;
    }
    auto properties = file->properties();
    tags = Tags();
    fillFromTags(tags, *file, properties);
    if (lacksText(tags) && addDroppedTexts(*file, stream, properties)) {
        fillFromTags(tags, *file, properties);
    }
    fillFromAudio(tags, file->audioProperties());
    return holdsAnything(tags);
}

/* Tries what the name says first. The formats that live in Ogg are told apart by content only:
 * their names are mixed up everywhere. */
bool readStream(FileStream &stream, Format format, Tags &tags) {
    const bool isOgg =
        format == Format::kOgg || format == Format::kOpus || format == Format::kSpeex;
    const auto *named = std::find_if(kKinds.begin(), kKinds.end(), [&](const Kind &kind) {
        return !isOgg && kind.format == format;
    });
    if (named != kKinds.end() && readAs(*named, stream, tags)) {
        return true;
    }
    return std::any_of(kKinds.begin(), kKinds.end(), [&](const Kind &kind) {
        return &kind != named && kind.holds(&stream) && readAs(kind, stream, tags);
    });
}

}  // namespace

ReadAnswer readTags(const std::string &path) {
    static const bool areHandlersSet = (setTextHandlers(), true);
    static_cast<void>(areHandlersSet);
    FileStream stream(path);
    ReadAnswer answer;
    const bool isRead = stream.isOpen() && readStream(stream, formatOfName(path), answer.tags);
    if (stream.error() != 0) {
        return {ReadStatus::kUnreadable, std::strerror(stream.error()), {}};
    }
    if (!isRead) {
        return {ReadStatus::kNotAudio, {}, {}};
    }
    return answer;
}

}  // namespace zano::index
