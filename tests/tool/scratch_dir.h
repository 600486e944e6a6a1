// A fresh directory under /tmp for one test, removed with it.
#pragma once

#include <cstdlib>
#include <filesystem>
#include <string>

namespace zel::tool::test {

class ScratchDir {
 public:
  ScratchDir() {
    char name[] = "/tmp/zelcc_tool_XXXXXX";
    path_ = mkdtemp(name) ? name : "/tmp";
  }
  ~ScratchDir() {
    if (path_ != "/tmp") std::filesystem::remove_all(path_);
  }
  std::string file(const std::string& name) const { return path_ + "/" + name; }

 private:
  std::string path_;
};

}  // namespace zel::tool::test
