/* What the readers of the iPod's files share. */
#pragma once

#include <vorelix/records.h>

#include <array>
#include <cstdio>
#include <memory>

namespace vorelix::ipod {

/* The unit's name in the log. */
inline constexpr const char *kUnit = "ipod";

/* The lines of a file that do not begin with a line end. */
class Lines {
  public:
    explicit Lines(const char *path) : file_(std::fopen(path, "re")) {}

    bool areOpen() const { return file_ != nullptr; }
    /* The next line or piece of one, with its line feed; null at the end and when reading failed.
     * Valid until the next call. */
    char *next();
    bool haveFailed() const { return std::ferror(file_.get()) != 0; }

  private:
    struct Close {
        void operator()(std::FILE *file) const { std::fclose(file); }
    };
    std::unique_ptr<std::FILE, Close> file_;
    std::array<char, 4096> line_;
};

/* What a line says. */
enum class Key { Title, Artist, Album, Genre, Duration, Bitrate, Frequency, None };
Key keyOf(const char *line);

/* What follows the first ": " of a line, "" without one. */
char *valueOf(char *line);

/* The decimal number that a text begins with; what an int does not hold is the nearest that it
 * does. */
int numberIn(const char *text, int factor = 1);

/* The field, of 255 bytes, that holds the text of a key; null for a number and for None. */
char *textField(Key key, ZANO_MEDIA_INFO &info);
inline constexpr int kTextSize = sizeof(ZANO_MEDIA_INFO::title);

}  // namespace vorelix::ipod
