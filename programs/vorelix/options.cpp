#include "options.h"

#include <CLI/CLI.hpp>
#include <cstdint>
#include <iostream>
#include <limits>

#include "option_checks.h"
#include "playlist_options.h"
#include "text.h"
#include "users_options.h"

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

/* Who asks for everything asks for no page. */
void excludePages(CLI::App &app, CLI::Option &all) {
    for (const char *other : {"--page", "--page-size", "--offset", "--limit"}) {
        all.excludes(app.get_option(other));
    }
}

/* The parser of the whole line. Every command writes into the same request, since only one of
 * them is given. */
struct Parser {
    CLI::App app{
        "Lists, searches and browses the music that zanoindex found; makes playlists; browses "
        "media servers.",
        "vorelix"};
    Request request;
    Paging paging;

    /* Behind its group's name stands the name of a command. */
    CLI::App &add(const Command &command) {
        const std::string name = command.name;
        const size_t blank = name.find(' ');
        CLI::App &parent =
            blank == std::string::npos ? app : *app.get_subcommand(name.substr(0, blank));
        return *parent.add_subcommand(name.substr(name.rfind(' ') + 1), command.description);
    }

    explicit Parser(const std::vector<Command> &commands) {
        app.set_version_flag("--version", "vorelix " VORELIX_VERSION);
        app.add_flag("--json", request.json, "One JSON document instead of a table");
        app.add_flag("--verbose", request.verbose, "The library's log on standard error");
        app.require_subcommand(0, 1);  // an unknown command is named when none is required
        app.fallthrough();
        for (const Command &command : commands) {
            CLI::App &sub = add(command);
            if (command.run == nullptr) {
                sub.require_subcommand(0, 1);
                continue;
            }
            if (command.addOwn != nullptr) {
                command.addOwn(sub, request);
            }
            addOperands(sub, command.arguments, request);
            addFilter(sub, command.arguments, request);
            addOrder(sub, command.arguments, request);
            addPaging(sub, command.arguments, request, paging);
            addPlaylistArguments(sub, command.arguments, request.playlist);
            addUsersArguments(sub, command.arguments, request.users);
            if (CLI::Option *all = sub.get_option_no_throw("--all")) {
                excludePages(sub, *all);
            }
            sub.footer("Also --json and --verbose: see vorelix --help");
            sub.callback([this, &command] { request.command = &command; });
        }
    }
};

ExitCode complain(const CLI::ParseError &error, const Parser &parser) {
    std::string command = "vorelix";
    const CLI::App *app = &parser.app;
    while (!app->get_subcommands().empty()) {
        app = app->get_subcommands().front();
        command += " " + app->get_name();
    }
    std::cerr << "vorelix: " << printable(error.what()) << "; see " << command << " --help\n";
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
        finishPlaylistArguments(parser.request.command->arguments, parser.request.playlist);
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
