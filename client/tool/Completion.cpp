#include "client/tool/Completion.h"

#include <CLI/CLI.hpp>

#include <iostream>
#include <sstream>
#include <string_view>

#include "client/tool/Command.h"

namespace tarn::tool {

namespace {

std::vector<const CLI::App*> commandsOf(const CLI::App& program) {
    return program.get_subcommands([](const CLI::App* command) { return !command->get_group().empty(); });
}

const CLI::App* findCommand(const CLI::App& program, const std::string& word) {
    for (const auto* command : commandsOf(program))
        if (command->get_name() == word)
            return command;
    return nullptr;
}

const CLI::Option* findOption(const CLI::App& command, const std::string& word) {
    return word.starts_with('-') ? command.get_option_no_throw(word) : nullptr;
}

void offer(std::string_view word, std::string_view beginning, std::string_view description) {
    if (word.starts_with(beginning))
        std::cout << word << "\t" << description.substr(0, description.find('\n')) << "\n";
}

void offerOptions(const CLI::App& command, std::string_view beginning) {
    for (const auto* option : command.get_options())
        for (const auto& name : option->get_lnames())
            offer("--" + name, beginning, option->get_description());
}

void offerCommands(const CLI::App& program, std::string_view beginning) {
    for (const auto* command : commandsOf(program))
        offer(command->get_name(), beginning, command->get_description());
}

void offerLines(std::string_view beginning) {
    offer("grant", beginning, "Hand an open file to the service");
    offer("wait", beginning, "Wait for what was sent, or for an event");
    std::istringstream commands(describeCommands());
    for (std::string name, fields; commands >> name && std::getline(commands, fields);)
        offer(name, beginning, fields);
}

void offerArguments(const CLI::App& command, std::string_view beginning) {
    for (const auto* option :
         command.get_options([](const CLI::Option* it) { return it->get_positional(); })) {
        if (option->get_name(true) == "FILE")
            std::cout << ":files\n";
        if (option->get_name(true) == "LINE")
            offerLines(beginning);
    }
}

} // namespace

int runComplete(const CLI::App& commandLine, const std::vector<std::string>& words) {
    const CLI::App* command = &commandLine;
    const CLI::Option* awaited = nullptr; // the option that the word is a value of
    for (std::size_t index = 0; index + 1 < words.size(); ++index) {
        const auto* option = awaited == nullptr ? findOption(*command, words[index]) : nullptr;
        if (awaited == nullptr && command == &commandLine)
            if (const auto* found = findCommand(commandLine, words[index]))
                command = found;
        awaited = option != nullptr && option->get_items_expected_max() > 0 ? option : nullptr;
    }
    const std::string_view beginning = words.empty() ? std::string_view() : words.back();
    if (awaited != nullptr)
        std::cout << (awaited->get_type_name() == "PATH" ? ":files\n" : "");
    else if (beginning.starts_with('-'))
        offerOptions(*command, beginning);
    else if (command == &commandLine)
        offerCommands(commandLine, beginning);
    else
        offerArguments(*command, beginning);
    return 0;
}

} // namespace tarn::tool
