// Data-file merges: records the new installation lacks are appended, records a new line begins with
// are not, the first empty old line ends the merge, and the text keeps its own line ends.

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

// The literal reading of the merge: every record compared with every line of the text as it
// stands, the whole text stripped before each append (so one line feed goes before the first added
// record, and an empty text gains one), the first empty record ending the merge. The indexed merge
// must agree with it.
std::vector<std::string> Split(const std::string& text, char separator) {
  std::vector<std::string> parts;
  size_t start = 0;
  for (size_t end; (end = text.find(separator, start)) != std::string::npos; start = end + 1) {
    parts.push_back(text.substr(start, end - start));
  }
  parts.push_back(text.substr(start));
  for (std::string& part : parts) {  // a line of a CRLF text ends without its carriage return
    if (separator == '\n' && !part.empty() && part.back() == '\r') part.pop_back();
  }
  return parts;
}

std::string ScanningMerge(std::string destination, const std::string& source) {
  for (const std::string& record : Split(source, '\n')) {
    if (record.empty()) break;
    const std::vector<std::string> wanted = Split(record, ',');
    bool found = false;
    for (const std::string& line : Split(destination, '\n')) {
      const std::vector<std::string> have = Split(line, ',');
      found = found || (!line.empty() && wanted.size() <= have.size() &&
                        std::equal(wanted.begin(), wanted.end(), have.begin()));
    }
    if (found) continue;
    // Stripped, the text no longer ends with a line feed: one goes before the record.
    vxStringBase text(destination);
    text.stripWhite(vxStringBase::kBoth);
    destination = text.str() + "\n" + record;
  }
  return destination;
}

TEST(DataFileMerge, AgreesWithComparingEveryLine) {
  Installations run;
  std::mt19937 random(20240611);
  const std::string alphabet("ab,,,\n\n\n \r\t\0", 12);  // CRLF lines and NUL bytes too
  for (int round = 0; round < 800; ++round) {
    std::string texts[2];  // destination, source: up to 24 characters each
    for (std::string& text : texts) {
      for (size_t n = random() % 25; n > 0; --n) text += alphabet[random() % alphabet.size()];
    }
    WriteFile(run.Dst("list.txt"), texts[0]);
    WriteFile(run.Src("list.txt"), texts[1]);
    ASSERT_EQ(texts[1].empty() ? 1 : 0, run.manager().DoMergeCSVFile("list.txt", "list.txt"));
    ASSERT_EQ(ScanningMerge(texts[0], texts[1]), ReadFile(run.Dst("list.txt")))
        << "destination [" << texts[0] << "] source [" << texts[1] << "]";
  }
}

TEST(DataFileMerge, MissingOrUnwritableFiles) {
  Installations run;
  // Neither file: the copy fails.
  EXPECT_EQ(1, run.manager().DoMergeCSVFile("a.txt", "a.txt"));
  // No destination: the source is copied byte for byte.
  WriteFile(run.Src("dat/b.txt"), "a,b\r\n\r\nc\r\n");
  EXPECT_EQ(0, run.manager().DoMergeCSVFile("\\dat\\b.txt", "\\dat\\b.txt"));
  EXPECT_EQ("a,b\r\n\r\nc\r\n", ReadFile(run.Dst("dat/b.txt")));
  // No source: the destination stays.
  WriteFile(run.Dst("c.txt"), "a\n");
  EXPECT_EQ(1, run.manager().DoMergeCSVFile("c.txt", "c.txt"));
  EXPECT_EQ("a\n", ReadFile(run.Dst("c.txt")));
  // A folder where the destination should be is left alone.
  WriteFile(run.Src("d.txt"), "a\n");
  MakeDirs(run.Dst("d.txt"));
  EXPECT_EQ(1, run.manager().DoMergeCSVFile("d.txt", "d.txt"));
  EXPECT_EQ((Entries{"c.txt", "d.txt", "dat", "dat/b.txt", "vxmigrate.log"}), ListTree(run.Dst()));
  // A source that is not there is no failure; the folder in the way is, and the log says so.
  const std::string copying = "TXT file doesn't exist - file being copied: <src>/";
  EXPECT_EQ((Entries{copying + "a.txt", copying + "dat/b.txt",
                     "Error: Unable to write file:   <dst>/d.txt"}),
            run.RunLog());
}

}  // namespace
}  // namespace vxtest
