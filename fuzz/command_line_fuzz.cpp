// Parses arbitrary arguments (one a line) as the migration's command line. Each "-name:value"
// argument must read back as the last one of its name gave it, and the run is valid exactly when
// the six values are present and the destination product is known.

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "fuzz/scratch.h"
#include "migrate/cmdline_parser.h"
#include "migrate/manager.h"

namespace {

const std::size_t kMaxArguments = 64;

std::vector<std::string> Arguments(std::string_view input) {
  std::vector<std::string> arguments = {"vxmigrate"};
  while (!input.empty() && arguments.size() < kMaxArguments) {
    const std::size_t end = input.find('\n');
    std::string argument(input.substr(0, end));
    // The parser takes C strings: an argument ends at its first NUL, as on a real command line.
    argument.resize(std::min(argument.size(), argument.find('\0')));
    arguments.push_back(argument);
    if (end == std::string_view::npos) break;
    input.remove_prefix(end + 1);
  }
  return arguments;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  std::vector<std::string> arguments = Arguments(vxfuzz::AsText(data, size));
  std::vector<char*> argv;
  for (std::string& argument : arguments) argv.push_back(&argument[0]);
  argv.push_back(nullptr);

  MigrationCmdLineParser parser(static_cast<int>(arguments.size()), argv.data());
  const int valid = parser.ParseCommand();
  vxfuzz::Check(valid == parser.IsValid() && (valid == 0 || valid == 1), "validity is 0 or 1");

  std::map<std::string, std::string> expected;
  for (std::size_t i = 1; i < arguments.size(); ++i) {
    const std::string& argument = arguments[i];
    if (argument.size() < 2 || argument[0] != '-') continue;
    const std::size_t split = argument.find(':', 1);
    const std::string name = argument.substr(1, split == std::string::npos ? split : split - 1);
    if (!name.empty()) expected[name] = split == std::string::npos ? "" : argument.substr(split + 1);
  }
  for (const auto& [name, value] : expected) {
    vxfuzz::Check(parser.Exists(name.c_str()) == 1 && parser.GetValue(name.c_str()).str() == value,
                  "each option reads back as its last argument gave it");
  }
  bool complete = expected.count("P1") != 0 && expected.count("P2") != 0 &&
                  vxMigrationManager::GetProductID(expected["P2"].c_str()) > 0;
  for (const char* name : {"D1", "D2", "V1", "V2"}) complete = complete && expected.count(name) != 0;
  vxfuzz::Check(valid == (complete ? 1 : 0), "valid exactly when the run is complete");
  return 0;
}
