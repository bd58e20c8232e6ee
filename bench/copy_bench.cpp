// Copies a generated installation tree (20,000 files, 1 GiB in all) with the manager's recursive
// copy and with the file manager's tree copy, timed beside "cp -a" of the same tree in the same
// run. The three copies take turns, twice, each into a destination of its own after a sync: no
// destination is deleted between runs, since the file system then spends its time skipping the
// inodes it just freed, which would bias whichever copy came after a delete.
// The tree lives in $VXM_BENCH_DIR (default $TMPDIR or /tmp) and is removed afterwards;
// VXM_BENCH_FILES and VXM_BENCH_BYTES shrink it for a quick check; VXM_BENCH_ROUNDS (default 2)
// sets how many times the three copies take turns.

#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <stdlib.h>
#include <unistd.h>

#include <chrono>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>
#include <vector>

#include "foundation/files/file_manager.h"
#include "migrate/manager.h"

namespace {

std::string g_root;  // holds src/ and the destinations

uint64_t EnvNumber(const char* name, uint64_t fallback) {
  const char* text = getenv(name);
  return text != nullptr && *text != '\0' ? std::strtoull(text, nullptr, 10) : fallback;
}

void Run(const std::string& command) {
  if (std::system(command.c_str()) != 0) {
    fprintf(stderr, "failed: %s\n", command.c_str());
    std::exit(1);
  }
}

bool WriteAll(int fd, const char* data, uint64_t size) {
  while (size > 0) {
    const ssize_t done = write(fd, data, size);
    if (done <= 0) return false;
    data += done;
    size -= static_cast<uint64_t>(done);
  }
  return true;
}

// 200 folders of 100 files in two levels; sizes vary from a tenth to twice the mean, with
// incompressible content, so the copy does real work for every byte.
void GenerateTree(const std::string& source, uint64_t files, uint64_t bytes) {
  const uint64_t perFolder = 100;
  const uint64_t mean = bytes / files;
  std::vector<char> buffer(mean * 2 + 4096);
  uint64_t state = 88172645463325252ull;
  for (char& c : buffer) {
    state ^= state << 13;
    state ^= state >> 7;
    state ^= state << 17;
    c = static_cast<char>(state);
  }
  uint64_t written = 0;
  for (uint64_t i = 0; i < files; ++i) {
    const uint64_t folder = i / perFolder;
    const std::string dir = source + "/group" + std::to_string(folder / 20) + "/set" +
                            std::to_string(folder % 20);
    if (i % perFolder == 0) Run("mkdir -p '" + dir + "'");
    // Sizes cycle through 0.1x .. 1.9x of the mean, so the total comes to files * mean.
    uint64_t size = mean / 10 + (mean * 18 / 10) * (i % 19) / 18;
    if (i + 1 == files) size = bytes > written ? bytes - written : 0;  // the exact total
    const size_t offset = i % 4096;  // different bytes in every file
    if (size + offset > buffer.size()) buffer.resize(size + offset, 'x');
    const std::string path = dir + "/file" + std::to_string(i) + ".dat";
    const int fd = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    if (fd < 0 || !WriteAll(fd, buffer.data() + offset, size)) {
      perror(path.c_str());
      std::exit(1);
    }
    close(fd);
    written += size;
  }
}

// A new, empty destination for one run, with everything written so far on disk.
std::string FreshDestination(const char* name, int64_t round) {
  const std::string destination = g_root + "/" + name + std::to_string(round);
  Run("mkdir -p '" + destination + "' && sync");
  return destination;
}

template <typename Copy>
void TimeCopy(benchmark::State& state, const char* name, Copy copy) {
  for (auto _ : state) {
    state.PauseTiming();
    const std::string destination = FreshDestination(name, state.range(0));
    state.ResumeTiming();
    const auto start = std::chrono::steady_clock::now();
    copy(destination);
    const std::chrono::duration<double> elapsed = std::chrono::steady_clock::now() - start;
    state.SetIterationTime(elapsed.count());
  }
}

void BM_CpA(benchmark::State& state) {
  TimeCopy(state, "dst_cp", [](const std::string& destination) {
    Run("cp -a '" + g_root + "/src/.' '" + destination + "/'");
  });
}

void BM_CopyAllFilesOfType(benchmark::State& state) {
  TimeCopy(state, "dst_manager", [](const std::string& destination) {
    std::vector<std::string> args = {"vxmigrate",    "-D1:" + g_root + "/src", "-D2:" + destination,
                                     "-P1:pavsuite", "-P2:pavsuite",           "-V1:5.0",
                                     "-V2:5.5"};
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(&arg[0]);
    argv.push_back(nullptr);
    // Construction and the log header belong to the run, so they are timed too.
    vxMigrationManager manager(static_cast<int>(args.size()), argv.data());
    manager.CopyAllFilesOfType("dat", vxStringBase::NullStr);
  });
}

void BM_FileManagerTreeCopy(benchmark::State& state) {
  TimeCopy(state, "dst_tree", [](const std::string& destination) {
    if (vxFileManager::CopyFile(vxStringBase((g_root + "/src").c_str()),
                                vxStringBase(destination.c_str()), 1, 0, 0, 0, 0, nullptr,
                                nullptr) != 0) {
      fprintf(stderr, "failed: the tree copy into %s\n", destination.c_str());
      std::exit(1);
    }
  });
}

}  // namespace

int main(int argc, char** argv) {
  const char* base = getenv("VXM_BENCH_DIR");
  if (base == nullptr || *base == '\0') base = getenv("TMPDIR");
  std::string pattern = std::string(base != nullptr && *base != '\0' ? base : "/tmp") +
                        "/vxm_copy_bench.XXXXXX";
  if (mkdtemp(&pattern[0]) == nullptr) {
    perror("mkdtemp");
    return 1;
  }
  g_root = pattern;
  const uint64_t files = EnvNumber("VXM_BENCH_FILES", 20000);
  const uint64_t bytes = EnvNumber("VXM_BENCH_BYTES", uint64_t(1) << 30);
  GenerateTree(g_root + "/src", files, bytes);
  Run("sync");

  // Each round runs the three copies in turn; registration order is run order.
  const int64_t rounds = static_cast<int64_t>(EnvNumber("VXM_BENCH_ROUNDS", 2));
  for (int64_t round = 1; round <= rounds; ++round) {
    for (auto* b : {benchmark::RegisterBenchmark("BM_CpA", BM_CpA),
                    benchmark::RegisterBenchmark("BM_CopyAllFilesOfType", BM_CopyAllFilesOfType),
                    benchmark::RegisterBenchmark("BM_FileManagerTreeCopy", BM_FileManagerTreeCopy)}) {
      b->Arg(round)->Iterations(1)->UseManualTime()->Unit(benchmark::kMillisecond);
    }
  }
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  Run("rm -rf '" + g_root + "'");
  return 0;
}
