#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vorelix/misc/misc.h>

#include <cstddef>
#include <cstdlib>
#include <memory>
#include <string_view>

#include "descriptor_internal.h"
#include "log_internal.h"
#include "system_paths_internal.h"

using vorelix::LogMessage;

namespace {

constexpr const char *kUnit = "misc";
constexpr LogMessage<> kNotGenerated{kUnit, "%s:%d Could not generat the mimetype mapping file",
                                     239};
constexpr LogMessage<> kNotOpened{kUnit, "%s:%d Could not open the mimetype mapping file", 244};
constexpr LogMessage<> kNoBuffer{kUnit, "%s:%d Malloc memory failed", 252};
constexpr LogMessage<> kNotRead{kUnit, "%s:%d Failed to read file", 258};

// The folder of a build may have blanks in its name, the paths of a device have none.
constexpr const char *kGenerate =
    sizeof ZANO_ROOT > 1 ? "'" ZANO_PATH_MIME_GENERATOR "' > '" ZANO_PATH_MIME_MAPPING "'"
                         : ZANO_PATH_MIME_GENERATOR " > " ZANO_PATH_MIME_MAPPING;

constexpr std::string_view kUnknownType = "application/octet-stream";

struct FreeText {
    void operator()(char *text) const { std::free(text); }
};

struct Mapping {
    std::unique_ptr<char, FreeText> text;  // null: not read, and logged
    std::size_t size = 0;
};

bool isThere() {
    struct stat status {};
    return stat(ZANO_PATH_MIME_MAPPING, &status) == 0 && S_ISREG(status.st_mode);
}

Mapping readMapping() {
    const vorelix::Descriptor file(open(ZANO_PATH_MIME_MAPPING, O_RDONLY | O_CLOEXEC));
    if (file.number() == -1) {
        kNotOpened();
        return {};
    }
    const off_t size = lseek(file.number(), 0, SEEK_END);
    lseek(file.number(), 0, SEEK_SET);
    Mapping mapping;
    mapping.size = static_cast<std::size_t>(size);
    mapping.text.reset(static_cast<char *>(std::malloc(mapping.size)));
    if (mapping.text == nullptr) {
        kNoBuffer();
        return {};
    }
    if (read(file.number(), mapping.text.get(), mapping.size) != size) {
        kNotRead();
        return {};
    }
    return mapping;
}

/* Intended and kept: the first place that has the text of the extension counts, whatever it is a
 * part of. The generator puts the entries into an order that suits this. */
std::string_view typeIn(std::string_view mapping, std::string_view extension) {
    std::size_t at = mapping.find(extension);
    if (at == std::string_view::npos) {
        return kUnknownType;
    }
    at += extension.size();
    for (int quotes = 0; quotes < 2; ++quotes) {
        at = mapping.find('"', at);
        if (at == std::string_view::npos) {
            return kUnknownType;
        }
        ++at;
    }
    // Without another quote up to the end of the file.
    return mapping.substr(at, mapping.find('"', at) - at);
}

}  // namespace

int ZANOAudioGetMimetype(const char *extension, char *out, int size) {
    if (extension == nullptr || out == nullptr) {
        return -1;
    }
    if (!isThere()) {
        // Whether that succeeded is seen by the file.
        [[maybe_unused]] const int status = std::system(kGenerate);
    }
    if (!isThere()) {
        kNotGenerated();
        return -1;
    }
    const Mapping mapping = readMapping();
    if (mapping.text == nullptr) {
        return -1;
    }
    const std::string_view type = typeIn({mapping.text.get(), mapping.size}, extension);
    if (size > 0) {
        const std::size_t length = type.copy(out, static_cast<std::size_t>(size) - 1);
        out[length] = '\0';
    }
    return 0;
}
