// Rewrites of the new installation's log-analysis settings, "vxm_log/vxm_log.ini": the old single
// cookie definition becomes the numbered form, and the company table limit is derived from the old
// top-list length. Only the destination file is read and written; a missing file gives 1.

#include "foundation/files/file_manager.h"
#include "foundation/inifile/ini_file.h"
#include "migrate/failed_copy.h"
#include "migrate/internal/settings_number.h"
#include "migrate/manager.h"

namespace {

const char kCookie[] = "Cookie";
const int kProductLog = 6;

vxStringBase LogSettingsPath(const vxStringBase& destinationFolder) {
  vxStringBase path;
  vxFileManager::MakePath(path, destinationFolder, "\\vxm_log", "vxm_log.ini");
  return path;
}

// The old single cookie definition exists in versions before x.5 of a product line; the numbered
// form from x.5 on. Major and minor are compared separately on purpose: a 4.7 source or a 6.0
// destination of a product other than "log" does not qualify.
bool NeedsCookieConversion(int sourceProduct, const vxVersionDescriptor* source,
                           int destinationProduct, const vxVersionDescriptor* destination) {
  if (source == nullptr || destination == nullptr) return false;
  const int sourceMajorLimit = sourceProduct == kProductLog ? 6 : 5;
  const int destinationMajorMinimum = destinationProduct == kProductLog ? 6 : 5;
  return source->m_major <= sourceMajorLimit && source->m_minor < 5 &&
         destination->m_major >= destinationMajorMinimum && destination->m_minor >= 5;
}

// The cookie kind of the numbered form: "0" validated off, "1" the product's own plug-in, "2" a
// named cookie whose key is the old cookie string.
const char* CookieType(const vxStringBase& validate, const vxStringBase& plugin) {
  if (validate.equals("0")) return "0";
  if (plugin.equals("1")) return "1";
  return "2";
}

// Returns true when an old-style definition was found and converted.
bool ConvertCookie(vxMappedINIFile& settings) {
  const bool hasCount = !settings.GetVal(kCookie, "NumCookies").isEmpty();
  const vxStringBase enable = settings.GetVal(kCookie, "Enable");
  if (enable.isEmpty()) return false;

  const vxStringBase validate = settings.GetVal(kCookie, "Validate");
  const vxStringBase plugin = settings.GetVal(kCookie, "VantixPlugin");
  const vxStringBase cookieString = settings.GetVal(kCookie, "CookieString");

  // An existing count belongs to the new installation and is kept.
  if (!hasCount) {
    settings.SetVal(kCookie, "NumCookies", "1");
    settings.SetVal(kCookie, "Global", "1");
  }
  settings.SetVal("Cookie0", "Name", "Default Cookie");
  settings.SetVal("Cookie0", "Enabled", enable);
  const char* type = CookieType(validate, plugin);
  settings.SetVal("Cookie0", "Type", type);
  if (type[0] == '2') settings.SetVal("Cookie0", "Key", cookieString);

  for (const char* key : {"Enable", "Validate", "VantixPlugin", "CookieText", "CookieString"}) {
    settings.RemoveKey(kCookie, key);
  }
  return true;
}

// The company table limit: the next thousand strictly above the old top-list length (an exact
// thousand moves up a step), at least 1000; from 99000 on the length itself.
long CompanyTableLimit(const vxStringBase& maxTopCount) {
  if (maxTopCount.isEmpty()) return 1000;
  const long n = vxsettings::ReadSettingsNumber(maxTopCount);
  if (n >= 99000) return n;
  return (n / 1000 + 1) * 1000;
}

}  // namespace

int vxMigrationManager::DoVXMLogINIChange() {
  vxMappedINIFile settings(LogSettingsPath(m_destinationDirectory));
  if (settings.Open(0) != 0) return 1;

  if (NeedsCookieConversion(m_sourceProductID, m_sourceVersionDescriptor, m_destinationProductID,
                            m_destinationVersionDescriptor) &&
      ConvertCookie(settings)) {
    if (!vxWroteBack(*this, settings)) return 1;
    Log("New-style cookie created in vxm_log.ini");
    return 0;
  }
  return vxWroteBack(*this, settings) ? 0 : 1;
}

int vxMigrationManager::DoTableLimitINIChange() {
  vxMappedINIFile settings(LogSettingsPath(m_destinationDirectory));
  if (settings.Open(0) != 0) return 1;

  const long limit = CompanyTableLimit(settings.GetVal("Defaults", "MaxTopCount"));
  // A limit the new installation has already set is kept.
  if (settings.GetVal("MaxTableSizes", "TopCompanies").isEmpty()) {
    settings.SetVal("MaxTableSizes", "TopCompanies", limit);
  }
  return vxWroteBack(*this, settings) ? 0 : 1;
}
