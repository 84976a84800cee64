#include "key_actions.h"

#include <vorelix/player/custom_key.h>

#include "file_draft.h"
#include "system_paths_internal.h"

namespace webapi {

namespace {

constexpr int kKeys = 4;
constexpr int kWaitSeconds = 5;
constexpr const char *kTexts[] = {"type", "value", "title"};

}  // namespace

Json::Value KeysAction::answer() {
    Json::Value answer;
    for (int key = 1; key <= kKeys; ++key) {
        std::string texts[3];
        if (ZANOAudioCustomGet(key, texts[0], texts[1], texts[2]) != 0) {
            throw Refusal(kFailed, "keys");
        }
        Json::Value row;
        row["key"] = key;
        for (int i = 0; i < 3; ++i) {
            row[kTexts[i]] = texts[i];
        }
        answer["keys"].append(row);
    }
    return answer;
}

Json::Value KeySetAction::answer() {
    const int key = parameters().number("key", {1, kKeys});
    std::string texts[3];
    for (int i = 0; i < 3; ++i) {
        if (!parameters().has(kTexts[i])) {
            throw Refusal(kBadRequest, kTexts[i]);
        }
        texts[i] = parameters().text(kTexts[i]);
    }
    // The library locks nothing, and of two programs that set keys at once one would lose. A draft
    // is what those of this tree wait for.
    const vorelix::FileDraft turn(vorelix::withoutLinks(ZANO_PATH_CUSTOM_KEYS),
                                  vorelix::deadlineOf(kWaitSeconds));
    if (ZANOAudioCustomSet(key, texts[0], texts[1], texts[2]) != 0) {
        throw Refusal(kFailed, "keys");
    }
    return {};
}

}  // namespace webapi
