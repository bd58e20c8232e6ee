// Small file helpers shared by the benchmark programs: a fresh folder for a generated
// installation and whole-file writes.

#ifndef VXMIGRATE_BENCH_BENCH_FILES_H_
#define VXMIGRATE_BENCH_BENCH_FILES_H_

#include <cstdlib>
#include <fstream>
#include <string>

// A new empty folder under /tmp; aborts the benchmark when none can be made.
inline std::string MakeTempFolder() {
  char pattern[] = "/tmp/vxmbench.XXXXXX";
  if (mkdtemp(pattern) == nullptr) abort();
  return pattern;
}

inline void Write(const std::string& path, const std::string& text) {
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out << text;
}

#endif  // VXMIGRATE_BENCH_BENCH_FILES_H_
