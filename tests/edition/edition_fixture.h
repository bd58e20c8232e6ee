// A Halden installation and an OBX installation as a customer has them, and a manager over the two,
// for the edition converter's tests. Credentials are written in the forms the products store them.

#ifndef VXMIGRATE_TESTS_EDITION_EDITION_FIXTURE_H_
#define VXMIGRATE_TESTS_EDITION_EDITION_FIXTURE_H_

#include <gtest/gtest.h>

#include <cstring>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "crypt/protected_value.h"
#include "edition/halden_to_obx.h"
#include "migrate/driver_fixture.h"
#include "migrate/manager.h"
#include "migrate/sample_lists.h"
#include "support/test_files.h"

namespace vxtest {

// The previous generation's encoding of a clear text, as old profiles hold it.
inline std::string Legacy(const std::string& plain) {
  std::vector<char> buffer(plain.begin(), plain.end());
  buffer.push_back('\0');
  Obsolete_EncodePasswordOrUserName(buffer.data());
  return std::string(buffer.data());
}

// The protected form of a clear text.
inline std::string Protected(const std::string& plain) {
  std::vector<char> out(5 + 32 * (plain.size() / 16 + 2));
  VXUI_Encrypt(reinterpret_cast<unsigned char*>(const_cast<char*>(plain.data())), plain.size(),
               out.data());
  return std::string(out.data());
}

// The first sample profile name of a product's list ("a.wlp,b.wlp" -> "a.wlp").
inline std::string FirstSample(const char* product) {
  std::string list = GetSampleFileList(product, "wlp");
  return list.substr(0, list.find(','));
}

// The standard template every OBX installation ships.
inline const char* StandardTemplate() {
  return "[general]\nversion=2.0\ndescription=Complete summary\nreportstyle=Default\n"
         "reportlanguage=./vxm_vxx/template/english.rpl\n\n"
         "[content]\nreportobjects=8\nhelpcards=Y\n\n"
         "[Object1]\nname=TopPagesChapter\ntype=CHAPTER\ninclude=Y\n\n"
         "[Object2]\nname=TopPagesGraph\ntype=Graph\ninclude=Y\ngraphtype=MULTIBAR\n"
         "graphelements=10\n\n"
         "[Object3]\nname=TopPagesTable\ntype=Table\ninclude=Y\ntableelements1=20\n"
         "tableelements2=0\n\n"
         "[Object4]\nname=TopEntryPageChapter\ntype=CHAPTER\ninclude=Y\n\n"
         "[Object5]\nname=TopEntryPageTable\ntype=Table\ninclude=Y\ntableelements1=20\n"
         "tableelements2=0\n\n"
         "[Object6]\nname=BrowsersGraph\ntype=Graph\ninclude=Y\ngraphtype=SINGLEPIE\n"
         "graphelements=10\n\n"
         "[Object7]\nname=ReferrersTable\ntype=Table\ninclude=Y\ntableelements1=20\n\n"
         "[Object8]\nname=TopPagesByHourGraph\ntype=Graph\ninclude=Y\ngraphtype=MULTILINE\n"
         "graphelements=24\n";
}

inline void WriteOBXInstallation(const std::string& dst) {
  WriteFile(dst + "/vxm_vxx/vxm_vxx.ini",
            "; OBX reporting server settings\n[defaults]\nprofilesdir=vxm_vxx/datfiles/profiles\n"
            "DownloadTypes={exe,0}\nTitleCacheLifespan=7\n\n[cookie]\nvalidatetype=1\n\n"
            "[server]\nPort=8088\n");
  WriteFile(dst + "/vxm_vxx/CompleteSummary.wct", StandardTemplate());
  WriteFile(dst + "/vxm_vxx/datfiles/contentgroups/default.ini",
            "[Default]\nContentGroupProfileCount=1\n\n[ContentGroupProfile0]\n"
            "profilename=Products\nprofileid=4\nPattern=/products/*\n");
  WriteFile(dst + "/vxm_vxx/datfiles/pathsanalysis/default.ini",
            "[Default]\nPathsAnalysisProfileCount=0\n");
  WriteFile(dst + "/vxm_vxx/datfiles/dynamicpages/default.ini", "[default]\nqueryprofilecount=0\n");
  MakeDirs(dst + "/vxm_vxx/datfiles/profiles");
  WriteFile(dst + "/adviews.txt", "Home,/index.html\n");
  WriteFile(dst + "/vxintra.txt", "10.0.0.0,Office\n");
  WriteFile(dst + "/keywords.ini", "[SearchEngines]\nEngine1=Google\n\n[Google]\nquery=q\n");
}

// The Halden side: log settings, user templates of several families and forms beside standard
// ones, profiles of every server kind, advanced options and data files.
inline void WriteHaldenInstallation(const std::string& src) {
  const std::string dat = src + "/vxm_log/datfiles/";
  WriteFile(src + "/vxm_log/vxm_log.ini",
            "; Log analysis settings\n[Defaults]\nDownloadTypes=exe zip {pdf,1} msi\n"
            "DocumentTypes=htm  html asp\nTitleCacheLifespan=172800\n"
            "UseGlobalSubProfileFilters=0\nMaxTopCount=2500\n\n"
            "[cookie]\nvantixplugin=1\nCookieString=SHOPSID\n\n[Mail]\nSmtpServer=mail.example.com\n");
  WriteFile(dat + "Weekly.mss",
            "[SaveAs]\nSaveReportAs=weekly_report.htm\n\n[general]\n"
            "description=Weekly traffic for the shop\n\n[style]\nreportstyle=Corporate\n"
            "reportlanguage=german\nhelpcards=Y\n\n[content]\n"
            "Section0_Name=TopPages_SectionItem\nSection0_ItemType=1\nSection0_GraphType=3\n"
            "Section0_elements=10\n"
            "Section1_Name=TopPages_SectionItem\nSection1_ItemType=2\nSection1_Elements=25\n"
            "Section1_SubElements=5\n"
            "Section2_Name=TopEntry_SectionItem\nSection2_ItemType=2\nSection2_Elements=15\n"
            "Section3_Name=Browsers_SectionItem\nSection3_ItemType=1\nSection3_GraphType=9\n"
            "Section3_elements=8\n");
  WriteFile(dat + "Referrers.mss",
            "[SaveAs]\nSaveReportAs=referrers.doc\n\n[general]\ndescription=Where visitors come from\n"
            "\n[style]\nreportstyle=Plain\nreportlanguage=spanish\nhelpcards=N\n\n[content]\n"
            "Section0_Name=Referrers_SectionItem\nSection0_ItemType=2\nSection0_Elements=50\n");
  WriteFile(dat + "Monthly.mss",
            "[SaveAs]\nSaveReportAs=monthly.xls\n\n[style]\nreportlanguage=Default\n\n[content]\n"
            "Section0_Name=Visitors_SectionItem\nSection0_ItemType=2\n"
            "Section1_Name=TopPages_SectionItem\nSection1_ItemType=1\n");
  WriteFile(dat + "PlainText.mss", "[SaveAs]\nSaveReportAs=plain.txt\n");
  WriteFile(dat + "CompleteSummary_htm.mss", "[SaveAs]\nSaveReportAs=summary.htm\n");
  WriteFile(dat + "toppages_DOC.mss", "[SaveAs]\nSaveReportAs=top.doc\n");
  WriteFile(dat + "Broken.mss", std::string("[SaveAs]\nSaveReportAs=x.htm\n\0\x01\x02", 32));

  WriteFile(dat + "shop.wlp",
            "[Profile]\nName=Example Shop\nIsServerCluster=0\nServerName=web1.example.com\n"
            "LogFilePath=file:///var/log/shop/access.log\nLogFileUserName=" + Legacy("shopuser") +
            "\nLogFilePassword=" + Legacy("s3cret") +
            "\nHomePageName=/srv/www/shop/index.html\nHomePageUsername=" + Legacy("webadmin") +
            "\nHomePagePassword=" + Protected("pw") +
            "\nIncludeQueries=Y\nincludecontentgroups=*\nincludepathsanalysisprofiles=*\n\n"
            "[[Filter1]]\nName=Weekend visitors\nDayTimeEnabled=1\n\n"
            "[[Filter2]]\nName=All traffic\nDayTimeEnabled=0\n\n[[Filter3]]\nName=Night owls\n");
  WriteFile(dat + "cluster.wlp",
            "[Profile]\nName=Web cluster\nIsServerCluster=1\nServerName=node1.example.com\n"
            "LogFilePath=file:///var/log/web/node1.log|file:///var/log/web/node1.log.1\n"
            "ServerName2=ftp.example.com\nLogFilePath2=ftp://ftp.example.com/logs/access.log\n"
            "LogFileUserName2=" + Legacy("ftpuser") + "\nLogFilePassword2=" + Legacy("ftppass") +
            "\nServerName3=node3.example.com\nLogFilePath3=/var/log/web/a.log||/var/log/web/c.log\n"
            "HomePageName=index.html\nincludecontentgroups=7\n");
  WriteFile(dat + FirstSample("halsuite"), "[Profile]\nName=Sample\n");
  WriteFile(dat + "corrupt.wlp", std::string("[Profile]\nName=x\n\0\0\0", 21));

  WriteFile(dat + "contentgroups/default.ini",
            "[Default]\nContentGroupProfileCount=2\n\n[ContentGroupProfile0]\nprofilename=Products\n"
            "profileid=7\nPattern=/products/*\n\n[ContentGroupProfile1]\nprofilename=Checkout\n"
            "profileid=9\nPattern=/checkout/*\n");
  WriteFile(dat + "dynamicpages/default.ini",
            "[Default]\nQueryProfileCount=1\n\n[QueryProfile0]\nprofilename=Product pages\n"
            "profileid=11\nQualification0URL=/product.asp\nParameter0=id\nMapFile0=products.map\n");
  WriteFile(src + "/adviews.txt", "Home,/index.html\nShop,/shop/\n");
  WriteFile(src + "/vxintra.txt", "10.0.0.0,Office\n192.168.0.0,Warehouse\n");
  WriteFile(src + "/keywords.ini", "[SearchEngines]\nEngine1=Google\nEngine2=Seekr\n\n[Seekr]\n"
                                   "query=s\n");
}

// A run from a Halden installation into an OBX one, both written by the fixture unless asked not.
class EditionRun {
 public:
  explicit EditionRun(const std::string& version = "3.0", std::vector<std::string> extra = {},
                      const std::string& product = "halsuite", bool write = true) {
    MakeDirs(root_.Path("src"));
    MakeDirs(root_.Path("dst"));
    if (write) {
      WriteHaldenInstallation(src());
      WriteOBXInstallation(dst());
    }
    std::vector<std::string> args = {root_.Path("bin/vxmigrate"), "-D1:" + src(), "-D2:" + dst(),
                                      "-P1:" + product, "-P2:obx", "-V1:5.5", "-V2:" + version};
    args.insert(args.end(), extra.begin(), extra.end());
    manager_ = MakeManager(args);
    mark_ = LogEntries(LogPath()).size();
  }

  std::string src() const { return root_.Path("src"); }
  std::string dst() const { return root_.Path("dst"); }
  std::string LogPath() const { return root_.Path("dst/vxmigrate.log"); }
  vxMigrationManager* manager() { return manager_.get(); }

  // Log entries written since the last call (or since the manager's header).
  std::vector<std::string> NewLog() {
    std::vector<std::string> all = LogEntries(LogPath());
    std::vector<std::string> fresh(all.begin() + std::min(mark_, all.size()), all.end());
    mark_ = all.size();
    return fresh;
  }

 private:
  TempDir root_;
  std::unique_ptr<vxMigrationManager> manager_;
  size_t mark_ = 0;
};

// Every file below folder with its content, by relative name.
inline std::map<std::string, std::string> Snapshot(const std::string& folder) {
  std::map<std::string, std::string> files;
  for (const std::string& name : ListTree(folder)) files[name] = ReadFile(folder + "/" + name);
  return files;
}

}  // namespace vxtest

#endif  // VXMIGRATE_TESTS_EDITION_EDITION_FIXTURE_H_
