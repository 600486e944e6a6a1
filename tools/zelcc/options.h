// The command line: commands, run options, and family argument values
// checked against an export's descriptor.
#pragma once

#include <map>
#include <string>
#include <utility>
#include <vector>

#include "frame/descriptor.h"
#include "picture.h"

namespace zel::tool {

// A command line that cannot be understood; the tool points to --help.
class UsageError : public ToolError {
 public:
  explicit UsageError(const std::string& message) : ToolError(message) {}
};

extern const char* const kUsage;

struct RunOptions {
  std::string name;
  std::string input;      // empty: the built-in test card
  std::string outPrefix;
  bool sizeGiven = false;
  int width = 640, height = 480;
  std::vector<std::pair<std::string, std::string>> args;  // --arg NAME=VALUE, in order
};

enum class Command { Usage, Help, Version, List, Info, Doc, Run };

struct CommandLine {
  Command command = Command::Usage;
  std::string pattern;  // list
  std::string name;     // info
  std::string docFile;  // doc: where the table goes (empty: stdout)
  RunOptions run;
};

// Arguments after the program name.
CommandLine parseCommandLine(const std::vector<std::string>& args);

// "WxH", each side within the tool's limits.
void parseSize(const std::string& text, int& width, int& height);

// A name matches a glob pattern (when the pattern has * ? or [) or contains
// the pattern, ignoring case.
bool matchesPattern(const std::string& name, const std::string& pattern);

// Family argument values for a call: the descriptor's good value for each,
// replaced by the --arg values given. A pointer argument takes a list of
// numbers separated by commas, the floats it points to.
struct FamilyArguments {
  std::vector<double> values;                // one a family argument
  std::map<int, std::vector<float>> arrays;  // pointer arguments given, by family argument index
};
FamilyArguments resolveFamilyArguments(const meta::Descriptor& d,
                                       const std::vector<std::pair<std::string, std::string>>& given);

const char* argKindName(meta::ArgKind kind);

}  // namespace zel::tool
