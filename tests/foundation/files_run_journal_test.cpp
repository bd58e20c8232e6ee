// The undo journal and undo on a hand-made destination, for what whole runs seldom reach: a file
// written in place after a link was kept, names that need escaping, files changed after the run
// (named, refused unless forced), folders the run made that now hold a user's file, and a run
// killed before its journal was closed.

#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <unistd.h>

#include <functional>
#include <string>
#include <vector>

#include "foundation/files/run_journal.h"
#include "foundation/files/run_undo.h"
#include "support/test_files.h"

namespace vxtest {
namespace {

// The destination as a user sees it: without the runs' history.
std::map<std::string, std::string> UserTree(const std::string& folder) {
  std::map<std::string, std::string> tree = TreeState(folder);
  for (auto it = tree.begin(); it != tree.end();) {
    it = it->first.rfind(".vxmigrate", 0) == 0 ? tree.erase(it) : std::next(it);
  }
  return tree;
}

// Replaces the file at path by a rename, as the settings writer does.
void ReplaceByRename(const std::string& path, const std::string& text) {
  WriteFile(path + ".tmp", text);
  ASSERT_EQ(0, rename((path + ".tmp").c_str(), path.c_str()));
}

struct Case {
  const char* what;
  // The run's changes, each told to the journal first.
  std::function<void(vxRunJournal&, const std::string& dst)> run;
  // What the user does after the run.
  std::function<void(const std::string& dst)> after;
  bool finished;                      // false: killed before Finish
  std::vector<std::string> changed;   // what undo names as changed since the run
  std::vector<std::string> kept;      // files that must survive undo (the user's own)
};

TEST(RunJournal, UndoGivesBackTheTreeOrNamesWhatChangedSince) {
  const Case cases[] = {
      {"replaced, created and made in a new folder",
       [](vxRunJournal& j, const std::string& dst) {
         ASSERT_TRUE(j.BeforeEntry(dst + "/a.ini", false));
         ReplaceByRename(dst + "/a.ini", "new a\n");
         ASSERT_TRUE(j.BeforeFolder(dst + "/new/deeper"));
         MakeDirs(dst + "/new/deeper");
         ASSERT_TRUE(j.BeforeEntry(dst + "/new/deeper/b.ini", false));
         WriteFile(dst + "/new/deeper/b.ini", "b\n");
       },
       nullptr, true, {}, {}},
      {"written in place after its link was kept",
       [](vxRunJournal& j, const std::string& dst) {
         ASSERT_TRUE(j.BeforeEntry(dst + "/a.ini", false));  // kept as a link
         ASSERT_TRUE(j.BeforeEntry(dst + "/a.ini", true));   // the link must become a copy
         WriteFile(dst + "/a.ini", "overwritten where it stands\n");
       },
       nullptr, true, {}, {}},
      {"names that need escaping",
       [](vxRunJournal& j, const std::string& dst) {
         for (const char* name : {"/with blank%25.ini", "/line\nfeed", "/tab\tand\x7f"}) {
           ASSERT_TRUE(j.BeforeEntry(dst + name, false));
           WriteFile(dst + name, "x");
         }
         ASSERT_TRUE(j.BeforeEntry(dst + "/old name.ini", false));
         ReplaceByRename(dst + "/old name.ini", "changed\n");
       },
       nullptr, true, {}, {}},
      {"a file the run wrote, edited afterwards",
       [](vxRunJournal& j, const std::string& dst) {
         ASSERT_TRUE(j.BeforeEntry(dst + "/a.ini", false));
         ReplaceByRename(dst + "/a.ini", "run's a\n");
       },
       [](const std::string& dst) { WriteFile(dst + "/a.ini", "the user's a\n"); }, true, {"a.ini"},
       {}},
      {"a folder the run made now holds a user's file",
       [](vxRunJournal& j, const std::string& dst) {
         ASSERT_TRUE(j.BeforeFolder(dst + "/made"));
         MakeDirs(dst + "/made");
         ASSERT_TRUE(j.BeforeEntry(dst + "/made/run.ini", false));
         WriteFile(dst + "/made/run.ini", "run\n");
       },
       [](const std::string& dst) { WriteFile(dst + "/made/user.txt", "mine\n"); }, true, {},
       {"made/user.txt"}},
      {"killed before its journal was closed",
       [](vxRunJournal& j, const std::string& dst) {
         ASSERT_TRUE(j.BeforeEntry(dst + "/a.ini", true));
         WriteFile(dst + "/a.ini", "half");
         ASSERT_TRUE(j.BeforeEntry(dst + "/c.ini", false));
         WriteFile(dst + "/c.ini", "c");
       },
       nullptr, false, {}, {}},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    TempDir root;
    char* real = realpath(root.path().c_str(), nullptr);
    const std::string dst = std::string(real) + "/dst";
    free(real);
    WriteFile(dst + "/a.ini", "old a\n");
    WriteFile(dst + "/old name.ini", "old\n");
    chmod((dst + "/a.ini").c_str(), 0640);
    const auto before = UserTree(dst);
    {
      vxRunJournal journal(dst, "/the/source");
      ASSERT_TRUE(journal.IsOpen());
      c.run(journal, dst);
      if (c.finished) {
        ASSERT_TRUE(journal.Finish(0));
      }
    }
    ASSERT_NE(before, UserTree(dst));
    if (c.after) c.after(dst);
    const auto edited = UserTree(dst);

    vxUndoOutcome outcome = vxUndoLastRun(dst, false);
    EXPECT_EQ(c.changed, outcome.changed);
    if (!c.changed.empty()) {
      EXPECT_EQ(vxUndoOutcome::kChangedSince, outcome.status);
      EXPECT_EQ(edited, UserTree(dst));  // refused: nothing was touched
      outcome = vxUndoLastRun(dst, true);
    }
    auto expected = before;
    for (const std::string& file : c.kept) {
      expected[file] = edited.at(file);
      expected[file.substr(0, file.rfind('/'))] = edited.at(file.substr(0, file.rfind('/')));
    }
    EXPECT_EQ(c.kept.empty() ? vxUndoOutcome::kUndone : vxUndoOutcome::kFailed, outcome.status);
    EXPECT_EQ(expected, UserTree(dst));
    EXPECT_EQ(vxUndoOutcome::kNothingToUndo, vxUndoLastRun(dst, false).status);
    const std::vector<vxRunEntry> runs = vxListRuns(dst);
    ASSERT_EQ(1u, runs.size());
    EXPECT_EQ("/the/source", runs[0].source);
    EXPECT_EQ(c.finished, runs[0].finished);
    EXPECT_TRUE(runs[0].undone);
  }
}

TEST(RunJournal, EscapedTextsComeBackWhole) {
  for (const std::string& text : {std::string("plain"), std::string("a b%c"),
                                 std::string("\x01\n\r\t \x7f%%", 7), std::string("%2")}) {
    const std::string escaped = vxJournalEscape(text);
    EXPECT_EQ(std::string::npos, escaped.find_first_of(" \n\r\t")) << escaped;
    EXPECT_EQ(text, vxJournalUnescape(escaped));
  }
}

}  // namespace
}  // namespace vxtest
