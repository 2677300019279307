/* SPDX-License-Identifier: Apache-2.0 */
// The command line: the table of verbs handed to the parser, and the one place where an error is shown and
// becomes an exit status. The only file that includes the parser.

#include "tools/dvsctl/cli/cli.h"

#include <csignal>
#include <cmath>
#include <cstring>
#include <new>

#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <CLI/CLI.hpp>

#include "tools/dvsctl/cli/command.h"
#include "tools/dvsctl/cli/completion.h"
#include "tools/dvsctl/cli/envelope.h"
#include "tools/dvsctl/cli/help.h"

namespace dvs::ctl {

namespace {

struct Parsed {
    const Command *command = nullptr;
    bool help = false, version = false, completion = false;

    /// Something about the program is asked for, not of it.
    bool IsAbout() const { return help || version || completion; }
};

// An empty text, of a variable that is not set, is no number: it would count as 0.
std::string RefuseEmpty(const std::string &text) {
    return text.empty() ? "a number is wanted" : "";
}

void AddRow(CLI::App &app, const OptionRow &row, Options &options) {
    std::visit(
        [&](auto member) {
            using Value = std::remove_reference_t<decltype(options.*member)>;
            if constexpr (std::is_same_v<Value, bool>)
                app.add_flag(row.name, options.*member);
            else if constexpr (std::is_same_v<Value, std::string>)
                app.add_option(row.name, options.*member)->required();
            else if constexpr (std::is_same_v<Value, double>)
                app.add_option(row.name, options.*member)->take_last()->check(RefuseEmpty);
            else
                app.add_option(row.name, options.*member)->take_last();
        },
        row.target);
}

CLI::App *AddWord(CLI::App &at, const std::string &word) {
    CLI::App *app = at.add_subcommand(word)->fallthrough();
    app->set_help_flag(); // help is this program's own
    return app;
}

// "store list" is the subcommand "list" of the group "store", which is made when its first verb comes.
CLI::App *AddCommand(CLI::App &root, const Command &command) {
    CLI::App *at = &root;
    std::string_view name = command.name;
    for (std::size_t space; (space = name.find(' ')) != std::string_view::npos;
         name.remove_prefix(space + 1)) {
        const std::string word(name.substr(0, space));
        const auto groups = at->get_subcommands([&](CLI::App *app) { return app->get_name() == word; });
        at = !groups.empty() ? groups.front() : AddWord(*at, word)->require_subcommand(1);
    }
    return AddWord(*at, std::string(name));
}

void ExplainUnknownVerb(Error &error, int argc, char **argv) {
    for (int i = 1; i < argc; ++i) {
        if (argv[i][0] == '-') continue;
        const std::string nearest = NearestCommand(argv[i]);
        for (const Command &command : Commands())
            if (std::string_view(command.name).substr(0, std::string_view(command.name).find(' ')) == argv[i])
                return;
        error.title = "there is no verb \"" + std::string(argv[i]) + "\"";
        error.why = nearest.empty() ? "" : "perhaps \"" + nearest + "\" was meant";
        return;
    }
    error.title = "no verb was given";
}

void CheckOptions(const Options &options) {
    if (!std::isfinite(options.timeout) || options.timeout < 0)
        throw Error(ErrorKind::Usage, "--timeout wants a number of seconds that is not negative");
    if (options.quiet && options.verbose)
        throw Error(ErrorKind::Usage, "--quiet and --verbose exclude each other");
}

// Where a switch's version can be given, the program's own is not meant; answering with it would pass for
// done.
void RefuseProgramVersion(const Parsed &parsed) {
    if (!parsed.version || parsed.help || !parsed.command) return;
    for (const OptionRow &row : parsed.command->options) {
        if (std::strcmp(row.name, "--switch-version") == 0)
            throw Error(ErrorKind::Usage, "--version is the program's own version")
                .Try("a switch's version is given with --switch-version");
    }
}

// Fills `parsed` as far as it gets, also when it throws: an error names its verb.
void Parse(int argc, char **argv, Options &options, Parsed &parsed) {
    CLI::App root;
    root.set_help_flag();
    root.add_flag("-h,--help", parsed.help);
    root.add_flag("--version", parsed.version);
    root.add_flag("--bash-completion", parsed.completion);
    for (const OptionRow &row : CommonOptions())
        AddRow(root, row, options);
    std::vector<std::pair<CLI::App *, const Command *>> verbs;
    for (const Command &command : Commands()) {
        CLI::App *verb = AddCommand(root, command);
        for (const OptionRow &row : command.options)
            AddRow(*verb, row, options);
        verbs.emplace_back(verb, &command);
    }
    // Which verb the words name is known even when its operands are missing, as with `dvsctl show --help`.
    const auto find = [&] {
        for (const auto &[verb, command] : verbs)
            if (verb->parsed()) parsed.command = command;
    };
    try {
        root.parse(argc, argv);
        find();
        RefuseProgramVersion(parsed);
    } catch (const CLI::ParseError &failure) {
        find();
        RefuseProgramVersion(parsed);
        if (parsed.IsAbout()) return;
        Error error(ErrorKind::Usage, failure.what());
        if (!parsed.command) ExplainUnknownVerb(error, argc, argv);
        error.next =
            parsed.command ? "dvsctl " + std::string(parsed.command->name) + " --help" : "dvsctl --help";
        error.next += " shows what there is";
        throw Error(error);
    }
    if (parsed.IsAbout()) return;
    if (!parsed.command) {
        Error error(ErrorKind::Usage, "no verb was given");
        ExplainUnknownVerb(error, argc, argv);
        error.next = "dvsctl --help shows what there is";
        throw Error(error);
    }
    CheckOptions(options);
}

Exit ShowAbout(const Parsed &parsed, const Options &options, Output &out) {
    const std::string text = parsed.version      ? "dvsctl " DVSCTL_VERSION "\n"
                             : parsed.completion ? BashCompletion()
                             : parsed.command    ? CommandHelp(*parsed.command)
                                                 : OverviewHelp();
    if (options.json) {
        boost::json::object document = Envelope(parsed.command ? parsed.command->name : "");
        if (parsed.version)
            document["version"] = DVSCTL_VERSION;
        else
            document[parsed.completion ? "script" : "help"] = text;
        out.Json(std::move(document));
    } else {
        out.Write(text);
    }
    return Exit::Done;
}

// Errors of a usage that could not be parsed come as JSON too when the words ask for it.
bool AsksForJson(int argc, char **argv) {
    for (int i = 1; i < argc && std::strcmp(argv[i], "--") != 0; ++i)
        if (std::strcmp(argv[i], "--json") == 0) return true;
    return false;
}

// `diff` keeps 1 for "different".
Exit StatusFor(const Parsed &parsed, const Error &error) {
    const bool isDiff = parsed.command && std::strcmp(parsed.command->name, "diff") == 0;
    const Exit status = ExitOf(error.kind);
    return isDiff && status == Exit::Failed ? Exit::DiffTrouble : status;
}

Exit Report(const Error &error, const Parsed &parsed, bool asJson, Output &out) {
    const Exit status = StatusFor(parsed, error);
    out.Discard();
    if (error.isSilent) return status;
    if (asJson) {
        boost::json::object document = Envelope(parsed.command ? parsed.command->name : "");
        document["error"] = ErrorJson(error, status);
        out.Json(std::move(document));
        try {
            out.Finish();
            return status;
        } catch (const Error &) {
            // Standard output is gone; people get the text instead.
        }
    }
    out.Diagnose(ErrorText(error, out.ErrorColour()));
    return status;
}

Error OutOfMemory() {
    return Error(ErrorKind::Failed, "not enough memory")
        .Try("free memory, or look at a part: --switch, --port");
}

} // namespace

int RunCommandLine(int argc, char **argv) {
    ReserveStandardDescriptors();
    std::signal(SIGPIPE, SIG_IGN); // a reader that went away is an error like any other
    Options options;
    Output out;
    LogCapture log;
    Parsed parsed;
    const auto run = [&]() -> Exit {
        Parse(argc, argv, options, parsed);
        if (parsed.IsAbout()) return ShowAbout(parsed, options, out);
        out.Configure(options);
        log.SetVerbose(options.verbose);
        Context context{options, out, log, Deadline(options.timeout)};
        return parsed.command->run(context);
    };
    const auto report = [&](Error error) {
        if (error.messages.empty()) error.messages = log.Take();
        return static_cast<int>(Report(error, parsed, options.json || AsksForJson(argc, argv), out));
    };
    try {
        const Exit status = run();
        out.Finish();
        return static_cast<int>(status);
    } catch (const Error &error) {
        return report(error);
    } catch (const std::bad_alloc &) {
        return report(OutOfMemory());
    } catch (const std::exception &failure) {
        return report(Error(ErrorKind::Failed, "unexpected trouble").Because(failure.what()));
    }
}

} // namespace dvs::ctl
