#include <zanoplatform/web_output.h>

#include <algorithm>
#include <cstdio>
#include <limits>
#include <string>
#include <string_view>

#include "text/fold.h"
#include "text/utf8.h"

namespace {

void put(std::string_view text) {
    // A browser that has gone away is nobody's to tell.
    std::fwrite(text.data(), 1, text.size(), stdout);
}

std::string validUtf8(std::string_view text) {
    std::string valid;
    valid.reserve(text.size());
    while (!text.empty()) {
        valid += zano::characterText(zano::takeCharacter(text));
    }
    return valid;
}

std::string jsonText(const Json::Value &value) {
    Json::StreamWriterBuilder writer;
    writer["indentation"] = "";
    // As they are, for jsoncpp's own reading of UTF-8 loses what follows a wrong byte.
    writer["emitUTF8"] = true;
    // A 5.1 as that, where 17 digits show what is nearest to it in binary.
    writer["precision"] = std::numeric_limits<double>::digits10;
    std::string text = Json::writeString(writer, value);
    return zano::isUtf8(text) ? text : validUtf8(text);
}

bool isControl(char c) {
    return static_cast<unsigned char>(c) < 0x20;
}

}  // namespace

WebMan::WebMan(bool isCacheable) : isCacheable_(isCacheable) {}

void WebMan::WriteHeader(const char *contentType) {
    const std::string_view type(contentType);
    put("Content-Type: ");
    put({type.begin(), std::find_if(type.begin(), type.end(), isControl)});
    put(isCacheable_ ? "\r\nCache-Control: private" : "\r\nCache-Control: no-store");
    // The type as it is: a title with a tag in it is never read as a page.
    put("\r\nX-Content-Type-Options: nosniff\r\n\r\n");
}

void WebMan::WriteBody(const Json::Value &body) {
    put(jsonText(body));
    std::fflush(stdout);
}
