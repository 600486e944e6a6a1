// The zelcc program run as a user runs it: the test card through gray to
// RGB, pictures from files, family arguments, and every kind of mistake
// answered by one line on stderr and a non-zero exit.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <filesystem>
#include <fstream>
#include <sstream>

#include "image_io.h"
#include "scratch_dir.h"
#include "test_card.h"

namespace {

using namespace zel::tool;

struct Result {
  int code;
  std::string out, err;
  int errLines() const { return int(std::count(err.begin(), err.end(), '\n')); }
};

class Cli : public ::testing::Test {
 protected:
  std::string file(const std::string& name) const { return dir_.file(name); }
  Result run(const std::string& args) const {
    const std::string cmd = std::string(ZELCC_TOOL) + " " + args + " >" + file("stdout") + " 2>" + file("stderr");
    const int status = std::system(cmd.c_str());
    Result r{WIFEXITED(status) ? WEXITSTATUS(status) : -1, slurp(file("stdout")), slurp(file("stderr"))};
    return r;
  }
  // A failure: non-zero exit, nothing on stdout but the status line of a
  // call, one line on stderr that names the tool and says `what`.
  void expectFailure(const std::string& args, const std::string& what, int code = 1) const {
    const Result r = run(args);
    EXPECT_EQ(r.code, code) << args;
    EXPECT_EQ(r.errLines(), 1) << args << "\n" << r.err;
    EXPECT_EQ(r.err.rfind("zelcc: ", 0), 0u) << r.err;
    EXPECT_NE(r.err.find(what), std::string::npos) << args << "\n" << r.err;
  }
  static std::string slurp(const std::string& path) {
    std::ifstream in(path);
    std::stringstream s;
    s << in.rdbuf();
    return s.str();
  }

 private:
  zel::tool::test::ScratchDir dir_;
};

TEST_F(Cli, SampleCardThroughGrayToRgbIsTheCardInGray) {
  const Result r = run("run zeliGrayToRGB_8u_C1C3R --sample --out " + file("x"));
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_NE(r.out.find("StatusOk"), std::string::npos);
  EXPECT_NE(r.out.find(" ms"), std::string::npos);
  EXPECT_TRUE(r.err.empty());
  const Picture p = readImage(file("x.png"));
  ASSERT_EQ(p.width, 640);
  ASSERT_EQ(p.height, 480);
  ASSERT_EQ(p.channels, 3);
  ASSERT_EQ(p.depth, 8);
  const Picture card = makeTestCard(640, 480);
  uint16_t lo = 255, hi = 0;
  for (int y = 0; y < 480; ++y)
    for (int x = 0; x < 640; ++x) {
      ASSERT_EQ(p.at(x, y, 0), p.at(x, y, 1));
      ASSERT_EQ(p.at(x, y, 0), p.at(x, y, 2));
      ASSERT_EQ(p.at(x, y, 0), (card.luma(x, y) * 255 + 32767) / 65535) << x << "," << y;
      lo = std::min(lo, p.at(x, y, 0));
      hi = std::max(hi, p.at(x, y, 0));
    }
  EXPECT_EQ(lo, 0);
  EXPECT_EQ(hi, 255);
}

TEST_F(Cli, PicturesFromFilesSizesAndFamilyArguments) {
  // A 16-bit gray PGM goes through unchanged into 16-bit RGB.
  Picture in(7, 5, 1, 16);
  for (size_t i = 0; i < in.samples.size(); ++i) in.samples[i] = uint16_t(i * 1999);
  writePnm(file("in.pgm"), in);
  Result r = run("run zeliGrayToRGB_16u_C1C4R --in " + file("in.pgm") + " --out " + file("g"));
  ASSERT_EQ(r.code, 0) << r.err;
  Picture p = readImage(file("g.png"));
  ASSERT_EQ(p.channels, 4);
  ASSERT_EQ(p.depth, 16);
  for (int x = 0; x < 7; ++x) {
    EXPECT_EQ(p.at(x, 4, 1), in.at(x, 4, 0));
    EXPECT_EQ(p.at(x, 4, 3), 200);  // the default alpha
  }
  // --size scales a picture from a file, and --arg sets alpha.
  r = run("run zeliGrayToRGB_8u_C1C4R --in " + file("in.pgm") + " --size 14x3 --arg alpha=7 --out " + file("h"));
  ASSERT_EQ(r.code, 0) << r.err;
  p = readImage(file("h.png"));
  EXPECT_EQ(p.width, 14);
  EXPECT_EQ(p.height, 3);
  EXPECT_EQ(p.at(13, 2, 3), 7);
  // The card at any size; floats come out in 8 bits.
  r = run("run zeliGrayToRGB_32f_C1C3R --size 3x2 --out " + file("f"));
  ASSERT_EQ(r.code, 0) << r.err;
  p = readImage(file("f.png"));
  EXPECT_EQ(p.width, 3);
  EXPECT_EQ(p.depth, 8);
  EXPECT_EQ(p.at(0, 0, 0), 255);  // the white bar
}

TEST_F(Cli, ListInfoHelpAndVersion) {
  Result r = run("list GrayToRGB");
  EXPECT_EQ(r.code, 0);
  EXPECT_EQ(std::count(r.out.begin(), r.out.end(), '\n'), 6);
  r = run("list '*_32f_C1C?R'");
  EXPECT_EQ(r.out, "zeliGrayToRGB_32f_C1C3R\nzeliGrayToRGB_32f_C1C4R\n");
  r = run("info zeliGrayToRGB_16u_C1C4R");
  EXPECT_EQ(r.code, 0);
  for (const char* part : {"alpha", "default 200", "16u", "C4", "srcStep", "minimum size  1x1"})
    EXPECT_NE(r.out.find(part), std::string::npos) << part << "\n" << r.out;
  r = run("--help");
  EXPECT_EQ(r.code, 0);
  EXPECT_EQ(r.out.rfind("usage: zelcc list", 0), 0u);
  r = run("");
  EXPECT_NE(r.code, 0);
  EXPECT_EQ(r.out.rfind("usage: zelcc list", 0), 0u);
  r = run("--version");
  EXPECT_NE(r.out.find("8.2.1"), std::string::npos);
}

TEST_F(Cli, DocWritesTheTableToAFileOrStdout) {
  const Result printed = run("doc");
  ASSERT_EQ(printed.code, 0) << printed.err;
  EXPECT_EQ(printed.out.rfind("# Exports\n", 0), 0u);
  EXPECT_NE(printed.out.find("| `zeliGrayToRGB_8u_C1C4R` | src, srcStep, dst, dstStep, size, alpha |"),
            std::string::npos);
  const Result written = run("doc " + file("exports.md"));
  ASSERT_EQ(written.code, 0) << written.err;
  EXPECT_TRUE(written.out.empty());
  EXPECT_EQ(slurp(file("exports.md")), printed.out);
  expectFailure("doc a b", "at most one file name", 2);
  expectFailure("doc " + file("no/such/dir/x.md"), "cannot write");
}

TEST_F(Cli, MistakesGetOneLineAndAFailingExit) {
  const std::string out = " --out " + file("o");
  expectFailure("run zeliNoSuch_8u_C1R --sample" + out, "unknown export 'zeliNoSuch_8u_C1R'");
  expectFailure("run zeliGrayToRGB_8u_C1C3R --in " + file("missing.png") + out, "No such file");
  std::ofstream(file("bad.png"), std::ios::binary) << "\x89PNG\r\n\x1a\n" << std::string(100, 'z');
  expectFailure("run zeliGrayToRGB_8u_C1C3R --in " + file("bad.png") + out, file("bad.png"));
  std::ofstream(file("bad.ppm"), std::ios::binary) << "P6\n4 4\n255\nxyz";
  expectFailure("run zeliGrayToRGB_8u_C1C3R --in " + file("bad.ppm") + out, "truncated");
  expectFailure("run zeliGrayToRGB_8u_C1C4R --arg alpha=300" + out, "alpha");
  expectFailure("run zeliGrayToRGB_8u_C1C4R --arg alpha=bright" + out, "alpha");
  expectFailure("run zeliGrayToRGB_8u_C1C4R --arg gamma=1" + out, "no argument 'gamma'");
  expectFailure("run zeliGrayToRGB_8u_C1C3R --arg alpha=1" + out, "takes no family arguments");
  expectFailure("run zeliGrayToRGB_8u_C1C4R --arg alpha" + out, "NAME=VALUE", 2);
  expectFailure("run zeliGrayToRGB_8u_C1C3R --size 0x4" + out, "0x4");
  expectFailure("run zeliGrayToRGB_8u_C1C3R --out " + file("no/such/dir/o"), "cannot write");
  expectFailure("run zelccGetLibVersion" + out, "converts no images");
  expectFailure("run zeliGrayToRGB_8u_C1C3R", "--out", 2);
  expectFailure("frobnicate", "unknown command", 2);
  expectFailure("list NoSuchThing", "no export matches");
  expectFailure("info zeliNoSuch", "unknown export");
  EXPECT_FALSE(std::filesystem::exists(file("o.png")));
}

}  // namespace
