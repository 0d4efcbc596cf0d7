#include "tools/options.h"

#include <charconv>
#include <cstdio>
#include <map>
#include <memory>

#include <CLI/CLI.hpp>

#include "PelmImageDecoder.h"

namespace pelm_tool {
namespace {

constexpr const char *description = "Decodes images with the Pelm image decoder and writes them as PNG, PPM, PAM or "
                                    "raw pixels.";

constexpr const char *remarks = R"(
Inputs: BMP, PNG, GIF and WBMP files; "-" is standard input. With several inputs OUTPUT is a folder, or has %n (1, 2,
...) or %f (the input's name without folder and suffix) in it. "%%" is a percent sign. OUTPUT "-" is standard output.

Animations (GIF): without further options the first image is decoded as it is stored, without its place on the screen
and without transparency. --frame and --all-frames compose each frame with those before it; with --all-frames %n is
the number of the frame, and either all files are written or none. --animate writes one HTML file that holds all
frames and plays them with their delays (what lies below 20 ms is shown for 100, as browsers do) as often as the file
says; opened as PAGE#3 it shows the third frame. What no frame has painted yet is clear in rgba and white otherwise,
also with --background.

Sources: a PNG is decoded from memory. The others are read as a seekable file when it is a named one. A pipe is first
read to its end into memory; a GIF is then decoded front to back, BMP and WBMP from memory. With --source pipe a BMP
is decoded front to back as well, if it is in one call: the decoder then takes the rows from right behind the headers,
whatever the header says, and writes those of a top-down BMP upwards (the tool warns). With the other modes, and for
WBMP, --source pipe is a file that can seek. From file or pipe some PNGs cannot be decoded (a chunk begins across the
decoder's buffer).

Modes: oneshot decodes in one call. The others leave the same picture:
  iter     by bands of 100 rows (BMP), by blocks (PNG), by slices (GIF). PNG: turns to oneshot when the first block
           brings no row, and to line=16 for grey of 8 bits that is reduced.
  line=N   by calls for N rows each. A BMP or GIF is then not turned. An interlaced image cannot be decoded so, nor
           can frames.
  skia=N   BMP: in two steps, as a graphics library does, to 1/N of the size; skia is skia=1. With --box that is the
           size. Only this mode decodes headers of 108 and 124 bytes, RLE8 and RLE4; it takes no uncompressed file
           that is cut short. Palettes behind such headers are read from the wrong place: the colours of indexed
           images are wrong then. Moves in run-length codes are not made. The tool warns of both.
An interlaced PNG, reduced, goes through the frame buffer, where in rgb565 and rgb only transparency by tRNS lets the
background through.

Placement: fit reduces the image to the box (it never enlarges), keeps its shape and centres it. stretch fills the
box. exact reduces as fit does; the output is just the image. With exact and a quarter turn the decoder does not swap
width and height of the output, and what lies outside is cut off. A PNG is turned only when it is reduced or
stretched, and never when it is grey of 8 bits; reduced, that kind fills only a part of its place. In rgb565 a turn by
270 degrees shifts a PNG that is not square. A GIF at its own size is not turned in argb, rgba and bgra: use rgb or
bgrx. The decoder does so; the tool warns, but for the shift. A WBMP cannot be turned. Its odd margins have their
larger half left and above.

Background: what the image does not cover is black and, in formats with alpha, transparent; with --background it is
opaque in that colour. In rgb565 and rgb, which have no alpha, a PNG with transparency lies over it.

Formats: bgr565, bgr and bgrx exist for GIF only, and rgb565a for BMP and PNG. A BMP that is reduced or stretched has
red and blue exchanged in rgb565a: the decoder writes it so. WBMP has rgb565, rgb, rgba and bgra; at its own size
black is transparent in the last two (the tool warns), reduced or stretched white is 252 of 255.

Exit status: 0 done; 1 failed, no output; 2 done, but pixels are missing. With several inputs the worst: 1, then 2,
then 0.)";

CLI::ValidationError mistake(const std::string &option, const std::string &value, const char *expected) {
    return CLI::ValidationError(option, "\"" + value + "\" is not " + expected);
}

// The whole of `text` as a number.
template <class Number>
std::optional<Number> to_number(std::string_view text, int base = 10) {
    Number number{};
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, base);
    if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
    return number;
}

Box parse_box(const std::string &text) {
    const size_t cross = text.find('x');
    if (cross != std::string::npos) {
        const auto width = to_number<int32_t>(std::string_view(text).substr(0, cross));
        const auto height = to_number<int32_t>(std::string_view(text).substr(cross + 1));
        if (width && height && *width > 0 && *height > 0) return {*width, *height};
    }
    throw mistake("--box", text, "a size such as 640x480");
}

uint32_t parse_colour(const std::string &text) {
    const std::string_view digits = std::string_view(text).substr(text.starts_with('#') ? 1 : 0);
    const auto colour = to_number<uint32_t>(digits, 16);
    if (!colour || digits.size() != 6) throw mistake("--background", text, "a colour such as 204080");
    return *colour;
}

unsigned unit_shift(char unit) {
    switch (unit) {
    case 'k':
    case 'K': return 10;
    case 'm':
    case 'M': return 20;
    default: return 0;
    }
}

uint64_t parse_bytes(const std::string &text) {
    const unsigned shift = text.empty() ? 0 : unit_shift(text.back());
    const auto count = to_number<uint64_t>(std::string_view(text).substr(0, text.size() - (shift != 0)));
    if (!count || *count == 0 || *count > UINT64_MAX >> shift) {
        throw mistake("--max-memory", text, "a number of bytes such as 300000, 64k or 8M");
    }
    return *count << shift;
}

uint32_t parse_milliseconds(const std::string &text) {
    const auto count = to_number<uint32_t>(text);
    if (!count || *count == 0) throw mistake("--deadline", text, "a number of milliseconds above 0");
    return *count;
}

std::string names_of(std::span<const PixelFormat> formats) {
    std::string names;
    for (const PixelFormat &format : formats)
        names += std::string(names.empty() ? "" : "|") + format.name;
    return names;
}

const PixelFormat *parse_format(const std::string &text) {
    const PixelFormat *const format = find_pixel_format(text);
    if (format == nullptr)
        throw CLI::ValidationError("--format", "\"" + text + "\" is none of " + names_of(pixel_formats()));
    return format;
}

// The number above 0 that follows `name` in `text`.
std::optional<int32_t> number_after(std::string_view name, std::string_view text) {
    if (!text.starts_with(name)) return std::nullopt;
    const auto number = to_number<int32_t>(text.substr(name.size()));
    return number && *number > 0 ? number : std::nullopt;
}

Mode parse_mode(const std::string &text) {
    if (text == "oneshot") return {Calls::one_shot};
    if (text == "iter") return {Calls::iterative};
    if (text == "skia") return {Calls::in_two_steps};
    if (const auto lines = number_after("line=", text)) return {Calls::by_lines, *lines};
    if (const auto divisor = number_after("skia=", text)) return {Calls::in_two_steps, 0, *divisor};
    throw mistake("--mode", text, "oneshot, iter, line=N, skia or skia=N with N above 0");
}

// An option that takes one of the names in `values`.
template <class Value>
void add_choice(CLI::App &app, const std::string &name, Value &target, std::map<std::string, Value> values,
                const std::string &shown, const std::string &help) {
    const auto choose = [&target, name, values, shown](const std::string &text) {
        const auto found = values.find(text);
        if (found == values.end()) throw CLI::ValidationError(name, "\"" + text + "\" is none of " + shown);
        target = found->second;
    };
    app.add_option_function<std::string>(name, choose, help)->type_name(shown);
}

// An option whose text `parse` turns into the value.
template <class Target, class Parse>
void add_parsed(CLI::App &app, const std::string &name, Target &target, Parse parse, const std::string &shown,
                const std::string &help) {
    const auto take = [&target, parse](const std::string &text) { target = parse(text); };
    app.add_option_function<std::string>(name, take, help)->type_name(shown);
}

void add_picture_options(CLI::App &app, Options &options) {
    add_parsed(app, "--box", options.box, parse_box, "WxH", "Size of the output; default: the image's own");
    add_choice<uint32_t>(app, "--place", options.placement,
                         {{"fit", PELM_PLACE_FIT}, {"stretch", PELM_PLACE_STRETCH}, {"exact", PELM_PLACE_EXACT}},
                         "fit|stretch|exact", "How the image lies in the box; default: fit");
    add_choice<uint32_t>(
        app, "--rotate", options.rotation,
        {{"0", PELM_ROTATE_0}, {"90", PELM_ROTATE_90}, {"180", PELM_ROTATE_180}, {"270", PELM_ROTATE_270}},
        "0|90|180|270", "Degrees clockwise; default: 0");
    add_parsed(app, "--format", options.format, parse_format, "NAME",
               "Pixel format to decode to; default: rgba\n" + names_of(pixel_formats()));
    add_parsed(app, "--background", options.background, parse_colour, "RRGGBB",
               "Opaque colour of what the image does not cover");
}

void add_run_options(CLI::App &app, Options &options) {
    add_choice<SourceChoice>(
        app, "--source", options.source,
        {{"memory", SourceChoice::memory}, {"file", SourceChoice::file}, {"pipe", SourceChoice::pipe}},
        "memory|file|pipe", "How the decoder reads the input");
    add_parsed(app, "--mode", options.mode, parse_mode, "oneshot|iter|line=N|skia[=N]",
               "Which calls decode the image; default: oneshot");
    app.add_flag("--frame-buffer", options.frame_buffer,
                 "Write an interlaced PNG from a frame buffer; always done where it is reduced");
    add_parsed(app, "--max-memory", options.max_memory, parse_bytes, "BYTES[k|M]",
               "Most memory that the decoder may take, not counting the output");
    add_parsed(app, "--deadline", options.deadline, parse_milliseconds, "MS",
               "Most milliseconds for reading and decoding one input");
    app.add_flag("--stats", options.stats, "Tell time and memory of each decode on standard error");
    app.add_flag("--quiet", options.quiet, "No progress line and no warnings; failures are still told");
}

void add_files(CLI::App &app, Options &options) {
    app.add_option("INPUT", options.inputs, "The images")->required()->type_name("");
    app.add_option("-o,--output", options.output, "Where to write: .png, .ppm, .pam or .raw")->type_name("OUTPUT");
    add_choice<std::optional<OutputType>>(
        app, "--output-type", options.output_type,
        {{"png", OutputType::png}, {"ppm", OutputType::ppm}, {"pam", OutputType::pam}, {"raw", OutputType::raw}},
        "png|ppm|pam|raw", "Instead of what the suffix of OUTPUT says");
    app.add_flag("--info", options.info, "Write nothing; describe each input and what the decoder does with it");
}

void check_output(const Options &options) {
    const bool has_output = !options.output.empty();
    if (!has_output && !options.info && options.page.empty()) throw CLI::ValidationError("-o OUTPUT is required");
    if (has_output && options.info) throw CLI::ValidationError("--info writes no output: leave out -o");
}

void check_frames(const Options &options) {
    const int wishes = (options.frame > 0 ? 1 : 0) + (options.all_frames ? 1 : 0) + (options.page.empty() ? 0 : 1);
    if (wishes == 0) return;
    if (wishes > 1) throw CLI::ValidationError("only one of --frame, --all-frames and --animate at a time");
    if (options.info) throw CLI::ValidationError("--info lists all frames: leave out --frame, --all-frames, --animate");
    if (!options.page.empty() && !options.output.empty())
        throw CLI::ValidationError("--animate writes its own file: leave out -o");
    if (options.frame == 0 && options.inputs.size() > 1)
        throw CLI::ValidationError("--all-frames and --animate take one INPUT");
}

// The help text with a synopsis of our own: CLI11 does not count OUTPUT among the required.
class HelpFormatter : public CLI::Formatter {
public:
    std::string make_usage(const CLI::App *, std::string) const override {
        return "\nUsage: pelm-decode [OPTIONS] INPUT... -o OUTPUT\n       pelm-decode [OPTIONS] INPUT --animate "
               "PAGE.html\n"
               "       pelm-decode --info INPUT...\n";
    }
    std::string make_positionals(const CLI::App *) const override { return {}; }
};

uint32_t parse_frame(const std::string &text) {
    const auto number = to_number<uint32_t>(text);
    if (!number || *number == 0) throw mistake("--frame", text, "the number of a frame, from 1 on");
    return *number;
}

void add_animation_options(CLI::App &app, Options &options) {
    add_parsed(app, "--frame", options.frame, parse_frame, "N", "This frame of an animation, composed; the first is 1");
    app.add_flag("--all-frames", options.all_frames, "Every frame of an animation; OUTPUT has %n in it or is a folder");
    app.add_option("--animate", options.page, "Write a web page that plays the animation, instead of OUTPUT")
        ->type_name("PAGE.html");
}

int tell_mistake(const CLI::ParseError &error) {
    std::fprintf(stderr, "pelm-decode: %s (see pelm-decode --help)\n", error.what());
    return 1;
}

} // namespace

std::optional<int> parse_options(int argc, char **argv, Options &options) {
    CLI::App app(description, "pelm-decode");
    app.set_help_flag("-h,--help", "Print this and exit");
    app.set_version_flag("--version", "pelm-decode " PELM_VERSION, "Print the version and exit");
    const auto formatter = std::make_shared<HelpFormatter>();
    formatter->column_width(34);
    app.formatter(formatter);
    app.footer(remarks);
    add_files(app, options);
    add_animation_options(app, options);
    add_picture_options(app, options);
    add_run_options(app, options);
    try {
        app.parse(argc, argv);
        check_output(options);
        check_frames(options);
    } catch (const CLI::CallForHelp &) {
        std::fputs(app.help().c_str(), stdout);
        return 0;
    } catch (const CLI::CallForVersion &) {
        std::puts("pelm-decode " PELM_VERSION);
        return 0;
    } catch (const CLI::ParseError &error) {
        return tell_mistake(error);
    }
    return std::nullopt;
}

} // namespace pelm_tool
