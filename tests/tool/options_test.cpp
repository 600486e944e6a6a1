// The command line and family argument values.
#include <gtest/gtest.h>

#include "options.h"

namespace {

using namespace zel::tool;

CommandLine parsed(std::vector<std::string> args) { return parseCommandLine(args); }

TEST(CommandLine, RunOptionsInBothSpellings) {
  const CommandLine c = parsed({"run", "--in=a.png", "zeliX", "--out", "o/p", "--size", "33x7", "--arg", "alpha=3",
                                "--arg=level=1.5"});
  ASSERT_EQ(c.command, Command::Run);
  EXPECT_EQ(c.run.name, "zeliX");
  EXPECT_EQ(c.run.input, "a.png");
  EXPECT_EQ(c.run.outPrefix, "o/p");
  EXPECT_TRUE(c.run.sizeGiven);
  EXPECT_EQ(c.run.width, 33);
  EXPECT_EQ(c.run.height, 7);
  ASSERT_EQ(c.run.args.size(), 2u);
  EXPECT_EQ(c.run.args[1].first, "level");
  EXPECT_EQ(c.run.args[1].second, "1.5");
  EXPECT_EQ(parsed({}).command, Command::Usage);
  EXPECT_EQ(parsed({"--help"}).command, Command::Help);
  EXPECT_EQ(parsed({"list"}).pattern, "");
  EXPECT_EQ(parsed({"list", "Gray*"}).pattern, "Gray*");

  const std::vector<std::vector<std::string>> bad = {
      {"frobnicate"},
      {"run", "zeliX"},                                          // no --out
      {"run", "--out", "p"},                                     // no name
      {"run", "zeliX", "zeliY", "--out", "p"},                   // two names
      {"run", "zeliX", "--out", "p", "--in", "a", "--sample"},  // both inputs
      {"run", "zeliX", "--out"},                                 // value missing
      {"run", "zeliX", "--out", "p", "--bogus"},
      {"run", "zeliX", "--out", "p", "--arg", "novalue"},
      {"info"},
      {"list", "a", "b"},
      {"--help", "more"}};
  for (const auto& args : bad) EXPECT_THROW(parseCommandLine(args), UsageError) << args[0] << " " << args.size();
  for (const char* size : {"10", "x5", "5x", "5x-1", "0x5", "1.5x2", "99999x1", "8000x8000"}) {
    int w, h;
    EXPECT_THROW(parseSize(size, w, h), ToolError) << size;
  }
}

TEST(CommandLine, PatternsAreGlobsOrPartsOfNames) {
  EXPECT_TRUE(matchesPattern("zeliGrayToRGB_8u_C1C3R", "grayto"));
  EXPECT_TRUE(matchesPattern("zeliGrayToRGB_8u_C1C3R", "*_8u_*"));
  EXPECT_TRUE(matchesPattern("zeliGrayToRGB_8u_C1C3R", "zeligray*c1c?r"));
  EXPECT_FALSE(matchesPattern("zeliGrayToRGB_8u_C1C3R", "*_16u_*"));
  EXPECT_FALSE(matchesPattern("zeliGrayToRGB_8u_C1C3R", "Gray*"));  // a glob matches the whole name
  EXPECT_FALSE(matchesPattern("zeliGrayToRGB_8u_C1C3R", "C4"));
}

TEST(FamilyArguments, DefaultsOverridesAndRejections) {
  zel::meta::Descriptor d;
  std::string error;
  ASSERT_TRUE(zel::meta::describe("zeliThingToRGB_8u_C1C4R",
                                  "alpha arg:levels:i32:8:1=-54 arg:gain:f32:0.5 arg:matrix:ptr:48", d, error))
      << error;
  FamilyArguments a = resolveFamilyArguments(d, {});
  EXPECT_EQ(a.values, (std::vector<double>{200, 8, 0.5, 48}));
  EXPECT_TRUE(a.arrays.empty());

  a = resolveFamilyArguments(d, {{"alpha", "255"}, {"levels", "1"}, {"gain", "-2.5e3"}, {"matrix", "1,0,-2"}, {"alpha", "0"}});
  EXPECT_EQ(a.values, (std::vector<double>{0, 1, -2500, 48}));
  ASSERT_EQ(a.arrays.count(3), 1u);
  const std::vector<float>& m = a.arrays[3];
  ASSERT_GE(m.size(), 12u);
  EXPECT_EQ(m[0], 1.0f);
  EXPECT_EQ(m[2], -2.0f);
  EXPECT_EQ(m[3], 0.25f);
  EXPECT_EQ(resolveFamilyArguments(d, {{"matrix", "1,2,3,4,5,6,7,8,9,10,11,12,13,14"}}).arrays[3][13], 14.0f);

  const std::vector<std::pair<std::string, std::string>> bad[] = {
      {{"alpha", "256"}}, {{"alpha", "-1"}}, {{"alpha", "1.5"}}, {{"alpha", ""}},  {{"levels", "3000000000"}},
      {{"gain", "fast"}}, {{"matrix", "1,,2"}}, {{"matrix", "1,x"}}, {{"nosuch", "1"}}};
  for (const auto& given : bad) EXPECT_THROW(resolveFamilyArguments(d, given), ToolError) << given[0].first;
  try {
    resolveFamilyArguments(d, {{"nosuch", "1"}});
  } catch (const ToolError& e) {
    EXPECT_NE(std::string(e.what()).find("alpha, levels, gain, matrix"), std::string::npos) << e.what();
  }
}

}  // namespace
