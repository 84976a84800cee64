/* A command line, understood. */
#pragma once

#include <string>
#include <vector>

#include "songs.h"
#include "terminal.h"

namespace vorelix {

struct Request;

struct Outcome {
    std::string text;       // for standard output
    std::string complaint;  // why the command failed in spite of its output; "" when it did not
};

/* Groups of arguments that commands share. */
enum Arguments : unsigned {
    kKeyword = 1U << 0,          // KEYWORD
    kOptionalKeyword = 1U << 1,  // [KEYWORD]
    kSearchOption = 1U << 2,     // --search KEYWORD
    kIn = 1U << 3,               // --in
    kSort = 1U << 4,             // --sort
    kDescending = 1U << 5,       // --desc
    kPaging = 1U << 6,           // --page, --page-size or --offset, --limit
    kColumn = 1U << 7,           // artist|album|genre
    kIds = 1U << 8,              // ID...
    kNumber = 1U << 9,           // N
};

struct Command {
    const char *name;
    const char *description;
    unsigned arguments;
    Outcome (*run)(const Request &request, const Terminal &terminal);
};

struct Request {
    const Command *command = nullptr;
    std::vector<std::string> words;  // the whole command line as it was typed
    bool json = false;
    bool verbose = false;
    Filter filter;
    Order order;
    Span span;
    bool byPage = true;  // the span was not given as an offset or limit
    std::string column;
    std::vector<int> ids;
};

}  // namespace vorelix
