// The fuzz targets' scratch folder and runs.

#include "fuzz/scratch.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <system_error>

namespace vxfuzz {

namespace fs = std::filesystem;

namespace {

void RemoveScratch() {
  std::error_code ignored;
  fs::remove_all(Scratch(), ignored);
}

}  // namespace

const std::string& Scratch() {
  static const std::string folder = [] {
    std::string pattern = (fs::temp_directory_path() / "vxm-fuzz-XXXXXX").string();
    if (mkdtemp(&pattern[0]) == nullptr) Fail("a scratch folder can be made");
    return pattern;
  }();
  static const bool removedAtExit = std::atexit(RemoveScratch) == 0;
  (void)removedAtExit;
  return folder;
}

std::string ScratchPath(const std::string& relative) { return Scratch() + "/" + relative; }

void WriteFile(const std::string& path, std::string_view text) {
  std::error_code error;
  fs::create_directories(fs::path(path).parent_path(), error);
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out.write(text.data(), static_cast<std::streamsize>(text.size()));
  out.close();
  if (!out) Fail("the scratch folder takes the input");
}

bool ReadFile(const std::string& path, std::string* text) {
  std::ifstream in(path, std::ios::binary);
  if (!in) return false;
  text->assign(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
  return !in.bad();
}

void RemoveTree(const std::string& path) {
  std::error_code ignored;
  fs::remove_all(path, ignored);
}

void EmptyFolder(const std::string& path) {
  std::error_code error;
  for (const fs::directory_entry& entry : fs::directory_iterator(path, error)) {
    RemoveTree(entry.path().string());
  }
}

void MakeFolder(const std::string& path) {
  std::error_code error;
  fs::create_directories(path, error);
  if (error) Fail("the scratch folder takes a folder");
}

std::vector<std::string_view> SplitInput(std::string_view input, std::size_t parts) {
  std::vector<std::string_view> pieces;
  while (pieces.size() + 1 < parts) {
    const std::size_t cut = input.find('\f');
    if (cut == std::string_view::npos) break;
    pieces.push_back(input.substr(0, cut));
    input.remove_prefix(cut + 1);
  }
  pieces.push_back(input);
  pieces.resize(parts);
  return pieces;
}

void Fail(const char* property) {
  std::fprintf(stderr, "vxfuzz: property failed: %s\n", property);
  std::abort();
}

ScratchRun::ScratchRun(const std::vector<std::string>& options) {
  RemoveTree(ScratchPath("src"));
  RemoveTree(ScratchPath("dst"));
  MakeFolder(ScratchPath("src"));
  MakeFolder(ScratchPath("dst"));
  arguments_ = {ScratchPath("bin/vxmigrate"), "-D1:" + ScratchPath("src"),
                "-D2:" + ScratchPath("dst")};
  arguments_.insert(arguments_.end(), options.begin(), options.end());
}

std::string ScratchRun::Src(const std::string& relative) const {
  return ScratchPath("src/" + relative);
}
std::string ScratchRun::Dst(const std::string& relative) const {
  return ScratchPath("dst/" + relative);
}

vxMigrationManager& ScratchRun::manager() {
  if (manager_ == nullptr) {
    std::vector<char*> argv;
    for (std::string& argument : arguments_) argv.push_back(&argument[0]);
    argv.push_back(nullptr);
    manager_ = std::make_unique<vxMigrationManager>(static_cast<int>(arguments_.size()),
                                                    argv.data(),
                                                    vxStringBase(arguments_[0].c_str()));
    Check(manager_->IsValid(), "the scratch run is a valid run");
  }
  return *manager_;
}

}  // namespace vxfuzz
