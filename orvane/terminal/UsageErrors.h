// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/terminal/manual/CommandTree.h"

#include <string>

namespace CLI {
class App;
class ParseError;
}  // namespace CLI

namespace orvane {

/// What the parser objects to, as one sentence in the language of the texts that names the option
/// or the argument. `parser` is the one that threw the error.
std::string usageSentence(const CLI::ParseError& error, const CLI::App& parser,
                          const manual::CommandTree& tree, const Translator& texts);

}  // namespace orvane
