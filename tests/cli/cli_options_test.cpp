#include "cli/cli_options.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "effects/mono/bw_sketch.h"

namespace quillane::cli {
namespace {

ParseResult Parse(std::vector<std::string> args) {
  return ParseCommandLine(args);
}

constexpr int kContrast = static_cast<int>(PencilToneMode::Contrast);
constexpr int kLighting = static_cast<int>(PencilToneMode::Lighting);

TEST(ParseCommandLineTest, ApplyTakesParametersInputAndOutput) {
  ParseResult r = Parse({"apply", "pencil-sketch", "--lighting", "140", "in.jpg", "-o", "o.png"});
  ASSERT_TRUE(r.Ok()) << r.error;
  EXPECT_EQ(r.options.command, Command::Apply);
  EXPECT_EQ(r.options.effect->cliName, "pencil-sketch");
  EXPECT_EQ(r.options.input, "in.jpg");
  EXPECT_EQ(r.options.output, "o.png");
  // Giving the lighting selects the lighting tone; the contrast keeps its default.
  EXPECT_EQ(r.options.params.Get("lighting"), 140);
  EXPECT_EQ(r.options.params.Get("tone-mode"), kLighting);
  EXPECT_EQ(r.options.params.Get("contrast"), 45);

  // No input: the built-in picture. "--name=value" works as well.
  r = Parse({"apply", "pencil-sketch", "--output=x.JPEG", "--contrast=0"});
  ASSERT_TRUE(r.Ok()) << r.error;
  EXPECT_EQ(r.options.input, "");
  EXPECT_EQ(r.options.params.Get("contrast"), 0);
  EXPECT_EQ(r.options.params.Get("tone-mode"), kContrast);
  EXPECT_EQ(r.options.params.Get("lighting"), 128);
}

TEST(ParseCommandLineTest, DashesEndOptionsAndStandForTheStandardStreams) {
  ParseResult r = Parse({"apply", "pencil-sketch", "-o", "o.png", "--", "-x.jpg"});
  ASSERT_TRUE(r.Ok()) << r.error;
  EXPECT_EQ(r.options.input, "-x.jpg");
  r = Parse({"apply", "pencil-sketch", "-", "-o", "-"});
  ASSERT_TRUE(r.Ok()) << r.error;
  EXPECT_EQ(r.options.input, "-");
  EXPECT_EQ(r.options.format, "png");
  r = Parse({"apply", "pencil-sketch", "-o", "-", "--format", "JPG"});
  ASSERT_TRUE(r.Ok()) << r.error;
  EXPECT_EQ(r.options.format, "jpg");
}

// Each wrong command line exits with the usage code; where the message matters, it says why.
TEST(ParseCommandLineTest, WrongCommandLinesAreUsageErrors) {
  using Args = std::vector<std::string>;
  const std::pair<Args, const char*> wrong[] = {
      {{"paint"}, ""},
      {{"apply"}, ""},
      {{"apply", "charcoal", "-o", "o.png"}, "charcoal"},
      {{"apply", "pencil-sketch", "--sharpness", "3", "-o", "o.png"}, ""},
      {{"apply", "pencil-sketch", "--tone-mode", "1", "-o", "o.png"}, "--contrast or --lighting"},
      {{"apply", "pencil-sketch", "in.jpg"}, ""},
      {{"apply", "pencil-sketch", "-o", "o.tiff"}, ""},
      {{"apply", "pencil-sketch", "-o", "/"}, "is a folder"},
      {{"apply", "pencil-sketch", "-o", "o.png", "--format", "png"}, ""},
      {{"apply", "pencil-sketch", "a.jpg", "b.jpg", "-o", "o.png"}, ""},
      {{"apply", "pencil-sketch", "-x", "-o", "o.png"}, ""},
      {{"apply", "pencil-sketch", "-o", "o.png", "--contrast"}, ""},
      {{"apply", "pencil-sketch", "--lighting", "10", "--contrast", "20", "-o", "o.png"},
       "--lighting and --contrast"},
      {{"apply", "pencil-sketch", "--contrast", "20", "--contrast=30", "-o", "o.png"},
       "--contrast given twice"},
      {{"batch", "pencil-sketch", "--lighting=256", "--input", "a", "--output", "b"},
       "--lighting must be an integer from 0 to 255"},
      {{"apply", "realism", "--kernel", "1,2,1,0,abc,0,-1,-1,-1", "-o", "o.png"},
       "'abc' is not a valid integer"},
      {{"apply", "pop-art", "--kernel", "1,2,3", "-o", "o.png"}, "9 integers separated by commas"},
      {{"apply", "brume", "--seed", "-1", "-o", "o.png"},
       "--seed must be an integer from 0 to 4294967295"},
      {{"batch", "pencil-sketch", "--input", "in"}, ""},
      {{"gallery"}, ""},
      {{"gallery", ""}, "the folder's name is empty"},
      {{"gallery", "--", "a", "b"}, "only one folder"},
      {{"apply", "realism", "--kernel", "1,2", "-o", "o.png"}, "--kernel must be"},
      {{"apply", "realism", "--kernel=1,2,1,0,x,0,-1,-1,-1", "-o", "o.png"},
       "--kernel: 'x' is not a valid integer"},
  };
  for (const auto& [args, says] : wrong) {
    const ParseResult r = Parse(args);
    std::string line;
    for (const auto& a : args) line += a + " ";
    EXPECT_FALSE(r.Ok()) << line;
    EXPECT_EQ(r.exitCode, kExitUsage) << line;
    EXPECT_NE(r.error.find(says), std::string::npos) << line << ": " << r.error;
  }
  // Every malformed number names the parameter and its range.
  for (const char* value :
       {"90", "-1", "4.5", "abc", "", "1e1", "0x10", "99999999999999999999", "++1", " 5"}) {
    const ParseResult r = Parse({"apply", "pencil-sketch", "--contrast", value, "-o", "o.png"});
    EXPECT_EQ(r.exitCode, kExitUsage) << value;
    EXPECT_NE(r.error.find("--contrast must be an integer from 0 to 89"), std::string::npos)
        << r.error;
  }
}

TEST(ParseCommandLineTest, EffectsWithoutARoutineOrBatchPanelAreRefused) {
  for (const EffectSpec* effect : Effects()) {
    const EffectSpec& e = *effect;
    const ParseResult apply = Parse({"apply", e.cliName, "-o", "o.png"});
    const ParseResult batch = Parse({"batch", e.cliName, "--input", "i", "--output", "o"});
    if (!e.routine) {
      EXPECT_EQ(apply.exitCode, kExitUsage) << e.cliName;
      EXPECT_NE(apply.error.find("not yet available"), std::string::npos) << e.cliName;
    } else {
      EXPECT_TRUE(apply.Ok()) << e.cliName;
    }
    EXPECT_EQ(batch.Ok(), e.routine && e.HasBatchPanel()) << e.cliName;
  }
}

// "-h" and "--help" were help wherever they stood, even as the names of files.
TEST(ParseCommandLineTest, HelpOnlyWhereAnOptionMayStand) {
  using Args = std::vector<std::string>;
  for (const Args& args : {Args{"--help"}, Args{"-h", "apply"}, Args{"apply", "nothing", "-h"},
                           Args{"convert", "a.png", "--help", "-o", "b.png"},
                           Args{"gallery", "--help=me"}, Args{"list", "-h"}})
    EXPECT_EQ(Parse(args).options.command, Command::Help) << args.back();
  EXPECT_EQ(Parse({"convert", "--", "--help", "-o", "out.png"}).exitCode, kExitUsage);
  const ParseResult named = Parse({"convert", "-o", "out.png", "--", "--help"});
  ASSERT_TRUE(named.Ok()) << named.error;
  EXPECT_EQ(named.options.input, "--help");
  const ParseResult output = Parse({"convert", "-o", "-h", "--", "-h"});
  EXPECT_FALSE(output.Ok());  // the output "-h" has no type; help is not what was asked
  EXPECT_NE(output.error.find("'-h'"), std::string::npos) << output.error;
  const ParseResult input = Parse({"batch", "pencil-sketch", "--input", "--help", "--output", "o"});
  ASSERT_TRUE(input.Ok()) << input.error;
  EXPECT_EQ(input.options.input, "--help");
  const ParseResult folder = Parse({"gallery", "--", "-h"});
  ASSERT_TRUE(folder.Ok()) << folder.error;
  EXPECT_EQ(folder.options.output, "-h");
}

TEST(ParseCommandLineTest, VersionListAndGallery) {
  EXPECT_EQ(Parse({"--version"}).options.command, Command::Version);
  EXPECT_EQ(Parse({"list"}).options.command, Command::List);
  const ParseResult g = Parse({"gallery", "out dir", "--input", "p.png"});
  ASSERT_TRUE(g.Ok());
  EXPECT_EQ(g.options.output, "out dir");
  EXPECT_EQ(g.options.input, "p.png");
}

TEST(OutputTypeForTest, ChosenByTheExtensionInAnyCase) {
  for (auto [name, type] : {std::pair{"a.jpg", OutputType::Jpeg},
                            {"a.Bmp", OutputType::Bitmap},
                            {"a.EMF", OutputType::Metafile},
                            {"a.png", OutputType::Png},
                            {"x.png/picture", OutputType::Unknown},
                            {"a.gif", OutputType::Unknown}})
    EXPECT_EQ(OutputTypeFor(name), type) << name;
}

}  // namespace
}  // namespace quillane::cli
