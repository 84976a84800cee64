#include <gtest/gtest.h>
#include <utf8proc.h>

#include <cstdlib>
#include <memory>

#include "text/fold.h"

namespace zano {
namespace {

std::string encoded(char32_t character) {
    char bytes[4];
    const auto length = utf8proc_encode_char(static_cast<utf8proc_int32_t>(character),
                                             reinterpret_cast<utf8proc_uint8_t *>(bytes));
    return {bytes, static_cast<size_t>(length)};
}

TEST(FoldedKey, OfEveryCharacterIsItsOwnKeyAndThatOfItsOtherForms) {
    for (char32_t character = 1; character <= 0x10FFFF; ++character) {
        if (character >= 0xD800 && character <= 0xDFFF) {
            continue;
        }
        const std::string text = encoded(character);
        const std::string key = foldedKey(text);
        ASSERT_EQ(foldedKey(key), key) << std::hex << static_cast<unsigned>(character);
        for (auto *normalize : {utf8proc_NFC, utf8proc_NFD}) {
            const std::unique_ptr<utf8proc_uint8_t, void (*)(void *)> other(
                normalize(reinterpret_cast<const utf8proc_uint8_t *>(text.c_str())), std::free);
            ASSERT_EQ(foldedKey(reinterpret_cast<const char *>(other.get())), key)
                << std::hex << static_cast<unsigned>(character);
        }
    }
}

TEST(FoldedKey, JoinsWhatPeopleTakeForTheSame) {
    const std::vector<std::pair<const char *, const char *>> same = {
        {"Beyonc\u00E9", "beyonce"},
        {"Beyonce\u0301", "beyonce"},
        {"\u00D8rsted \u0141\u00F3d\u017A \u0110o \u00D0i \u00C6on \u0152uvre",
         "orsted lodz do di aeon oeuvre"},
        {"Stra\u00DFe", "STRASSE"},
        {"\u03A3\u038A\u03A3\u03A5\u03A6\u039F\u03A3",
         "\u03C3\u03B9\u03C3\u03C5\u03C6\u03BF\u03C3"},
        {"\u041F\u0415\u0421\u041D\u042F", "\u043F\u0435\u0441\u043D\u044F"},
        {"AC\u2010DC AC\u2011DC AC\u2013DC AC\u2212DC", "ac-dc ac-dc ac-dc ac-dc"},
        {"\uFF21\uFF22\uFF23", "abc"},
        {"\u30C8\u3099", "\u30C9"},
        {"\uFF84\uFF9E", "\u30C9"},
        {"Don\u2019t \u201Cstop\u201D", "don't \"stop\""},
        {"so\u00ADft\u200D", "soft"},
        {"a\tb\nc", "a b c"},
        {"\xFFx", "\uFFFDx"},
        {"I\u0307stanbul \u0130stanbul \u0131", "istanbul istanbul i"},
    };
    for (const auto &[text, key] : same) {
        EXPECT_EQ(foldedKey(text), foldedKey(key)) << text;
    }
    EXPECT_EQ(foldedKey("\u30C9").find(foldedKey("\u30C8")), std::string::npos) << "another kana";
    EXPECT_NE(foldedKey("\u0E01\u0E34"), foldedKey("\u0E01\u0E35")) << "Thai vowels";
    EXPECT_NE(foldedKey("\u0915\u093F"), foldedKey("\u0915\u0940")) << "Devanagari vowels";
}

TEST(CutAtCharacter, NeverLeavesHalfACharacter) {
    EXPECT_EQ(cutAtCharacter("a\u00E9\u4EAC", 6), "a\u00E9\u4EAC");
    EXPECT_EQ(cutAtCharacter("a\u00E9\u4EAC", 5), "a\u00E9");
    EXPECT_EQ(cutAtCharacter("a\u00E9\u4EAC", 2), "a");
    EXPECT_EQ(cutAtCharacter("\x80\x80\x80\x80\x80\x80", 5).size(), 1U) << "not a character at all";
}

}  // namespace
}  // namespace zano
