#include "tools/output_names.h"

#include <filesystem>
#include <map>

#include "tools/failure.h"

namespace pelm_tool {
namespace {

namespace fs = std::filesystem;

constexpr struct {
    const char *suffix;
    OutputType type;
} suffixes[] = {
    {".png", OutputType::png}, {".ppm", OutputType::ppm}, {".pam", OutputType::pam}, {".raw", OutputType::raw}};

const char *suffix_of(OutputType type) {
    for (const auto &entry : suffixes) {
        if (entry.type == type) return entry.suffix;
    }
    return "";
}

OutputType type_of(const Options &options, const std::string &path) {
    if (options.output_type) return *options.output_type;
    if (path == "-") return OutputType::png;
    const std::string suffix = fs::path(path).extension().string();
    for (const auto &entry : suffixes) {
        if (suffix == entry.suffix) return entry.type;
    }
    throw Failure("cannot tell the type of \"" + path + "\": use .png, .ppm, .pam, .raw or --output-type");
}

// The input's name without folder and suffix.
std::string base_name(const std::string &input) {
    return input == "-" ? "stdin" : fs::path(input).stem().string();
}

bool is_folder(const std::string &path) {
    std::error_code ignored;
    return path.ends_with('/') || fs::is_directory(path, ignored);
}

std::string expand(const std::string &pattern, const std::string &input, size_t index) {
    std::string name;
    for (size_t at = 0; at < pattern.size(); ++at) {
        const char kind = pattern[at] == '%' && at + 1 < pattern.size() ? pattern[at + 1] : '\0';
        switch (kind) {
        case 'n': name += std::to_string(index + 1); break;
        case 'f': name += base_name(input); break;
        case '%': name += '%'; break;
        default: name += pattern[at]; continue;
        }
        ++at;
    }
    return name;
}

std::string path_for(const Options &options, size_t index) {
    const std::string &input = options.inputs[index];
    if (!is_folder(options.output)) return expand(options.output, input, index);
    const std::string file = base_name(input) + suffix_of(options.output_type.value_or(OutputType::png));
    return (fs::path(options.output) / file).string();
}

void refuse_twins(const Options &options, const std::vector<OutputName> &names) {
    std::map<std::string, size_t> writers;
    for (size_t i = 0; i < names.size(); ++i) {
        const auto [first, is_new] = writers.emplace(names[i].path, i);
        if (is_new) continue;
        throw Failure("\"" + options.inputs[first->second] + "\" and \"" + options.inputs[i] +
                      "\" would both be written to \"" + names[i].path + "\"; use %n, %f or a folder in -o");
    }
}

std::string frame_path(const Options &options, size_t frame) {
    const std::string &input = options.inputs[0];
    if (!is_folder(options.output)) return expand(options.output, input, frame);
    const std::string suffix = suffix_of(options.output_type.value_or(OutputType::png));
    return (fs::path(options.output) / (base_name(input) + "-" + std::to_string(frame + 1) + suffix)).string();
}

} // namespace

OutputName frame_output_name(const Options &options, size_t frame) {
    if (frame_path(options, 0) == frame_path(options, 1))
        throw Failure("every frame would be written to \"" + options.output + "\"; use %n or a folder in -o");
    const std::string path = frame_path(options, frame);
    return {path, type_of(options, path)};
}

std::vector<OutputName> output_names(const Options &options) {
    std::vector<OutputName> names;
    for (size_t i = 0; i < options.inputs.size(); ++i) {
        const std::string path = path_for(options, i);
        names.push_back({path, type_of(options, path)});
    }
    refuse_twins(options, names);
    return names;
}

} // namespace pelm_tool
