#include "options.h"

#include <CLI/CLI.hpp>
#include <charconv>
#include <cstdint>
#include <iostream>
#include <limits>

#include "text.h"

namespace vorelix {

namespace {

constexpr int kMostRows = 10000;  // a record takes 7 KB
constexpr int kMostNumber = std::numeric_limits<int>::max();

/* Page numbers count from 1; 0: not given. */
struct Paging {
    int page = 0;
    int pageSize = 0;
    int offset = -1;
    int limit = 0;
};

/* The whole text in decimal; CLI11 by itself takes 010 for 8. */
CLI::Validator wholeNumber(int least, int most) {
    const std::string range = "from " + std::to_string(least) + " to " + std::to_string(most);
    return {[=](std::string &text) {
                int number = 0;
                const char *end = text.data() + text.size();
                const auto [rest, error] = std::from_chars(text.data(), end, number);
                if (error != std::errc() || rest != end || number < least || number > most) {
                    return "'" + printable(text) + "' is not a whole number " + range;
                }
                text = std::to_string(number);
                return std::string();
            },
            ""};
}

CLI::Validator searchText() {
    return {[](std::string &text) -> std::string {
                if (text.empty()) {
                    return "the text to search for is empty";
                }
                return validUtf8(text) == text ? "" : "the text to search for is not UTF-8";
            },
            ""};
}

/* One of some names; the value that `choice` has counts when none is given. */
CLI::Option *addChoice(CLI::App &app, const char *name, std::string &choice,
                       const std::string &description, const std::vector<std::string> &names) {
    const std::string usual = choice.empty() ? "" : "; " + choice + " if not given";
    return app
        .add_option(name, choice, description + ": " + CLI::detail::join(names, ", ") + usual)
        ->type_name(*name == '-' ? "NAME" : "")
        ->check(CLI::IsMember(names).description(""));
}

void addFilter(CLI::App &app, unsigned arguments, Request &request) {
    std::string &keyword = request.filter.keyword;
    if ((arguments & (kKeyword | kOptionalKeyword)) != 0) {
        app.add_option("KEYWORD", keyword, "Text to find; case and accents do not matter")
            ->required((arguments & kKeyword) != 0)
            ->type_name("")
            ->check(searchText());
    }
    if ((arguments & kSearchOption) != 0) {
        app.add_option("--search", keyword, "Only values with this text in them")
            ->type_name("KEYWORD")
            ->check(searchText());
    }
    if ((arguments & kIn) != 0) {
        addChoice(app, "--in", request.filter.in, "Where to look", searchableNames());
    }
}

void addOrder(CLI::App &app, unsigned arguments, Request &request) {
    if ((arguments & kSort) != 0) {
        addChoice(app, "--sort", request.order.by, "Sort by", sortNames());
    }
    if ((arguments & kDescending) != 0) {
        app.add_flag("--desc", request.order.descending, "From last to first");
    }
}

void addPaging(CLI::App &app, unsigned arguments, const Request &request, Paging &paging) {
    if ((arguments & kPaging) == 0) {
        return;
    }
    const std::string usual = ", " + std::to_string(request.span.limit) + " if not given";
    const auto add = [&](const char *name, int &number, int least, int most,
                         const std::string &description) {
        return app.add_option(name, number, description)
            ->type_name("N")
            ->transform(wholeNumber(least, most));
    };
    auto *page = add("--page", paging.page, 1, kMostNumber, "Page to show, from 1");
    auto *pageSize = add("--page-size", paging.pageSize, 1, kMostRows, "Rows of a page" + usual);
    auto *offset = add("--offset", paging.offset, 0, kMostNumber, "Rows to skip");
    auto *limit = add("--limit", paging.limit, 1, kMostRows, "Rows to show at most" + usual);
    for (auto *option : {page, pageSize}) {
        option->excludes(offset)->excludes(limit);
    }
}

void addOperands(CLI::App &app, unsigned arguments, Request &request) {
    if ((arguments & kColumn) != 0) {
        addChoice(app, "COLUMN", request.column, "What to list", {"artist", "album", "genre"})
            ->required();
    }
    if ((arguments & kIds) != 0) {
        app.add_option("ID", request.ids, "Ids of songs, as the listings show them")
            ->required()
            ->type_name("")
            ->transform(wholeNumber(1, kMostNumber));
    }
    if ((arguments & kNumber) != 0) {
        app.add_option("N", request.span.limit, "How many")
            ->required()
            ->type_name("")
            ->transform(wholeNumber(1, kMostRows));
    }
}

void resolvePaging(const Paging &paging, Request &request) {
    Span &span = request.span;
    request.byPage = paging.offset < 0 && paging.limit == 0;
    if (!request.byPage) {
        span.offset = std::max(paging.offset, 0);
        span.limit = paging.limit > 0 ? paging.limit : span.limit;
        return;
    }
    span.limit = paging.pageSize > 0 ? paging.pageSize : span.limit;
    const std::int64_t offset = std::int64_t{std::max(paging.page, 1) - 1} * span.limit;
    if (offset > kMostNumber) {
        throw CLI::ValidationError("--page",
                                   std::to_string(paging.page) + " is beyond any library");
    }
    span.offset = static_cast<int>(offset);
}

/* The parser of the whole line. Every command writes into the same request, since only one of
 * them is given. */
struct Parser {
    CLI::App app{"Lists, searches and browses the music that zanoindex found.", "vorelix"};
    Request request;
    Paging paging;

    explicit Parser(const std::vector<Command> &commands) {
        app.set_version_flag("--version", "vorelix " VORELIX_VERSION);
        app.add_flag("--json", request.json, "One JSON document instead of a table");
        app.add_flag("--verbose", request.verbose, "The library's log on standard error");
        app.require_subcommand(0, 1);  // an unknown command is named when none is required
        app.fallthrough();
        for (const Command &command : commands) {
            CLI::App *sub = app.add_subcommand(command.name, command.description);
            addOperands(*sub, command.arguments, request);
            addFilter(*sub, command.arguments, request);
            addOrder(*sub, command.arguments, request);
            addPaging(*sub, command.arguments, request, paging);
            sub->footer("Also --json and --verbose: see vorelix --help");
            sub->callback([this, &command] { request.command = &command; });
        }
    }
};

ExitCode complain(const CLI::ParseError &error, const Parser &parser) {
    std::string help = "vorelix --help";
    for (const CLI::App *sub : parser.app.get_subcommands()) {
        help = "vorelix " + sub->get_name() + " --help";
    }
    std::cerr << "vorelix: " << printable(error.what()) << "; see " << help << '\n';
    return kUsage;
}

}  // namespace

std::variant<Request, ExitCode> parseCommandLine(int argc, const char *const *argv,
                                                 const std::vector<Command> &commands) {
    Parser parser(commands);
    try {
        parser.app.parse(argc, argv);
        if (parser.request.command == nullptr) {
            throw CLI::RequiredError("A command");
        }
        resolvePaging(parser.paging, parser.request);
    } catch (const CLI::Success &help) {
        parser.app.exit(help);
        return kSuccess;
    } catch (const CLI::ParseError &error) {
        return complain(error, parser);
    }
    parser.request.words.assign(argv, argv + argc);
    return std::move(parser.request);
}

}  // namespace vorelix
