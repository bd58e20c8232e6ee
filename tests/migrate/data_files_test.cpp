// Data-file merges: records the new installation lacks are appended, records a new line begins with
// are not, the first empty old line ends the merge, and the text keeps its own line ends.

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

#include "foundation/string/string_base.h"
#include "foundation/string/tokenizer.h"
#include "migrate/settings_fixture.h"

namespace vxtest {
namespace {

struct MergeCase {
  const char* name;
  std::string destination;
  std::string source;
  std::string merged;
};

class DataFileMerge : public ::testing::TestWithParam<MergeCase> {};

TEST_P(DataFileMerge, GivesTheExpectedText) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Src("datfiles/spiders.txt"), GetParam().source);
  WriteFile(run.Dst("datfiles/spiders.txt"), GetParam().destination);
  EXPECT_EQ(0, run.manager().DoMergeCSVFile("\\datfiles\\spiders.txt", "\\datfiles\\spiders.txt"));
  EXPECT_EQ(GetParam().merged, ReadFile(run.Dst("datfiles/spiders.txt")));
  EXPECT_EQ(std::vector<std::string>{"Data File Merged: \\datfiles\\spiders.txt"}, run.Logged());
}

INSTANTIATE_TEST_SUITE_P(
    Cases, DataFileMerge,
    ::testing::Values(
        MergeCase{"FieldsAPrefixOfALine", "x\na,b,c\n", "a,b\n", "x\na,b,c\n"},
        MergeCase{"MoreFieldsThanTheLine", "a,b\n", "a,b,c\n", "a,b\na,b,c"},
        MergeCase{"EmptyFieldsKeepTheirPlace", "a\n", "a,\n", "a\na,"},
        MergeCase{"FirstEmptyLineEndsTheMerge", "a\n", "x\n\ny\n", "a\nx"},
        MergeCase{"RepeatedRecordAddedOnce", "a\n", "x\nx,1\nx\n", "a\nx\nx,1"},
        MergeCase{"LineFeedBeforeFirstAddedLine", "a", "b", "a\nb"},
        // The stripped line is what later records compare with.
        MergeCase{"StrippedLineMatchesLaterRecords", "a,b  \n", "c\na,b\n", "a,b\nc"},
        MergeCase{"EmptyDestinationGainsALineFeed", "", "a\n", "\na"},
        MergeCase{"CrlfLinesKept", "a,b\r\nc\r\n", "a,b\r\nd\r\n", "a,b\r\nc\nd"},
        MergeCase{"CrlfEmptyLineEndsTheMerge", "a\r\n", "x\r\n\r\ny\r\n", "a\nx"},
        MergeCase{"BinaryBytesCompared", std::string("a\0b\n", 4), "a\n",
                  std::string("a\0b\na", 5)}),
    [](const ::testing::TestParamInfo<MergeCase>& info) { return info.param.name; });

// The literal reading of the merge: every record compared with every line of the text as it
// stands, the whole text stripped before each append. The indexed merge must agree with it.
std::vector<std::string> Fields(const std::string& line) {
  std::vector<std::string> fields;
  vxBStringTokenizer tokens(vxStringBase(line), vxBStringTokenizer::m_csvToken, true);
  vxStringBase field;
  while (tokens.GetNext(field)) fields.push_back(field.str());
  return fields;
}

std::vector<std::string> Lines(const std::string& text) {
  std::vector<std::string> lines;
  size_t start = 0;
  while (start < text.size()) {
    size_t end = text.find('\n', start);
    if (end == std::string::npos) end = text.size();
    std::string line = text.substr(start, end - start);
    if (!line.empty() && line.back() == '\r') line.pop_back();
    lines.push_back(line);
    start = end + 1;
  }
  return lines;
}

std::string ScanningMerge(std::string destination, const std::string& source) {
  for (const std::string& record : Lines(source)) {
    if (record.empty()) break;
    std::vector<std::string> wanted = Fields(record);
    bool found = false;
    for (const std::string& line : Lines(destination)) {
      std::vector<std::string> have = Fields(line);
      if (!line.empty() && wanted.size() <= have.size() &&
          std::equal(wanted.begin(), wanted.end(), have.begin())) {
        found = true;
        break;
      }
    }
    if (found) continue;
    vxStringBase text(destination);
    text.stripWhite(vxStringBase::kBoth);
    destination = text.str();
    if (destination.empty() || destination.back() != '\n') destination += '\n';
    destination += record;
  }
  return destination;
}

std::string RandomText(std::mt19937& random) {
  static const char kAlphabet[] = "ab,,,\n\n\n \r\t";
  std::uniform_int_distribution<int> length(0, 24);
  std::uniform_int_distribution<int> pick(0, sizeof(kAlphabet) - 2);
  std::string text;
  for (int n = length(random); n > 0; --n) text.push_back(kAlphabet[pick(random)]);
  return text;
}

TEST(DataFileMerge, AgreesWithComparingEveryLine) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  std::mt19937 random(20240611);
  for (int round = 0; round < 800; ++round) {
    const std::string destination = RandomText(random);
    const std::string source = RandomText(random);
    WriteFile(run.Src("list.txt"), source);
    WriteFile(run.Dst("list.txt"), destination);
    const int result = run.manager().DoMergeCSVFile("list.txt", "list.txt");
    const std::string expected = source.empty() ? destination : ScanningMerge(destination, source);
    ASSERT_EQ(source.empty() ? 1 : 0, result);
    ASSERT_EQ(expected, ReadFile(run.Dst("list.txt")))
        << "destination [" << destination << "] source [" << source << "]";
  }
}

TEST(DataFileMerge, MissingDestinationIsACopyOfTheSource) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Src("dat/refs.txt"), "a,b\r\n\r\nc\r\n");
  EXPECT_EQ(0, run.manager().DoMergeCSVFile("\\dat\\refs.txt", "\\dat\\refs.txt"));
  EXPECT_EQ("a,b\r\n\r\nc\r\n", ReadFile(run.Dst("dat/refs.txt")));
  EXPECT_EQ(std::vector<std::string>{"TXT file doesn't exist - file being copied: " +
                                     run.Src("dat/refs.txt")},
            run.Logged());
}

TEST(DataFileMerge, BothFilesMissingIsAFailedCopy) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  EXPECT_EQ(1, run.manager().DoMergeCSVFile("refs.txt", "refs.txt"));
  EXPECT_FALSE(FileExists(run.Dst("refs.txt")));
  EXPECT_EQ(std::vector<std::string>{"TXT file doesn't exist - file being copied: " +
                                     run.Src("refs.txt")},
            run.Logged());
}

TEST(DataFileMerge, EmptyOrMissingSourceLeavesTheDestination) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Dst("refs.txt"), "a\n");
  EXPECT_EQ(1, run.manager().DoMergeCSVFile("refs.txt", "refs.txt"));
  WriteFile(run.Src("refs.txt"), "");
  EXPECT_EQ(1, run.manager().DoMergeCSVFile("refs.txt", "refs.txt"));
  EXPECT_EQ("a\n", ReadFile(run.Dst("refs.txt")));
  EXPECT_TRUE(run.Logged().empty());
}

TEST(DataFileMerge, DestinationThatIsAFolderIsNotTouched) {
  SettingsRun run("pavsuite", "pavsuite", "5.0", "5.5");
  WriteFile(run.Src("refs.txt"), "a\n");
  MakeDirs(run.Dst("refs.txt"));
  EXPECT_EQ(1, run.manager().DoMergeCSVFile("refs.txt", "refs.txt"));
  EXPECT_EQ(std::vector<std::string>{}, ListTree(run.Dst("refs.txt")));
}

TEST(DataFileMerge, InPlaceRunReadsAndWritesNothing) {
  auto run = SettingsRun::InPlace("pavsuite", "pavsuite", "5.5", "5.5");
  WriteFile(run->Dst("refs.txt"), "a");
  EXPECT_EQ(0, run->manager().DoMergeCSVFile("refs.txt", "refs.txt"));
  EXPECT_EQ("a", ReadFile(run->Dst("refs.txt")));
  EXPECT_TRUE(run->Logged().empty());
}

}  // namespace
}  // namespace vxtest
