// Both texts are made from what CLI11 knows of the options.
#include "common/Manual.h"

#include <cstdio>
#include <sstream>
#include <vector>

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"

namespace {

std::vector<const CLI::App*> Verbs(const CLI::App& command) {
    return command.get_subcommands([](const CLI::App* verb) { return !verb->get_group().empty(); });
}

bool IsShown(const CLI::Option* option) {
    return !option->get_group().empty();
}

// "-o,--output" as its two names.
std::vector<std::string> Names(const CLI::Option* option) {
    std::vector<std::string> names;
    for (const std::string& name : option->get_snames()) names.push_back("-" + name);
    for (const std::string& name : option->get_lnames()) names.push_back("--" + name);
    return names;
}

// The values between the braces of "TEXT:{a,b}", with spaces between them; empty where any value will do.
std::string Choices(const CLI::Option* option) {
    const std::string type = option->get_type_name();
    const size_t open = type.find('{'), close = type.find('}');
    if (open == std::string::npos || close == std::string::npos) return "";
    std::istringstream list(type.substr(open + 1, close - open - 1));
    std::string choices;
    // "a->0" is the choice a.
    for (std::string choice; std::getline(list, choice, ',');)
        choices += (choices.empty() ? "" : " ") + choice.substr(0, choice.find("->"));
    return choices;
}

// Text in which nothing is a request or an escape.
std::string Roff(const std::string& text) {
    std::string out;
    for (const char c : text) {
        if (c == '\\') out += "\\e";
        if (c == '-') out += '\\';
        const bool lineStart = out.empty() || out.back() == '\n';
        if (lineStart && (c == '.' || c == '\'')) out += "\\&";
        if (c != '\\') out += c;
    }
    return out;
}

std::string OptionEntry(const CLI::Option* option) {
    std::string entry = ".TP\n";
    for (const std::string& name : Names(option))
        entry += (entry.size() > 4 ? ", " : "") + ("\\fB" + Roff(name) + "\\fR");
    if (option->get_type_size() != 0) entry += " \\fI" + Roff(option->get_type_name()) + "\\fR";
    return entry + "\n" + Roff(option->get_description()) + "\n";
}

std::string Page(const CLI::App& app, const std::string& name, const std::string& about) {
    std::string synopsis = ".SH SYNOPSIS\n\\fBqex\\fR", arguments, options, verbs, title = name;
    for (char& c : title) c = c == ' ' ? '-' : static_cast<char>(toupper(c));
    if (app.get_parent()) synopsis += " \\fB" + Roff(app.get_name()) + "\\fR";
    for (const CLI::Option* option : app.get_options()) {
        if (!IsShown(option)) continue;
        if (!option->nonpositional()) {
            const std::string word = "\\fI" + Roff(option->get_name(true)) + "\\fR";
            synopsis += option->get_required() ? " " + word : " [" + word + "]";
            arguments += ".TP\n" + word + "\n" + Roff(option->get_description()) + "\n";
        } else {
            options += OptionEntry(option);
        }
    }
    for (const CLI::App* verb : Verbs(app))
        verbs += ".TP\n\\fB" + verb->get_name() + "\\fR\n" + Roff(verb->get_description()) + "\n";
    if (!verbs.empty()) synopsis += " \\fIVERB\\fR ...", verbs = ".SH VERBS\n" + verbs;
    synopsis += " [\\fIOPTION\\fR ...]\n";
    return ".TH " + Roff(title) + " 1 \"\" \"qex " QEX_VERSION "\"\n.SH NAME\n" + Roff(name) + " \\- " +
           Roff(about) + "\n" + synopsis + verbs + (arguments.empty() ? "" : ".SH ARGUMENTS\n" + arguments) +
           ".SH OPTIONS\n" + options + ".SH NOTES\n.nf\n" + Roff(app.get_footer()) + "\n.fi\n";
}

}  // namespace

std::string BashCompletion(const CLI::App& command) {
    std::ostringstream cases;
    std::string verbs;
    for (const CLI::App* verb : Verbs(command)) {
        std::string options, values;
        for (const CLI::Option* option : verb->get_options()) {
            if (!IsShown(option) || !option->nonpositional()) continue;
            const std::vector<std::string> names = Names(option);
            const std::string choices = Choices(option);
            for (const std::string& name : names) options += " " + name;
            if (choices.empty()) continue;
            for (const std::string& name : names) values += (&name == &names[0] ? "        " : "|") + name;
            values += ") values='" + choices + "' ;;\n";
        }
        verbs += (verbs.empty() ? "" : " ") + verb->get_name();
        cases << "    " << verb->get_name() << ")\n        options='" << options.substr(1) << "'\n";
        if (!values.empty()) cases << "        case $previous in\n" << values << "        esac\n";
        cases << "        ;;\n";
    }
    return "# Completion of qex for bash.\n_qex() {\n"
           "    local word=${COMP_WORDS[COMP_CWORD]} previous=${COMP_WORDS[COMP_CWORD-1]} values= options=\n"
           "    case $([ \"$COMP_CWORD\" -gt 1 ] && echo \"${COMP_WORDS[1]}\") in\n" +
           cases.str() + "    '') values='" + verbs + " --help --version' ;;\n    esac\n" +
           "    if [ -n \"$values\" ]; then\n"
           "        COMPREPLY=($(compgen -W \"$values\" -- \"$word\"))\n"
           "    elif [[ $word == -* ]]; then\n"
           "        COMPREPLY=($(compgen -W \"$options\" -- \"$word\"))\n"
           "    else\n"
           "        compopt -o filenames 2>/dev/null\n"
           "        mapfile -t COMPREPLY < <(compgen -f -- \"$word\")\n"
           "    fi\n}\ncomplete -F _qex qex\n";
}

int PrintManual(const CLI::App& command, const std::string& verb) {
    if (verb.empty()) return Print(Page(command, "qex", "looks into, draws and converts 3D scenes"));
    for (const CLI::App* app : Verbs(command))
        if (app->get_name() == verb) return Print(Page(*app, "qex " + verb, app->get_description()));
    return Fail("man", "'" + verb + "' is no verb", 2);
}

int Print(const std::string& text) {
    fputs(text.c_str(), stdout);
    return 0;
}
