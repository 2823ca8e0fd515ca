// wavkit help, and what all commands have in common.
#include <cstdio>
#include <filesystem>
#include <memory>

#include "base/error.hpp"
#include "base/near_miss.hpp"
#include "commands/commands.hpp"

namespace wavkit::tool {
namespace {

std::vector<std::string> command_names(const CLI::App& program) {
    std::vector<std::string> names;
    for (const auto* command : program.get_subcommands({})) names.push_back(command->get_name());
    return names;
}

/// What --output, or the second name of `convert`, says where a result goes.
const CLI::Option* output_of(const CLI::App& command) {
    for (const char* const name : {"--output", "OUT"}) {
        if (const auto* option = command.get_option_no_throw(name)) return option;
    }
    return nullptr;
}

}  // namespace

void check_command(const CLI::App& program, const std::string& name) {
    const auto names = command_names(program);
    if (std::ranges::count(names, name)) return;
    const auto meant = near_miss(CLI::detail::to_lower(name), names);
    throw UsageError(
        "there is no command '" + name + "'" +
        (meant.empty() ? "; wavkit help lists them" : "; did you mean '" + meant + "'?"));
}

void add_help(CLI::App& program) {
    auto* const command = program.add_subcommand("help", "Explains a command, or lists them all.");
    const auto name = std::make_shared<std::string>();
    command->add_option("COMMAND", *name, "the command to explain")->type_name("");
    command->footer("Example:\n  wavkit help spectrum");
    command->callback([&program, name] {
        if (!name->empty()) check_command(program, *name);
        const auto text = name->empty()
                              ? program.get_formatter()->make_help(&program, program.get_name(),
                                                                   CLI::AppFormatMode::Normal)
                              : program.get_subcommand(*name)->help(program.get_name());
        std::fputs(text.c_str(), stdout);
    });
}

void offer_skipping(CLI::App& program) {
    for (auto* const command : program.get_subcommands({})) {
        const auto* const output = output_of(*command);
        if (!output) continue;
        const auto skips = std::make_shared<bool>(false);
        command->add_flag("--skip-existing", *skips,
                          "do nothing where the output is there already");
        command->parse_complete_callback([skips, output] {
            if (!*skips || output->empty() || output->results().back() == "-") return;
            if (!std::filesystem::exists(output->results().back())) return;
            std::fprintf(stderr, "wavkit: %s is there already\n", output->results().back().c_str());
            throw CLI::RuntimeError(0);
        });
    }
}

}  // namespace wavkit::tool
