// One selected log-analysis profile on its whole way from the old installation into the new one:
// listed, tested against the samples and the selection, copied under its marked name, its
// credentials protected, written back, logged, and entered in the new categories file; and a
// second run that leaves everything as the first made it.

#include <string>

#include "migrate/installations_fixture.h"

namespace vxtest {
namespace {

// The value of key in a profile with CRLF line ends.
std::string Value(const std::string& profile, const std::string& key) {
  const size_t at = profile.find("\n" + key + "=") + key.size() + 2;
  return profile.substr(at, profile.find('\r', at) - at);
}

TEST(RoadOfOneFile, ASelectedLogProfileArrivesProtectedAndCategorisedOnceAndForAll) {
  Installations run({"-PFLog:Sales.wlp", "-P2:halsuite", "-V2:6.5"});
  const std::string head = "[Profile]\r\nName=Sales\r\nHomePageName=reports/sales/index.htm\r\n";
  const std::string logs = "\r\n\r\n[Logs]\r\nLog1=ftp://logs.example.com/access.log\r\n";
  WriteFile(run.Src("p/sales.wlp"), head + "LogFileUsername=" + LegacyEncoded("logreader") +
                                        "\r\nLogFilePassword=" + LegacyEncoded("s3cr3t&pw") + logs);
  run.WriteSources({"p/sales.dat/hits", "p/support.wlp", "p/demo.wlp"});
  WriteFile(run.Src("p/categories.ini"),
            "[main]\r\nNumberOfCategories=1\r\nCategory1=Web sites\r\n[Web sites]\r\n"
            "NumberOfProfiles=3\r\nProfile1=C:\\V\\p\\demo.wlp\r\nProfile2=C:\\V\\p\\sales.wlp\r\n"
            "Profile3=C:\\V\\p\\support.wlp\r\nExpand=1\r\n");
  WriteFile(run.Dst("p/demo.wlp"), "[Profile]\r\nName=New demo\r\n");
  WriteFile(run.Dst("p/categories.ini"),
            "[main]\r\nNumberOfCategories=1\r\nCategory1=Samples\r\n[Samples]\r\n"
            "NumberOfProfiles=1\r\nProfile1=" + run.Dst("p/demo.wlp") + "\r\nExpand=0\r\n");
  EXPECT_EQ(0, run.manager().DoCopyLogProfiles("p", "*.wlp", "wlp", "demo.wlp"));

  // Only the selected profile came, under its marked name, with its data folder.
  const Entries tree = {"p", "p/categories.ini", "p/demo.wlp", "p/sales_vxmigrate.dat",
                        "p/sales_vxmigrate.dat/hits", "p/sales_vxmigrate.wlp"};
  EXPECT_EQ(tree, run.DestinationTree());
  // Its credentials are protected values of the old clear texts; everything else is as it was,
  // with the home page split into folder and page.
  const std::string profile = ReadFile(run.Dst("p/sales_vxmigrate.wlp"));
  const std::string password = Value(profile, "LogFilePassword");
  const std::string user = Value(profile, "LogFileUsername");
  EXPECT_EQ((Entries{"s3cr3t&pw", "logreader"}), (Entries{Decrypted(password), Decrypted(user)}));
  EXPECT_EQ(head + "LogFileUsername=" + user + "\r\nLogFilePassword=" + password +
                "\r\nHomePageDefaults=index.htm\r\nHomePageBaseDir=reports/sales" + logs,
            profile);
  // The new categories file keeps its own category and gains the old one, listing the copy only.
  const Entries contents = {
      "[Profile]\r\nName=New demo\r\n",
      "[main]\r\nNumberOfCategories=2\r\nCategory1=Samples\r\nCategory2=Web sites\r\n"
      "[Samples]\r\nNumberOfProfiles=1\r\nProfile1=<dst>/p/demo.wlp\r\nExpand=0\r\n"
      "[Web sites]\r\nProfile1=<dst>/p/sales_vxmigrate.wlp\r\nNumberOfProfiles=1\r\nExpand=1\r\n"};
  EXPECT_EQ(contents, run.ReadDst({"p/demo.wlp", "p/categories.ini"}));
  EXPECT_EQ((Entries{"File copied:  <dst>/p/sales_vxmigrate.wlp",
                     "Folder copied:  <dst>/p/sales_vxmigrate.dat/",
                     "categories.ini merged: <dst>/p/"}),
            run.RunLog());

  // A second run finds its earlier copies and changes nothing.
  run.manager().DoCopyLogProfiles("p", "*.wlp", "wlp", "demo.wlp");
  EXPECT_EQ(tree, run.DestinationTree());
  EXPECT_EQ(profile, ReadFile(run.Dst("p/sales_vxmigrate.wlp")));
  EXPECT_EQ(contents, run.ReadDst({"p/demo.wlp", "p/categories.ini"}));
}

}  // namespace
}  // namespace vxtest
