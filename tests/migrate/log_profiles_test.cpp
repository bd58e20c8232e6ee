// The user's profiles and files carried into the new installation as marked copies: log and link
// profiles with their selection, samples, data folders, home pages and credentials; the categories
// merge (numbers kept, old entries appended under the new names, duplicates caught, the source's
// "Expand" winning); user files and the scheduled events that follow them; alert profiles and
// their recipient lists; and the user's own report languages.

#include <string>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

// A log-profile folder with a sample profile, three user profiles and their data folders.
void LayOutLogProfiles(const Installations& run) {
  run.WriteSources({"p/sample.wlp", "p/sales.wlp", "p/support.wlp", "p/web.wlp", "p/sample.dat/h",
                    "p/sales.dat/h", "p/sales.dat/old/h", "p/support.dat/h", "p/web.dat/h"});
}

// The value of key in a profile with CRLF line ends.
std::string Value(const std::string& profile, const std::string& key) {
  const size_t at = profile.find("\n" + key + "=") + key.size() + 2;
  return profile.substr(at, profile.find('\r', at) - at);
}

// The old credentials arrive as protected values of the same clear texts, the rest of the profile
// as it was.
TEST(DoCopyLogProfiles, CopiesTheSelectionWithItsDataFoldersAndReportsUnknownNames) {
  Installations run({"-PFLog:sales.wlp, WEB.WLP, ghost.wlp,ghost.wlp"});
  LayOutLogProfiles(run);
  const std::string head = "[Profile]\r\nName=Sales\r\n", tail = "\r\n[Logs]\r\nLog1=ftp://h/a\r\n";
  WriteFile(run.Src("p/sales.wlp"), head + "LogFileUsername=" + LegacyEncoded("logreader") +
                                        "\r\nLogFilePassword=" + LegacyEncoded("s3cr3t&pw") + tail);
  WriteFile(run.Dst("p/web_vxmigrate.dat/h"), "from an earlier run");
  EXPECT_EQ(0, run.manager().DoCopyLogProfiles("p", "*.wlp", "wlp", "sample.wlp"));

  EXPECT_EQ((Entries{"p", "p/sales_vxmigrate.dat", "p/sales_vxmigrate.dat/h",
                     "p/sales_vxmigrate.dat/old", "p/sales_vxmigrate.dat/old/h",
                     "p/sales_vxmigrate.wlp", "p/web_vxmigrate.dat", "p/web_vxmigrate.dat/h",
                     "p/web_vxmigrate.wlp"}),
            run.DestinationTree());
  EXPECT_EQ("from an earlier run", ReadFile(run.Dst("p/web_vxmigrate.dat/h")));
  const std::string copy = ReadFile(run.Dst("p/sales_vxmigrate.wlp"));
  const std::string user = Value(copy, "LogFileUsername");
  const std::string password = Value(copy, "LogFilePassword");
  EXPECT_EQ((Entries{"logreader", "s3cr3t&pw"}), (Entries{Decrypted(user), Decrypted(password)}));
  EXPECT_EQ(head + "LogFileUsername=" + user + "\r\nLogFilePassword=" + password + tail, copy);
  EXPECT_EQ((Entries{"Error: Selected profile not found: ghost.wlp",
                     "File copied:  <dst>/p/sales_vxmigrate.wlp",
                     "File copied:  <dst>/p/web_vxmigrate.wlp",
                     "Folder copied:  <dst>/p/sales_vxmigrate.dat/",
                     "Folder exists - no copy made: <dst>/p/web_vxmigrate.dat/"}),
            run.RunLog());
}

TEST(DoCopyLogProfiles, TakesSelectionAndDataFolderSwitchFromTheCommandFile) {
  Installations run;
  LayOutLogProfiles(run);
  WriteFile(run.Src("migcmd.ini"), "[main]\nD1=" + run.Src() + "\nD2=" + run.Dst() +
                                       "\nP1=pavsuite\nP2=pavsuite\nV1=5.0\nV2=5.5\nFT=No\n"
                                       "[profiles]\nLog=support.wlp\n");
  run.ManagerFromCommandFile(run.Src()).DoCopyLogProfiles("p", "*.wlp", "wlp", "");
  EXPECT_EQ((Entries{"p", "p/support_vxmigrate.wlp"}), run.DestinationTree());
}

TEST(DoCopyLogProfiles, SplitsTheHomePageIntoFolderAndPage) {
  struct Case { std::string homePage, baseDir, defaults; };
  const Case cases[] = {{"a/b/index.htm", "a/b", "index.htm"}, {"index.htm", "index.htm", ""},
                        {"/index.htm", "", "index.htm"}, {"http://h/site/", "http://h/site", ""},
                        {"C:\\www\\index.htm", "C:\\www\\index.htm", ""}};  // no folders
  Installations run;
  for (const Case& c : cases) {
    WriteFile(run.Src("p/" + std::to_string(&c - cases) + ".wlp"),
              "[Profile]\r\nHomePageName=" + c.homePage + "\r\n[Other]\r\nX=1\r\n");
  }
  run.manager().DoCopyLogProfiles("p", "*.wlp", "wlp", "");
  for (const Case& c : cases) {
    EXPECT_EQ("[Profile]\r\nHomePageName=" + c.homePage + "\r\nHomePageDefaults=" + c.defaults +
                  "\r\nHomePageBaseDir=" + c.baseDir + "\r\n[Other]\r\nX=1\r\n",
              ReadFile(run.Dst("p/" + std::to_string(&c - cases) + "_vxmigrate.wlp")));
  }
}

// Protected and empty credentials are written back unchanged. A binary profile, or one whose
// credential is too long to protect, is logged and left exactly as copied.
TEST(DoCopyLogProfiles, LeavesProtectedCredentialsAndProfilesItCannotRewriteAsTheyAre) {
  Installations run;
  const std::string binary("[Profile]\nLogFilePassword=x\n\0\x01\x02", 31);
  const std::string longPassword = LegacyEncoded(std::string(600, 'x'));
  ASSERT_EQ(600u, longPassword.size());  // no pad byte ends the encoded text early
  const std::string tooLong = "[Profile]\nHomePageName=a/b.htm\nLogFilePassword=" + longPassword;
  WriteFile(run.Src("p/a.wlp"), binary);
  WriteFile(run.Src("p/b.wlp"), tooLong);
  WriteFile(run.Src("p/sample.wlp"), "[Profile]\n");
  const std::string own = "[Profile]\nLogFilePassword=" + Protected("pw") + "\nHomePagePassword=\n";
  WriteFile(run.Dst("p/own.wlp"), own);
  run.manager().DoCopyLogProfiles("p", "*.wlp", "wlp", "sample.wlp");

  EXPECT_EQ((Entries{"p", "p/a_vxmigrate.wlp", "p/b_vxmigrate.wlp", "p/own.wlp"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{own, binary, tooLong}),
            run.ReadDst({"p/own.wlp", "p/a_vxmigrate.wlp", "p/b_vxmigrate.wlp"}));
  // Each copy is converted on its way, so its trouble follows its own line.
  EXPECT_EQ((Entries{"File copied:  <dst>/p/a_vxmigrate.wlp",
                     "Error: Profile is not a valid settings file - left as copied: "
                     "<dst>/p/a_vxmigrate.wlp",
                     "Error: Value too long to protect - left unchanged, characters: 600",
                     "File copied:  <dst>/p/b_vxmigrate.wlp",
                     "Error: Value of LogFilePassword cannot be protected - profile left as "
                     "copied: <dst>/p/b_vxmigrate.wlp"}),
            run.RunLog());
}

// Each installation keeps a categories file from 5.5, the log product from 6.5 and the firewall
// from 3.1, each number of the version compared on its own.
TEST(DoCopyLogProfiles, MergesTheCategoriesOnlyWhenBothVersionsKeepThem) {
  for (const auto& [options, merges] :
       {std::make_pair(Entries{"-V1:5.7", "-P2:halsuite", "-V2:7.9"}, true), {{"-V1:5.4"}, false},
        {{"-V1:6.0", "-V2:6.5"}, false}, {{"-P1:log", "-P2:log", "-V2:6.5"}, false},
        {{"-P1:log", "-P2:log", "-V1:6.5", "-V2:6.5"}, true},
        {{"-P1:bastion", "-P2:bastion", "-V1:3.1", "-V2:3.2"}, true}}) {
    SCOPED_TRACE(::testing::PrintToString(options));
    Installations run(options);
    run.WriteSources({"p/a.wlp"});
    WriteFile(run.Src("p/categories.ini"), "[main]\nNumberOfCategories=0\n");
    run.manager().DoCopyLogProfiles("p", "*.wlp", "wlp", "");
    EXPECT_EQ(merges, FileExists(run.Dst("p/categories.ini")));
    EXPECT_EQ(merges, run.RunLog().back() == "categories.ini merged: <dst>/p/");
  }
}

TEST(DoCopyLinkProfiles, CopiesTheSelectionWithoutDataFoldersOrCredentials) {
  Installations run({"-PFLink:b.llp"});
  const std::string linkProfile = "[Profile]\nLogFilePassword=" + LegacyEncoded("pw") + "\n";
  WriteFile(run.Src("l/b.llp"), linkProfile);
  run.WriteSources({"l/a.llp", "l/b.dat/h"});
  WriteFile(run.Src("l/categories.ini"), "[main]\nNumberOfCategories=1\nCategory1=L\n[L]\n"
                                         "NumberOfProfiles=2\nProfile1=/a.llp\nProfile2=/b.llp\n");
  EXPECT_EQ(0, run.manager().DoCopyLinkProfiles("l", "*.llp", "llp", ""));

  EXPECT_EQ((Entries{"l", "l/b_vxmigrate.llp", "l/categories.ini"}), run.DestinationTree());
  EXPECT_EQ((Entries{linkProfile, "[main]\nNumberOfCategories=1\nCategory1=L\n[L]\nProfile1="
                                  "<dst>/l/b_vxmigrate.llp\nNumberOfProfiles=1\nExpand=\n"}),
            run.ReadDst({"l/b_vxmigrate.llp", "l/categories.ini"}));
}

TEST(MergeCategoriesINIFile, AppendsOldCategoriesAndEntriesAfterTheDestinationsOwn) {
  Installations run;
  WriteFile(run.Dst("p/categories.ini"),
            "[main]\nNumberOfCategories=2\nCategory1=Sales\nCategory2=Web\n[Sales]\n"
            "NumberOfProfiles=1\nProfile1=" + run.Dst("p/A_VXMIGRATE.WLP") + "\nExpand=0\n"
            "[Web]\nNumberOfProfiles=0\n");
  WriteFile(run.Src("p/categories.ini"),
            "[main]\nNumberOfCategories=4\nCategory1=Sales\nCategory2=Support\nCategory3=sales\n"
            "Category4=Samples\n[Sales]\nNumberOfProfiles=5\nProfile1=C:\\V\\p\\a.wlp\n"
            "Profile2=C:\\V\\p\\b.wlp\nProfile3=/opt/v/p/B.wlp\nProfile4=C:\\V\\p\\sample.wlp\n"
            "Profile5=c.wlp\nExpand=1\n[Support]\nNumberOfProfiles=2\nProfile1=C:\\V\\p\\d.wlp\n"
            "Profile2=/opt/v/p/e_vxmigrate.wlp\n"
            "[Samples]\nNumberOfProfiles=1\nProfile1=C:\\V\\p\\Sample.wlp\nExpand=1\n");
  run.manager().MergeCategoriesINIFile("p", "*.wlp", "wlp", "x.wlp, sample.wlp", false);

  EXPECT_EQ((Entries{"[main]\nNumberOfCategories=5\nCategory1=Sales\nCategory2=Web\n"
                     "Category3=Support\nCategory4=sales\nCategory5=Samples\n"
                     "[Sales]\nNumberOfProfiles=3\nProfile1=<dst>/p/A_VXMIGRATE.WLP\nExpand=1\n"
                     "Profile2=<dst>/p/b_vxmigrate.wlp\nProfile3=<dst>/p/c_vxmigrate.wlp\n"
                     "[Web]\nNumberOfProfiles=0\n[Support]\nProfile1=<dst>/p/d_vxmigrate.wlp\n"
                     "Profile2=<dst>/p/e_vxmigrate.wlp\nNumberOfProfiles=2\nExpand=\n"
                     "[Samples]\nNumberOfProfiles=0\nExpand=1\n"}),
            run.ReadDst({"p/categories.ini"}));
  EXPECT_EQ((Entries{"categories.ini merged: <dst>/p/"}), run.RunLog());
}

// Without a source file nothing happens; an unreadable file on either side is reported and
// nothing is written.
TEST(MergeCategoriesINIFile, NeverReplacesAnUnreadableCategoriesFileNorWorksWithoutASource) {
  Installations run;
  const std::string good = "[main]\nNumberOfCategories=1\nCategory1=A\n[A]\nProfile1=a.wlp\n";
  const std::string binary("[main]\nNumberOfCategories=1\0\xff", 30);
  for (const char* name : {"p1/categories.ini", "p2/categories.ini"}) {
    WriteFile(run.Src(name), name[1] == '1' ? good : binary);
    WriteFile(run.Dst(name), name[1] == '1' ? binary : good);
  }
  WriteFile(run.Dst("p3/categories.ini"), good);
  for (const char* folder : {"p1", "p2", "p3", "p4"}) {
    run.manager().MergeCategoriesINIFile(folder, "*.wlp", "wlp", "", false);
  }
  EXPECT_EQ((Entries{"p1", "p1/categories.ini", "p2", "p2/categories.ini", "p3",
                     "p3/categories.ini"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{binary, good, good}),
            run.ReadDst({"p1/categories.ini", "p2/categories.ini", "p3/categories.ini"}));
  EXPECT_EQ((Entries{"Error: categories.ini cannot be read - not merged: <dst>/p1/categories.ini",
                     "Error: categories.ini cannot be read - not merged: <src>/p2/categories.ini"}),
            run.RunLog());
}

// Counts far beyond the entries present, gaps, entries beyond the count and a key written twice:
// the counts on disk decide, and the destination's stale entry beyond its count is taken over.
TEST(MergeCategoriesINIFile, TakesTheCountsOnDiskAsTheListsLengthAndKeepsNamesWhenAsked) {
  Installations run;
  WriteFile(run.Dst("p/categories.ini"),
            "[main]\nNumberOfCategories=1\nCategory1=A\nCategory2=B\n"
            "[A]\nNumberOfProfiles=1\nProfile1=/x/a.wlp\nProfile2=/x/stale.wlp\n");
  WriteFile(run.Src("p/categories.ini"),
            "[main]\nNumberOfCategories=2000000000\nCategory1=A\nCategory3=B\n"
            "[A]\nNumberOfProfiles=3\nProfile3=n.wlp\nProfile1=m.wlp\nProfile4=beyond.wlp\n"
            "profile1=second spelling.wlp\nExpand=1\n");
  run.manager().MergeCategoriesINIFile("p", "*.wlp", "wlp", "", true);
  EXPECT_EQ((Entries{"[main]\nNumberOfCategories=2\nCategory1=A\nCategory2=B\n[A]\n"
                     "NumberOfProfiles=3\nProfile1=/x/a.wlp\nProfile2=<dst>/p/m.wlp\n"
                     "Profile3=<dst>/p/n.wlp\nExpand=1\n[B]\nNumberOfProfiles=0\nExpand=\n"}),
            run.ReadDst({"p/categories.ini"}));
}

// "r_vxmigrate.wlp" was left by an earlier migration into this installation: "r.wlp" wins. An
// event is kept only when the marked copy of its set is there. The destination path is logged,
// and the user files' "exists" text has a single blank.
TEST(CopyRenamedUserFiles, CopiesUnderMarkedNamesNeverMarkingTwiceNorReplacingAndEventsFollow) {
  Installations run;
  run.WriteSources({"s/r.wlp", "s/r_vxmigrate.wlp", "s/orphan_vxmigrate.wlp", "s/other.wlp",
                    "s/sample.wlp", "s/usr_x.wlp", "s/usr_gone.wlp", "s/readme.txt",
                    "s/deeper/inner.wlp"});
  WriteFile(run.Dst("s/other_vxmigrate.rpt"), "migrated before");
  WriteFile(run.Src("s/a.evt"), "; nightly\r\n[Main]\r\nSetName = usr_x\r\nSetExtension = rpt\r\n");
  WriteFile(run.Src("s/b.evt"), "[Main]\nSetName=usr_gone\nSetExtension=rpt\n");
  WriteFile(run.Src("s/c.evt"), "[Main]\nSetName=other\nSetExtension=rpt\n");
  WriteFile(run.Src("s/d.evt"), "[Main]\nSetName=usr_x\n");
  WriteFile(run.Dst("s/d_vxmigrate.evt"), "edited since");
  EXPECT_EQ(0, run.manager().CopyRenamedUserFiles("s", "*.wlp", "rpt", "Sample.wlp, usr_gone.wlp"));
  EXPECT_EQ(0, run.manager().CopyScheduledEventFiles("s", "*.evt", "evt", "usr_*"));

  EXPECT_EQ((Entries{"s", "s/a_vxmigrate.evt", "s/c_vxmigrate.evt", "s/d_vxmigrate.evt",
                     "s/orphan_vxmigrate.rpt", "s/other_vxmigrate.rpt", "s/r_vxmigrate.rpt",
                     "s/usr_x_vxmigrate.rpt"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"s/r.wlp", "migrated before",
                     "; nightly\r\n[Main]\r\nSetName = usr_x_vxmigrate\r\nSetExtension = rpt\r\n",
                     "[Main]\nSetName=other\nSetExtension=rpt\n", "edited since"}),
            run.ReadDst({"s/r_vxmigrate.rpt", "s/other_vxmigrate.rpt", "s/a_vxmigrate.evt",
                         "s/c_vxmigrate.evt", "s/d_vxmigrate.evt"}));
  EXPECT_EQ((Entries{"File copied:  <dst>/s/orphan_vxmigrate.rpt",
                     "File exists - no copy made: <dst>/s/other_vxmigrate.rpt",
                     "File copied:  <dst>/s/r_vxmigrate.rpt",
                     "File exists - no copy made: <dst>/s/r_vxmigrate.rpt",
                     "File copied:  <dst>/s/usr_x_vxmigrate.rpt",
                     "Schedule Event copied:  <dst>/s/a_vxmigrate.evt",
                     "Schedule Event copied:  <dst>/s/c_vxmigrate.evt",
                     "File exists - no copy made:  <dst>/s/d_vxmigrate.evt"}),
            run.RunLog());
}

// Every profile but the samples is copied, selected or not; the selection decides the entries in
// the console folder's categories, under the profiles' own names. Recipient list keys are read
// from "l0" up to the first one missing, so an e-mail list without "l0" has none.
TEST(DoCopyAlertProfiles, CopiesAllButSamplesRedirectsListFilesAndMergesTheConsoleCategories) {
  Installations run({"-PFAlert:night.alp"});
  run.WriteSources({"datfiles/day.alp", "datfiles/demo.alp"});
  const std::string head = "[Alert]\r\nName=night\r\n[Alert_Pager_List]\r\n";
  const std::string kept = "l1=C:\\V\\pager.lst\r\nl2=\r\nl4=LERT03.lst\r\nl5=/u/lert04.lst\r\n"
                           "l8=C:\\lert09.lst\r\n[Alert_Email_List]\r\nl1=C:\\lert05.lst\r\n";
  WriteFile(run.Src("datfiles/night.alp"), head + "l0=C:\\V\\d\\lert01.lst\r\nl3=lert02.txt\r\n"
                                               "l6=D:\\lert07_vxmigrate.lst\r\n" + kept);
  WriteFile(run.Dst("datfiles/day_vxmigrate.alp"), "migrated before");
  WriteFile(run.Src("console_datfiles/categories.ini"),
            "[main]\nNumberOfCategories=1\nCategory1=Alerts\n[Alerts]\nNumberOfProfiles=2\n"
            "Profile1=C:\\old\\day.alp\nProfile2=C:\\old\\night.alp\n");
  EXPECT_EQ(0, run.manager().DoCopyAlertProfiles("datfiles", "*.alp", "alp", "demo.alp"));

  EXPECT_EQ((Entries{"console_datfiles", "console_datfiles/categories.ini", "datfiles",
                     "datfiles/day_vxmigrate.alp", "datfiles/night_vxmigrate.alp"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{head + "l0=lert01_vxmigrate.lst\r\nl3=lert02_vxmigrate.txt\r\n"
                                "l6=lert07_vxmigrate.lst\r\n" + kept,
                     "migrated before",
                     "[main]\nNumberOfCategories=1\nCategory1=Alerts\n[Alerts]\n"
                     "Profile1=<dst>/console_datfiles/night.alp\nNumberOfProfiles=1\nExpand=\n"}),
            run.ReadDst({"datfiles/night_vxmigrate.alp", "datfiles/day_vxmigrate.alp",
                         "console_datfiles/categories.ini"}));
  EXPECT_EQ((Entries{"File exists - no copy made:  <dst>/datfiles/day_vxmigrate.alp",
                     "File copied:  <dst>/datfiles/night_vxmigrate.alp",
                     "categories.ini merged: <dst>/console_datfiles/"}),
            run.RunLog());
}

// The four languages the new installation ships are never copied; a user's own language replaces
// a file of the same name.
TEST(DoCopyLanguageFiles, CopiesOnlyTheUsersOwnLanguagesIntoTheNewFolder) {
  Installations run;
  run.WriteSources({"lang/english.rpl", "lang/Spanish.rpl", "lang/GERMAN.rpl", "lang/french.rpl",
                    "lang/italian.rpl", "lang/klingon.rpl", "lang/english_uk.rpl",
                    "lang/notes.txt", "lang/old/dutch.rpl"});
  for (const char* name : {"to/english.rpl", "to/klingon.rpl"}) WriteFile(run.Dst(name), "n");
  EXPECT_EQ(0, run.manager().DoCopyLanguageFiles("lang", "to"));

  EXPECT_EQ((Entries{"to", "to/english.rpl", "to/english_uk.rpl", "to/italian.rpl",
                     "to/klingon.rpl"}),
            run.DestinationTree());
  EXPECT_EQ((Entries{"n", "lang/klingon.rpl"}), run.ReadDst({"to/english.rpl", "to/klingon.rpl"}));
  EXPECT_EQ((Entries{"Language file copied: <src>/lang/english_uk.rpl",
                     "Language file copied: <src>/lang/italian.rpl",
                     "Language file copied: <src>/lang/klingon.rpl"}),
            run.RunLog());
}

}  // namespace
}  // namespace vxtest
