// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/Completion.h"

#include "contract/foundation/UTF8.h"
#include "orvane/support/disks/FormatName.h"
#include "orvane/support/texts/Quantities.h"

#include <algorithm>
#include <map>

namespace orvane {
namespace {

using manual::CommandEntry;
using manual::OptionEntry;

/// What the words before the last one mean for it.
struct Position {
    const CommandEntry* command = nullptr;
    const OptionEntry* option = nullptr;  ///< whose value it is
    bool takesOptions = true;             ///< there was no "--"
    std::size_t arguments = 0;            ///< that the command has
};

class Reader {
public:
    Reader(const std::vector<std::string>& words, const CompletionSources& sources)
        : current_(words.empty() ? std::string() : words.back()), sources_(sources)
    {
        for (std::size_t i = 0; i + 1 < words.size(); ++i)
            take(words[i]);
    }

    Offer offer() const
    {
        if (at_.option != nullptr)
            return valuesOf(*at_.option, "");
        const std::size_t equals = current_.find('=');
        if (at_.takesOptions && current_.starts_with("--") && equals != std::string::npos) {
            const OptionEntry* const option = find(current_.substr(0, equals));
            return option != nullptr ? valuesOf(*option, current_.substr(0, equals + 1)) : Offer();
        }
        if (at_.takesOptions && current_.starts_with('-'))
            return options();
        return at_.command == nullptr ? Offer{commands()} : arguments();
    }

private:
    void take(const std::string& word)
    {
        if (at_.option != nullptr)
            at_.option = nullptr;
        else if (at_.takesOptions && word == "--")
            at_.takesOptions = false;
        else if (at_.takesOptions && word.starts_with('-') && word.size() > 1)
            at_.option = optionWithValue(word);
        else if (at_.command == nullptr)
            at_.command = sources_.tree.find(word);
        else
            ++at_.arguments;
    }

    const OptionEntry* find(std::string_view name) const
    {
        for (const auto* const options :
             {at_.command != nullptr ? &at_.command->options : nullptr, &sources_.tree.options})
            if (options != nullptr)
                for (const OptionEntry& option : *options)
                    if (option.name == name)
                        return &option;
        return nullptr;
    }

    const OptionEntry* optionWithValue(std::string_view word) const
    {
        const OptionEntry* const option = find(word);
        return option != nullptr && !option->value.empty() ? option : nullptr;
    }

    static Offer valuesOf(const OptionEntry& option, const std::string& before)
    {
        Offer offer;
        for (const std::string& choice : manual::choicesOf(option.value))
            offer.candidates.push_back({before + choice});
        offer.takesFiles = offer.candidates.empty() && !option.value.empty();
        return offer;
    }

    Offer options() const
    {
        Offer offer;
        if (at_.command != nullptr)
            for (const OptionEntry& option : at_.command->options)
                offer.candidates.push_back({option.name, option.text});
        for (const OptionEntry& option : sources_.tree.options)
            offer.candidates.push_back({option.name, option.text});
        return offer;
    }

    std::vector<Candidate> commands() const
    {
        std::vector<Candidate> commands;
        for (const CommandEntry& command : sources_.tree.commands)
            commands.push_back({command.name, command.text});
        return commands;
    }

    Offer arguments() const
    {
        if (at_.command->arguments.empty())
            return {};
        const manual::ArgumentEntry& argument = at_.command->arguments.front();
        if (argument.name == "TOPIC") {
            Offer topics{at_.arguments == 0 ? commands() : std::vector<Candidate>()};
            for (Candidate& topic :
                 at_.arguments == 0 ? sources_.topics() : std::vector<Candidate>())
                topics.candidates.push_back(std::move(topic));
            return topics;
        }
        return {argument.name == "DISK" ? disks() : std::vector<Candidate>(), true};
    }

    std::vector<Candidate> disks() const
    {
        std::vector<Candidate> found;
        std::map<std::string, int> labels;
        const auto trees = sources_.disks();
        const auto visit = [](const auto& self, const std::vector<DiskTree>& all,
                              const auto& function) -> void {
            for (const DiskTree& tree : all) {
                function(tree.facts);
                self(self, tree.children, function);
            }
        };
        visit(visit, trees, [&](const DiskFacts& facts) { ++labels[facts.label]; });
        visit(visit, trees,
              [&](const DiskFacts& facts) { add(facts, labels[facts.label] == 1, found); });
        return found;
    }

    // UUIDs are many and say little: they come when one is begun.
    void add(const DiskFacts& facts, bool isOnlyLabel, std::vector<Candidate>& found) const
    {
        std::string text = byteCount(facts.length);
        if (const std::string format = formatName(facts.filesystem, facts.filesystemVersion);
            !format.empty())
            text += " " + format;
        const std::string label = contract::printable(facts.label);
        found.push_back({facts.path.native(), label.empty() ? text : label + ", " + text});
        if (!facts.label.empty() && isOnlyLabel)
            found.push_back({"LABEL=" + facts.label, facts.path.native() + ", " + text});
        if (!facts.uuid.empty() && current_.starts_with('U'))
            found.push_back({"UUID=" + facts.uuid, facts.path.native() + ", " + text});
        if (!facts.mountPoint.empty())
            found.push_back({facts.mountPoint, facts.path.native() + ", " + text});
    }

    const std::string current_;
    const CompletionSources& sources_;
    Position at_;
};

}  // namespace

Offer offerFor(const std::vector<std::string>& words, const CompletionSources& sources)
{
    return Reader(words, sources).offer();
}

std::string plainReply(const std::vector<std::string>& words, const CompletionSources& sources)
{
    const Offer offer = offerFor(words, sources);
    std::string reply = offer.takesFiles ? "files" : "words";
    reply += '\0';
    for (const Candidate& candidate : offer.candidates)
        for (const std::string& part : {candidate.value, candidate.text}) {
            reply += part;
            reply += '\0';
        }
    return reply;
}

}  // namespace orvane
