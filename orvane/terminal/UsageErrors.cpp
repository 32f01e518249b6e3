// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/UsageErrors.h"

#include <CLI/CLI.hpp>

#include <algorithm>

namespace orvane {
namespace {

/// The options and arguments of the program and of the command that was chosen, by their names.
class Known {
public:
    Known(const CLI::App& parser, const manual::CommandTree& tree)
        : parser_(parser), options_(tree.options)
    {
        const auto chosen = parser.get_subcommands();
        if (chosen.empty())
            return;
        app_ = chosen.front();
        command_ = tree.find(app_->get_name());
        options_.insert(options_.end(), command_->options.begin(), command_->options.end());
    }

    const manual::CommandEntry* command() const { return command_; }

    std::vector<std::string> optionNames() const
    {
        std::vector<std::string> names;
        for (const manual::OptionEntry& option : options_)
            names.push_back(option.name);
        return names;
    }

    const manual::OptionEntry* option(std::string_view name) const
    {
        const auto found =
            std::find_if(options_.begin(), options_.end(),
                         [&](const manual::OptionEntry& entry) { return entry.name == name; });
        return found == options_.end() ? nullptr : &*found;
    }

    /// What the parser calls its options by stands in its own (English) sentence, in this order.
    std::vector<std::string> namedIn(std::string_view sentence) const
    {
        std::vector<std::string> names;
        while (!sentence.empty()) {
            const std::size_t end = std::min(sentence.find_first_of(" :,"), sentence.size());
            const std::string_view word = sentence.substr(0, end);
            if (option(word) != nullptr || isArgument(word))
                names.emplace_back(word);
            sentence.remove_prefix(std::min(end + 1, sentence.size()));
        }
        return names;
    }

    /// What the user gave to an option, the last of it.
    std::string valueOf(const std::string& name) const
    {
        for (const CLI::App* const app : {app_, &parser_})
            if (const CLI::Option* const found =
                    app != nullptr ? app->get_option_no_throw(name) : nullptr)
                if (!found->results().empty())
                    return found->results().back();
        return {};
    }

private:
    bool isArgument(std::string_view word) const
    {
        return command_ != nullptr &&
               std::any_of(command_->arguments.begin(), command_->arguments.end(),
                           [&](const manual::ArgumentEntry& entry) { return entry.name == word; });
    }

    const CLI::App& parser_;
    const CLI::App* app_ = nullptr;
    const manual::CommandEntry* command_ = nullptr;
    std::vector<manual::OptionEntry> options_;
};

/// "SENTENCE; did you mean “a” or “b”?"
std::string withNearest(std::string sentence, std::string_view word,
                        const std::vector<std::string>& known, const Translator& texts)
{
    std::string near;
    for (const std::string& other : manual::nearest(word, known))
        near += (near.empty() ? "" : ", ") + texts.sentence("“%@”", {other});
    return near.empty() ? sentence : texts.sentence("%@ Did you mean %@?", {sentence, near});
}

std::string unknownCommand(const std::string& word, const manual::CommandTree& tree,
                           const Translator& texts)
{
    std::vector<std::string> names;
    for (const manual::CommandEntry& command : tree.commands)
        names.push_back(command.name);
    return withNearest(texts.sentence("There is no command “%@”.", {word}), word, names, texts);
}

std::string notExpected(const CLI::App& parser, const Known& known, const Translator& texts)
{
    const auto words = parser.remaining(true);
    const std::string word = words.empty() ? std::string() : words.front();
    const std::string name = word.substr(0, word.find('='));
    if (!word.starts_with('-'))
        return texts.sentence("“%@” is one argument too many.", {word});
    const std::string sentence =
        known.command() != nullptr
            ? texts.sentence("“%@” has no option “%@”.", {known.command()->name, name})
            : texts.sentence("There is no option “%@”.", {name});
    return withNearest(sentence, name, known.optionNames(), texts);
}

/// What was not understood comes first: what is missing may be because of it.
std::string missing(const CLI::App& parser, const Known& known,
                    const std::vector<std::string>& names, const manual::CommandTree& tree,
                    const Translator& texts)
{
    for (const std::string& word : parser.remaining(true))
        if (word.starts_with('-'))
            return notExpected(parser, known, texts);
        else if (known.command() == nullptr)
            return unknownCommand(word, tree, texts);
    if (known.command() != nullptr && !names.empty())
        return texts.sentence("“%@” takes at least one %@.",
                              {known.command()->name, texts.text(names.front())});
    return texts.text("A command is missing.");
}

std::string badValue(const std::string& name, const Known& known, const Translator& texts)
{
    const manual::OptionEntry* const option = known.option(name);
    const std::string value = known.valueOf(name);
    if (option == nullptr || option->value.empty())
        return texts.sentence("“%@” takes no value.", {name});
    std::string choices;
    for (const std::string& choice : manual::choicesOf(option->value))
        choices += (choices.empty() ? "" : ", ") + choice;
    if (value.empty())
        return texts.sentence("“%@” is not told its value (%@).",
                              {name, choices.empty() ? texts.text(option->value) : choices});
    return texts.sentence("“%@” cannot be “%@”; it is one of: %@.", {name, value, choices});
}

}  // namespace

std::string usageSentence(const CLI::ParseError& error, const CLI::App& parser,
                          const manual::CommandTree& tree, const Translator& texts)
{
    const Known known(parser, tree);
    const std::vector<std::string> names = known.namedIn(error.what());
    const auto is = [&error](CLI::ExitCodes code) {
        return error.get_exit_code() == static_cast<int>(code);
    };
    if (is(CLI::ExitCodes::RequiredError))
        return missing(parser, known, names, tree, texts);
    if (is(CLI::ExitCodes::ExtrasError))
        return notExpected(parser, known, texts);
    if (is(CLI::ExitCodes::RequiresError) && names.size() > 1)
        return texts.sentence("“%@” goes with “%@” only.", {names[0], names[1]});
    if (is(CLI::ExitCodes::ExcludesError) && names.size() > 1)
        return texts.sentence("“%@” and “%@” exclude each other.", {names[0], names[1]});
    if (!names.empty())
        return badValue(names.front(), known, texts);
    return texts.sentence("The arguments cannot be understood: %@", {error.what()});
}

}  // namespace orvane
