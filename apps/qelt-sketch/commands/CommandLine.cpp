#include "commands/CommandLine.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <functional>
#include <iterator>
#include <sstream>
#include <string_view>
#include <utility>
#include <vector>

#include <CLI/CLI.hpp>

#include "commands/Completion.h"
#include "commands/Manual.h"
#include "commands/PageInput.h"
#include "engine/MotionEvent.h"
#include "ink/Definitions.h"
#include "play/PageDrawing.h"
#include "play/PageFit.h"
#include "text/NumberText.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

// What an option takes: how the help shows it, how a refusal names it, the parser of its value, and what
// writes a value so that the parser reads it back. Every number goes through our own parsers, which do not
// depend on the locale.
template <typename Value>
struct Form {
  std::string shape;
  std::string wanted;
  std::function<std::optional<Value>(const std::string&)> parse;
  std::function<std::string(const Value&)> print;
};

// Options of a command that are read into one Options. The values that those have there before can be
// written as on a command line.
class OptionGroup {
 public:
  explicit OptionGroup(CLI::App& app) : mApp(app) {}

  // The target holds a Value, or an optional one.
  template <typename Value, typename Target>
  CLI::Option* add(const char* name, Target& target, const Form<Value>& form, const std::string& help) {
    if (const std::optional<Value> value = target)
      mWritten += ' ' + std::string(name) + '=' + form.print(*value);
    return addUnwritten<Value>(name, target, form, help);
  }

  // An option whose value is not written.
  template <typename Value, typename Target>
  CLI::Option* addUnwritten(const char* name, Target& target, const Form<Value>& form,
                            const std::string& help) {
    const auto read = [&target, form, name](const std::string& text) {
      const std::optional<Value> value = form.parse(text);
      if (!value) throw CLI::ValidationError(name, "expects " + form.wanted + ", not '" + text + "'");
      target = *value;
    };
    return mApp.add_option_function<std::string>(name, read, help)->type_name(form.shape);
  }

  // Two flags for one choice.
  void addChoice(const char* yes, const std::string& yesHelp, const char* no, const std::string& noHelp,
                 std::optional<bool>& target) {
    CLI::Option* const off = mApp.add_flag_callback(
        no, [&target] { target = false; }, noHelp);
    mApp.add_flag_callback(
            yes, [&target] { target = true; }, yesHelp)
        ->excludes(off);
    if (target) mWritten += ' ' + std::string(*target ? yes : no);
  }

  const std::string& written() const { return mWritten; }

 private:
  CLI::App& mApp;
  std::string mWritten;
};

std::optional<int> countFrom(int least, const std::string& text) {
  const std::optional<int> count = parseInt(text);
  return count && *count >= least ? count : std::nullopt;
}
std::optional<int> count(const std::string& text) {
  return countFrom(1, text);
}
// More than this is a slip of the finger, and would fill the memory.
constexpr int kMostPredicted = 10000;
std::optional<int> predictionCount(const std::string& text) {
  const std::optional<int> samples = countFrom(0, text);
  return samples && *samples <= kMostPredicted ? samples : std::nullopt;
}
std::optional<int> integer(const std::string& text) {
  return parseInt(text);
}

// More processes than this would fill the memory of any machine of today.
constexpr int kMostJobs = 256;
std::optional<int> jobs(const std::string& text) {
  const std::optional<int> processes = countFrom(1, text);
  return processes && *processes <= kMostJobs ? processes : std::nullopt;
}
constexpr int kMostLevels = 255;
std::optional<int> levels(const std::string& text) {
  const std::optional<int> count = countFrom(0, text);
  return count && *count <= kMostLevels ? count : std::nullopt;
}

std::optional<float> anyFloat(const std::string& text) {
  return parseFloat(text);
}

std::optional<float> finiteFloat(const std::string& text) {
  const std::optional<float> value = parseFloat(text);
  return value && std::isfinite(*value) ? value : std::nullopt;
}

std::optional<float> positiveFloat(const std::string& text) {
  const std::optional<float> value = finiteFloat(text);
  return value && *value > 0.0f ? value : std::nullopt;
}

std::optional<float> share(const std::string& text) {
  const std::optional<float> value = parseFloat(text);
  return value && *value >= 0.0f && *value <= 1.0f ? value : std::nullopt;
}

std::optional<std::uint32_t> argbColor(const std::string& text) {
  return parseArgb(text);
}

// "WxH"; `side` reads either.
template <typename Size, typename Side>
std::optional<Size> sizeFrom(const std::string& text, const Side& side) {
  const std::size_t cross = text.find('x');
  if (cross == std::string::npos) return std::nullopt;
  const auto width = side(text.substr(0, cross));
  const auto height = side(text.substr(cross + 1));
  if (!width || !height) return std::nullopt;
  return Size{*width, *height};
}
std::optional<PageSize> pageSize(const std::string& text) {
  return sizeFrom<PageSize>(text, positiveFloat);
}
std::optional<PixelSize> pixelSize(const std::string& text) {
  return sizeFrom<PixelSize>(text, count);
}

std::optional<OutlineOptions> outline(const std::string& text) {
  const std::size_t comma = text.find(',');
  if (comma == std::string::npos) return std::nullopt;
  const std::optional<float> size = parseFloat(text.substr(0, comma));
  const std::optional<unsigned int> argb = parseArgb(text.substr(comma + 1));
  if (!size || !argb) return std::nullopt;
  return OutlineOptions{*size, *argb};
}

std::optional<Background> background(const std::string& text) {
  if (text == "white") return Background{};
  if (text == "transparent") return Background{.transparent = true};
  const std::optional<unsigned int> rgb = parseRgb(text);
  if (!rgb) return std::nullopt;
  return Background{.rgb = *rgb};
}

constexpr std::array<std::pair<const char*, int>, 3> kToolNames{
    {{"stylus", Qelt::kToolStylus}, {"finger", Qelt::kToolFinger}, {"mouse", Qelt::kToolMouse}}};

// One of the words, which stay where they are.
template <typename Value, std::size_t count>
Form<Value> oneOf(const std::array<std::pair<const char*, Value>, count>& names) {
  std::string shape;
  for (const auto& [name, value] : names) shape += (shape.empty() ? "" : "|") + std::string(name);
  return {shape, shape,
          [&names](const std::string& text) -> std::optional<Value> {
            for (const auto& [name, value] : names) {
              if (text == name) return value;
            }
            return std::nullopt;
          },
          [&names](const Value& value) -> std::string { return nameIn(names, value); }};
}

std::string printInt(const int& value) {
  return std::to_string(value);
}
std::string printFloat(const float& value) {
  if (std::isnan(value)) return "nan";
  if (std::isinf(value)) return value > 0.0f ? "inf" : "-inf";
  std::string text;
  appendNumber(text, value);
  return text;
}
std::string printColor(const std::uint32_t& argb) {
  return formatArgb(argb);
}
std::string printPage(const PageSize& page) {
  return printFloat(page.width) + 'x' + printFloat(page.height);
}
std::string printPixels(const PixelSize& size) {
  return printInt(size.width) + 'x' + printInt(size.height);
}
std::string printOutline(const OutlineOptions& outline) {
  return printFloat(outline.size) + ',' + formatArgb(outline.argb);
}
std::string printBackground(const Background& background) {
  if (background.transparent) return "transparent";
  return background.rgb == 0xFFFFFF ? "white" : formatArgb(background.rgb).erase(1, 2);
}

const Form<int> kCount{"N", "a whole number from 1", count, printInt};
const Form<int> kJobs{"N", "a whole number from 1 to " + std::to_string(kMostJobs), jobs, printInt};
const Form<int> kInteger{"N", "a whole number", integer, printInt};
const Form<int> kPredictionCount{"K", "a whole number from 0 to " + std::to_string(kMostPredicted),
                                 predictionCount, printInt};
const Form<int> kLevels{"T", "a whole number from 0 to " + std::to_string(kMostLevels), levels, printInt};
const Form<float> kSize{"S", "a number", anyFloat, printFloat};
const Form<float> kZoom{"Z", "a number above 0", positiveFloat, printFloat};
const Form<float> kDegrees{"DEG", "a number of degrees", finiteFloat, printFloat};
const Form<float> kShare{"O", "a number from 0 to 1", share, printFloat};
const Form<std::uint32_t> kColor{"'#AARRGGBB'", "a colour as #AARRGGBB", argbColor, printColor};
const Form<PageSize> kPage{"WxH", "WxH, two numbers above 0", pageSize, printPage};
const Form<PixelSize> kPixels{"WxH", "WxH, two whole numbers from 1", pixelSize, printPixels};
const Form<Background> kBackground{"white|transparent|'#RRGGBB'", "white, transparent or #RRGGBB", background,
                                   printBackground};
const Form<OutlineOptions> kOutline{"SIZE,'#AARRGGBB'", "SIZE,#AARRGGBB", outline, printOutline};

// What --version tells, and the manual page.
const std::string kVersion = "qelt-sketch " QELT_VERSION;

// What the help tells as defaults.
const Options kDefaults;

std::string withDefault(const std::string& help, const std::string& value) {
  return help + " (default " + value + ")";
}

// Option by option, in the order the help shows them.

void addInput(CLI::App& app, Options& options) {
  app.add_option(
         "INPUT", options.input,
         "page of W3C InkML, or a picture that draw made; - is standard input (default: the sample page)")
      ->type_name("");
}

std::string limits() {
  return "Limits: a page's elements nest at most " + std::to_string(kDeepestNesting) +
         " deep; a picture has at most " + std::to_string(kLongestSide) + " pixels a side and " +
         std::to_string(kMostPixels) + " in all.";
}

void addOutput(CLI::App& app, Options& options, const char* help) {
  app.add_option("-o,--output", options.output, help)->required()->type_name("FILE");
}

void addPlugin(CLI::App& app, Options& options) {
  app.add_option("--plugin", options.plugin, "pen plug-in to load")->type_name("FILE")->group("");
  app.add_flag("--log", options.log, "show what plug-in and host log, on standard error");
}

void addPen(OptionGroup& group, Options& options) {
  group.add<float>("--size", options.size, kSize, "pen size (default: the file's, else the pen's)");
  group.add<std::uint32_t>("--color", options.argb, kColor,
                           "pen colour (default: the file's, else the pen's)");
}

void addFeeding(OptionGroup& group, Options& options) {
  group.addChoice("--curve", "smooth segments (default: the stroke's, else smooth)", "--no-curve",
                  "straight segments", options.curve);
  group.add<Mode>("--mode", options.mode, oneOf(kModeNames),
                  withDefault("how strokes reach the plug-in", nameOf(kDefaults.mode)));
  group.add<int>("--batch", options.samplesPerMove, kCount,
                 withDefault("live: samples a move event", printInt(kDefaults.samplesPerMove)));
  group.add<int>("--tool", options.tool, oneOf(kToolNames), "tool (default: the file's, else stylus)");
  group.add<int>("--source", options.source, kInteger,
                 withDefault("event source", std::to_string(Qelt::kSourceStylus) + " stylus, " +
                                                 std::to_string(Qelt::kSourceTouchScreen) + " finger, " +
                                                 std::to_string(Qelt::kSourceMouse) + " mouse"));
}

// One of the two, where a picture was drawn with one and the command line says the other too.
void addZoom(OptionGroup& group, Options& options) {
  const std::string help = withDefault("canvas pixels a stroke unit", printFloat(kDefaults.zoom));
  CLI::Option* const zoom = options.fit ? group.addUnwritten<float>("--zoom", options.zoom, kZoom, help)
                                        : group.add<float>("--zoom", options.zoom, kZoom, help);
  zoom->each([&options](const std::string&) { options.fit.reset(); });
  group
      .add<PixelSize>("--fit", options.fit, kPixels,
                      "the largest zoom at which the page fits into so many pixels")
      ->excludes(zoom);
}

void addDrawing(OptionGroup& group, Options& options) {
  group.add<int>(
      "--rendering-version", options.renderingVersion, kInteger,
      "rendering version of the pen (default: the stroke's, else " + printInt(kUsualRenderingVersion) + ")");
  addPen(group, options);
  addFeeding(group, options);
  group.add<int>("--repeat", options.repeat, kCount,
                 "draw the page N times, each onto a cleared layer; in stroke mode from the cache");
  addZoom(group, options);
  group.add<float>("--rotate", options.rotate, kDegrees,
                   withDefault("turn clockwise about the page's centre", printFloat(kDefaults.rotate)));
  group.add<PageSize>("--page", options.page, kPage,
                      "page in stroke units, from (0, 0) (default: the file's extent plus a margin)");
  group.add<Background>("--background", options.background, kBackground,
                        withDefault("what lies under the ink", printBackground(kDefaults.background)));
  group.add<OutlineOptions>("--outline", options.outline, kOutline,
                            "draw every stroke's outline under the strokes (default: those of the file)");
  group.add<int>(
      "--predict", options.predict, kPredictionCount,
      "live: K predicted samples, at most " + std::to_string(kMostPredicted) + ", after every move event");
  group.add<float>("--opacity", options.opacity, kShare,
                   withDefault("opacity of the prediction, 0 to 1", printFloat(kDefaults.opacity)));
  group.add<int>("--points", options.points, kCount,
                 "stop after the first N points of the last trace, the pen still down");
}

// Refuses combinations of options that contradict each other.
void checkTogether(const Options& options) {
  if (options.command != Command::Trace) return;
  if (options.drawable == DrawableKind::Prediction && (options.mode != Mode::Live || options.predict == 0)) {
    throw CLI::ValidationError("--drawable prediction", "needs --mode live and --predict K");
  }
  if (options.drawable == DrawableKind::Preview && options.mode == Mode::Stroke) {
    throw CLI::ValidationError("--drawable preview", "takes --mode live or event");
  }
}

UsageEnd usageEnd(const CLI::App& app, const CLI::ParseError& error) {
  std::ostringstream text;
  const bool asked = app.exit(error, text, text) == 0;
  return {text.str(), asked ? 0 : 2};
}

// Reads the options of a drawing, or those among them that a sheet has too. Throws CLI::ParseError.
void readInstruction(const std::string& instruction, Options& options, Command command) {
  CLI::App app;
  app.set_help_flag();
  OptionGroup group(app);
  if (command == Command::Sheet) {
    app.allow_extras();
    addPen(group, options);
    addFeeding(group, options);
  } else {
    addDrawing(group, options);
  }
  std::istringstream text(instruction);
  std::vector<std::string> words{std::istream_iterator<std::string>(text), {}};
  std::reverse(words.begin(), words.end());  // it takes them from the back
  app.parse(std::move(words));
}

// A command of the program, with its options.
struct CommandEntry {
  CLI::App* app;
  Command command;
};

// All of the program's options, read into `options`; the help, the manual page and the completion tell what
// is here.
std::vector<CommandEntry> addCommands(CLI::App& app, Options& options) {
  app.require_subcommand(1);

  CLI::App* const draw = app.add_subcommand("draw", "draw a page, or many, as PNG pictures");
  draw->add_option(
          "INPUT", options.inputs,
          "pages of W3C InkML, pictures that draw made, or folders of pages (*.inkml); - is standard "
          "input: a page, or with a folder to write to a list of such names, one a line (default: the "
          "sample page)")
      ->type_name("");
  draw->add_option("-o,--output", options.output,
                   "picture to write; or a folder (DIR/), in which every page gets a picture of its name")
      ->required()
      ->type_name("PATH");
  OptionGroup archived(*draw);
  archived.add<int>("--jobs", options.jobs, kJobs, "pages to draw at a time (default: as many as cores)");
  draw->add_flag("--again", options.again,
                 "draw pages, too, whose pictures in the folder are newer than they and the program");
  draw->add_flag_callback(
      "--no-ink", [&options] { options.ink = false; }, "a picture without the page and the options in it");
  draw->add_flag("--timings", options.timings,
                 "tell where the time went, and the most memory, on standard error");
  OptionGroup drawn(*draw);
  addDrawing(drawn, options);

  CLI::App* const trace =
      app.add_subcommand("trace", "write what the plug-in did, call by call, as JSON Lines");
  addInput(*trace, options);
  addOutput(*trace, options, "file to write; - is standard output");
  OptionGroup traced(*trace);
  addDrawing(traced, options);
  traced.add<DrawableKind>("--drawable", options.drawable, oneOf(kDrawableNames),
                           withDefault("whose calls to write", nameOf(kDefaults.drawable)));

  CLI::App* const preview = app.add_subcommand("preview", "draw the settings panel's sample stroke");
  addOutput(*preview, options, "picture to write");
  OptionGroup previewed(*preview);
  addPen(previewed, options);
  previewed.add<float>("--zoom", options.zoom, kZoom,
                       withDefault("canvas pixels a stroke unit", printFloat(kDefaults.zoom)));

  CLI::App* const sheet = app.add_subcommand("sheet", "draw the page once in every rendering version");
  addInput(*sheet, options);
  addOutput(*sheet, options, "picture to write");
  OptionGroup shown(*sheet);
  addPen(shown, options);
  addFeeding(shown, options);
  shown.add<PixelSize>(
      "--fit", options.fit, kPixels,
      "of each drawing: the largest zoom at which the page fits into so many pixels (default: "
      "at most 1, within " +
          printPixels(kUsualCell) + ")");

  CLI::App* const info =
      app.add_subcommand("info", "show plug-in path, GL renderer, version table and pen limits");

  CLI::App* const compare =
      app.add_subcommand("compare", "tell which pictures differ between two folders, or how two pictures do");
  compare->add_option("BEFORE", options.compare.before, "picture, or folder of pictures")
      ->required()
      ->type_name("");
  compare->add_option("AFTER", options.compare.after, "the same, to compare with it")
      ->required()
      ->type_name("");
  OptionGroup compared(*compare);
  compared.add<int>(
      "--tolerance", options.compare.tolerance, kLevels,
      withDefault("levels of 255 by which a pixel may differ: beyond it the exit status is 1 (pictures of "
                  "16 bits a channel are compared with 8)",
                  printInt(kDefaults.compare.tolerance)));
  compare
      ->add_option("-o,--output", options.compare.output,
                   "picture of what differs to write, in a frame that holds both, or a folder for such")
      ->type_name("PATH");

  for (CLI::App* const command : {draw, trace, preview, sheet, info}) addPlugin(*command, options);
  for (CLI::App* const command : {draw, trace, sheet}) command->footer(limits());
  return {{draw, Command::Draw},   {trace, Command::Trace}, {preview, Command::Preview},
          {sheet, Command::Sheet}, {info, Command::Info},   {compare, Command::Compare}};
}

// A text that was asked for instead of a command.
class AskedText : public CLI::Success {
 public:
  explicit AskedText(const std::string& text) : CLI::Success("AskedText", text, CLI::ExitCodes::Success) {}
};

// What the program tells about itself without a command.
void addTexts(CLI::App& app) {
  app.add_flag_callback(
      "--version", [] { throw AskedText(kVersion + "\n"); }, "show the program's version");
  app.add_flag_callback(
      "--man", [&app] { throw AskedText(manualPage(app, kVersion)); }, "print the manual page, for man -l");
  static constexpr std::array<std::pair<const char*, std::string (*)(const CLI::App&)>, 2> kShells{
      {{"bash", bashCompletion}, {"zsh", zshCompletion}}};
  const auto form = oneOf(kShells);
  app.add_option_function<std::string>(
         "--completion",
         [&app, form](const std::string& shell) {
           const auto script = form.parse(shell);
           if (!script)
             throw CLI::ValidationError("--completion", "expects " + form.wanted + ", not '" + shell + "'");
           throw AskedText((*script)(app));
         },
         "print a script by which the shell completes the program's command line")
      ->type_name(form.shape);
  app.footer(exitStatuses());
}

// Reads the command line; where it says nothing, the options stay as they are.
std::variant<Options, UsageEnd> parseOver(Options options, bool pictureIsRead) {
  std::vector<const char*> argv;
  for (const std::string& word : options.commandLine) argv.push_back(word.c_str());
  const int argc = static_cast<int>(argv.size());
  CLI::App app("Draws recorded ink with the pencil plug-in.", "qelt-sketch");
  addTexts(app);
  const std::vector<CommandEntry> commands = addCommands(app, options);

  try {
    app.parse(argc, argv.data());
    for (const auto& [command, value] : commands) {
      if (command->parsed()) options.command = value;
    }
    try {
      checkTogether(options);
    } catch (const CLI::ValidationError&) {
      // What is missing may be in the picture.
      if (pictureIsRead || !options.input || !maybePng(*options.input)) throw;
    }
  } catch (const AskedText& text) {
    return UsageEnd{text.what(), 0};
  } catch (const CLI::RequiredError& error) {
    if (!app.get_subcommands().empty() || argc < 2) return usageEnd(app, error);
    return UsageEnd{"no command '" + oneLine(argv[1]) + "'; see qelt-sketch --help\n", 2};
  } catch (const CLI::ParseError& error) {
    return usageEnd(app, error);
  }
  return options;
}

}  // namespace

std::variant<Options, UsageEnd> parseOptions(int argc, const char* const* argv) {
  Options options;
  options.commandLine.assign(argv, argv + argc);
  return parseOver(std::move(options), false);
}

std::string instructionFor(const Options& options) {
  Options written = options;
  CLI::App app;
  OptionGroup group(app);
  addDrawing(group, written);
  return group.written();
}

Options withInstruction(const Options& asked, const std::string& name, const std::string& instruction) {
  Options options;
  try {
    Options all;
    readInstruction(instruction, all, Command::Draw);
    readInstruction(instruction, options, asked.command);
  } catch (const CLI::ParseError& error) {
    throw Refusal(name + ": the picture says how it was drawn in a way that is not understood: " +
                  oneLine(error.what()));
  }
  options.commandLine = asked.commandLine;
  std::variant<Options, UsageEnd> merged = parseOver(std::move(options), true);
  if (const auto* const usage = std::get_if<UsageEnd>(&merged))
    throw Refusal(name + ": as the picture was drawn, " + usage->text.substr(0, usage->text.find('\n')));
  options = std::get<Options>(std::move(merged));
  // The command line may name many pages, of which this is one.
  options.input = asked.input;
  options.output = asked.output;
  return options;
}

void checkWithoutInstruction(const Options& asked) {
  try {
    checkTogether(asked);
  } catch (const CLI::ValidationError& error) {
    throw WrongUsage(usageEnd(CLI::App(), error));
  }
}

}  // namespace QeltDesktop
