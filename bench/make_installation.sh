#!/usr/bin/env bash
# Writes a Halden installation ("halsuite" 5.5) of about FILES files and a matching OBX installation
# ("obx" 3.0) for whole-run measurements: FILES/2 report templates, FILES/2 analysis profiles with
# legacy-encoded credentials and file:// paths, and settings and data files of FILES*5 keys each
# (100,000 at 20,000 files), half of them also in the OBX files with other values. Deterministic:
# the same FILES gives the same bytes. Needs only bash and awk.
#   usage: bench/make_installation.sh FILES HALDEN_FOLDER OBX_FOLDER   (both folders must not exist)
set -euo pipefail

if [[ $# -ne 3 || ! $1 =~ ^[0-9]+$ ]]; then
  echo "usage: $0 FILES HALDEN_FOLDER OBX_FOLDER" >&2
  exit 2
fi
files=$1 src=$2 dst=$3
for folder in "$src" "$dst"; do
  if [[ -e $folder ]]; then echo "$0: $folder exists" >&2; exit 2; fi
done

mkdir -p "$src/vxm_log/datfiles/"{contentgroups,pathsanalysis,dynamicpages,urlreplacement}
mkdir -p "$dst/vxm_vxx/datfiles/"{profiles,reports,databases,contentgroups,pathsanalysis}
mkdir -p "$dst/vxm_vxx/datfiles/"{dynamicpages,urlreplacement}
touch "$src/vxm_log/datfiles/urlreplacement/.keep"
touch "$dst/vxm_vxx/datfiles/"{profiles,reports,databases}/.keep

# The previous generation's encoding of the credentials the profiles hold (the encoding is fixed,
# so these bytes never change). Passed through the environment: awk takes them byte for byte.
export VXM_LOGUSER=$(printf '\066\170\147\266\375\104\031')  # loguser
export VXM_LOGPASS=$(printf '\066\170\147\263\357\122\030')  # logpass
export VXM_ADMIN=$(printf '\073\163\155\252\340')            # admin
export VXM_SECRET=$(printf '\051\162\143\261\353\125')       # secret
export VXM_FTPUSER=$(printf '\074\143\160\266\375\104\031')  # ftpuser
export VXM_DBUSER=$(printf '\076\165\165\260\353\123')       # dbuser

LC_ALL=C awk -v files="$files" -v src="$src" -v dst="$dst" '
function put(path, text) { printf "%s", text > path; close(path) }

# Settings keys into path (already holding its head): sections of 100 keys. first..last are key
# numbers; tag changes the values. Large files are written line by line, never built as one string.
function settings(path, first, last, tag,    i) {
  for (i = first; i <= last; i++) {
    if (i % 100 == 0 || i == first) printf "\n[Options%d]\n", int(i / 100) > path
    printf "Option%d=%s value %d with some words after it\n", i, tag, i > path
  }
  close(path)
}

function families(k) {
  split("TopPages TopEntryPage ExitPages Referrers Browsers Platforms Countries SearchPhrases " \
        "Downloads Visitors HourlyActivity DailyActivity ServerErrors Domains Directories FileTypes",
        family, " ")
  return family[k % 16 + 1]
}

# A user report template of 16 sections, graph and table in turn.
function template(n,    text, k, key) {
  text = "[SaveAs]\nSaveReportAs=report" n (n % 5 ? ".htm" : ".xls") "\n\n[general]\n" \
         "description=Report " n " for the shop\n\n[style]\nreportstyle=Corporate\n" \
         "reportlanguage=" (n % 3 ? "english" : "german") "\nhelpcards=Y\n\n[content]\n"
  for (k = 0; k < 16; k++) {
    key = "Section" k "_"
    text = text key "Name=" families(n + k) "_SectionItem\n" key "ItemType=" (k % 2 ? 2 : 1) "\n" \
           key "GraphType=" (k % 8) "\n" key "elements=" (10 + k) "\n" key "SubElements=5\n"
  }
  return text
}

# An analysis profile: a cluster of three servers (one in three), a warehouse (one in ten), or a
# single server whose log path is a file URL, with a drive letter for every fourth.
function profile(n,    text, s, suffix) {
  text = "[Profile]\nName=Site " n "\n"
  if (n % 10 == 5) {
    text = text "IsServerCluster=0\nLogFilePath=warehouse:dsn" n "\n" \
           "LogFileUserName=" ENVIRON["VXM_LOGUSER"] "\nLogFileUsername=" ENVIRON["VXM_DBUSER"] "\n" \
           "LogFilePassword=" ENVIRON["VXM_LOGPASS"] "\n"
  } else if (n % 3 == 0) {
    text = text "IsServerCluster=1\n"
    for (s = 1; s <= 3; s++) {
      suffix = s == 1 ? "" : s
      text = text "ServerName" suffix "=node" s ".example.com\nLogFilePath" suffix "=" \
             (s == 2 ? "ftp://logs.example.com/access.log" \
                     : "file:///var/log/web/" n "a.log|file:///var/log/web/" n "b.log") "\n" \
             "LogFileUserName" suffix "=" (s == 2 ? ENVIRON["VXM_FTPUSER"] : ENVIRON["VXM_LOGUSER"]) \
             "\nLogFilePassword" suffix "=" ENVIRON["VXM_LOGPASS"] "\n"
    }
  } else {
    text = text "IsServerCluster=0\nServerName=web" n ".example.com\nLogFilePath=" \
           (n % 4 == 1 ? "file:///C:/logs/site" n ".log" : "file:///var/log/web/site" n ".log") \
           "\nLogFileUserName=" ENVIRON["VXM_LOGUSER"] "\nLogFilePassword=" ENVIRON["VXM_LOGPASS"] "\n"
  }
  return text "HomePageName=/srv/www/site" n "/index.html\nHomePageUsername=" ENVIRON["VXM_ADMIN"] \
         "\nHomePagePassword=" ENVIRON["VXM_SECRET"] "\nIncludeQueries=Y\n" \
         "includecontentgroups=" (n % 2 ? "*" : "1 2") "\nincludepathsanalysisprofiles=*\n\n" \
         "[[Filter1]]\nName=Weekend visitors\nDayTimeEnabled=1\nDays=Sat,Sun\n\n" \
         "[[Filter2]]\nName=All traffic\nDayTimeEnabled=0\n"
}

function options(prefix, count, firstId,    text, i) {
  text = "[Default]\n" prefix "Count=" count "\n"
  for (i = 0; i < count; i++) {
    text = text "\n[" prefix i "]\nprofilename=" prefix " " i "\nprofileid=" (firstId + i) \
           "\nPattern=/area" i "/*\n"
  }
  return text
}

# Comma-separated data lines first..last; tag changes the descriptions.
function adviews(path, first, last, tag,    i) {
  for (i = first; i <= last; i++) printf "banner%d,/ads/banner%d.gif,%s campaign %d\n", i, i, tag, i > path
  close(path)
}
function intranet(path, first, last, tag,    i, net) {
  for (i = first; i <= last; i++) {
    net = "10." int(i / 65536) % 256 "." int(i / 256) % 256 "." i % 256
    printf "%s,%s,%s office %d\n", net, net, tag, i > path
  }
  close(path)
}
# Search engines: one list entry and two keys each, so about keys/3 engines.
function keywords(path, first, last,    i) {
  printf "[SearchEngines]\n" > path
  for (i = first; i <= last; i++) printf "Engine%d=Seeker%d\n", i - first + 1, i > path
  for (i = first; i <= last; i++) {
    printf "\n[Seeker%d]\nDomain=seeker%d.example\nQueryParameter=q%d\n", i, i, i % 7 > path
  }
  close(path)
}

BEGIN {
  half = int(files / 2); keys = files * 5; engines = int(keys / 3)
  path = src "/vxm_log/vxm_log.ini"
  printf "; Log analysis settings\n[Defaults]\nDownloadTypes=exe zip {pdf,1} msi\n" \
         "DocumentTypes=htm html asp\nTitleCacheLifespan=172800\nUseGlobalSubProfileFilters=0\n" \
         "MaxTopCount=2500\n\n[cookie]\nvantixplugin=1\nCookieString=SHOPSID\n" > path
  settings(path, 0, keys - 1, "old")
  for (n = 0; n < half; n++) put(src "/vxm_log/datfiles/Report" n ".mss", template(n))
  for (n = 0; n < files - half; n++) put(src "/vxm_log/datfiles/site" n ".wlp", profile(n))
  put(src "/vxm_log/datfiles/CompleteSummary_htm.mss", "[SaveAs]\nSaveReportAs=summary.htm\n")
  put(src "/vxm_log/datfiles/contentgroups/default.ini", options("ContentGroupProfile", 40, 7))
  put(src "/vxm_log/datfiles/pathsanalysis/default.ini", options("PathsAnalysisProfile", 20, 3))
  put(src "/vxm_log/datfiles/dynamicpages/default.ini", "[default]\nqueryprofilecount=0\n")
  adviews(src "/adviews.txt", 0, keys - 1, "Old")
  intranet(src "/vxintra.txt", 0, keys - 1, "Old")
  keywords(src "/keywords.ini", 0, engines - 1)

  path = dst "/vxm_vxx/vxm_vxx.ini"
  printf "; OBX reporting server settings\n[defaults]\nprofilesdir=vxm_vxx/datfiles/profiles\n" \
         "DownloadTypes={exe,0}\nTitleCacheLifespan=7\n\n[cookie]\nvalidatetype=1\n\n" \
         "[server]\nPort=8088\n" > path
  settings(path, int(keys / 2), keys + int(keys / 2) - 1, "new")
  wct = "[general]\nversion=2.0\ndescription=Complete summary\nreportstyle=Default\n" \
        "reportlanguage=./vxm_vxx/template/english.rpl\n\n[content]\nreportobjects=48\nhelpcards=Y\n"
  split("Chapter Graph Table", kind, " "); split("CHAPTER Graph Table", type, " ")
  object = 0
  for (f = 0; f < 16; f++) {
    for (k = 1; k <= 3; k++) {
      wct = wct "\n[Object" (++object) "]\nname=" families(f) kind[k] "\ntype=" type[k] \
            "\ninclude=Y\ngraphtype=MULTIBAR\ngraphelements=10\ntableelements1=20\ntableelements2=0\n"
    }
  }
  put(dst "/vxm_vxx/CompleteSummary.wct", wct)
  put(dst "/vxm_vxx/datfiles/contentgroups/default.ini", options("ContentGroupProfile", 5, 4))
  put(dst "/vxm_vxx/datfiles/pathsanalysis/default.ini", options("PathsAnalysisProfile", 0, 0))
  put(dst "/vxm_vxx/datfiles/dynamicpages/default.ini", "[default]\nqueryprofilecount=0\n")
  put(dst "/vxm_vxx/datfiles/urlreplacement/default.ini", "[default]\nreplacementcount=0\n")
  adviews(dst "/adviews.txt", int(keys / 2), keys + int(keys / 2) - 1, "New")
  intranet(dst "/vxintra.txt", int(keys / 2), keys + int(keys / 2) - 1, "New")
  keywords(dst "/keywords.ini", int(engines / 2), engines + int(engines / 2) - 1)
}'
