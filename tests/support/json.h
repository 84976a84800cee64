/* JSON that programs write. */
#pragma once

#include <gtest/gtest.h>
#include <json/reader.h>
#include <json/writer.h>

#include <memory>
#include <string>

namespace json {

/* Fails the test when the text is no JSON. */
inline Json::Value parsed(const std::string &text) {
    Json::Value value;
    const std::unique_ptr<Json::CharReader> reader(Json::CharReaderBuilder().newCharReader());
    std::string errors;
    EXPECT_TRUE(reader->parse(text.data(), text.data() + text.size(), &value, &errors))
        << errors << text.substr(0, 1000);
    return value;
}

/* In one line, as UTF-8. */
inline std::string textOf(const Json::Value &value) {
    Json::StreamWriterBuilder writer;
    writer["indentation"] = "";
    writer["emitUTF8"] = true;
    return Json::writeString(writer, value);
}

/* The titles of songs or of entries of a playlist, one behind the other. */
inline std::string titlesOf(const Json::Value &songs) {
    std::string titles;
    for (const Json::Value &song : songs) {
        titles += song["title"].asString();
    }
    return titles;
}

}  // namespace json
