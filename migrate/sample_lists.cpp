// The sample files each product edition installs, as one table: migrations leave these behind
// because the new installation brings its own copies. Names are bare file names, comma-separated
// with no blanks. A product or kind missing from the table ships no samples of that kind.

#include "migrate/sample_lists.h"

#include <cstddef>

#include "foundation/string/string_base.h"

namespace {

struct SampleList {
  const char* product;
  const char* kind;
  const char* names;
};

// wlp log-analysis profiles, prx proxy and firewall profiles, slp streaming-media profiles,
// llp link-check profiles, alp alert profiles, arp auto-report profiles, mss report templates,
// wct the reporting server's report templates.
const SampleList kSampleLists[] = {
    {"halsuite", "wlp", "sample.wlp,demo_site.wlp,intranet.wlp,ecommerce_demo.wlp"},
    {"halsuite", "prx", "sample_proxy.prx,firewall_demo.prx"},
    {"halsuite", "slp", "sample_stream.slp,media_demo.slp"},
    {"halsuite", "llp", "sample_links.llp,site_check.llp"},
    {"halsuite", "alp", "sample_alert.alp,traffic_spike.alp"},
    {"halsuite", "arp", "daily_summary.arp,weekly_summary.arp"},
    {"halsuite", "mss", "standard.mss,executive.mss,marketing.mss,technical.mss"},

    {"pavsuite", "wlp", "sample.wlp,demo_site.wlp,intranet.wlp"},
    {"pavsuite", "prx", "sample_proxy.prx"},
    {"pavsuite", "slp", "sample_stream.slp"},
    {"pavsuite", "llp", "sample_links.llp"},
    {"pavsuite", "alp", "sample_alert.alp"},
    {"pavsuite", "arp", "daily_summary.arp"},
    {"pavsuite", "mss", "standard.mss,executive.mss"},

    {"mirsuite", "wlp", "sample.wlp,demo_site.wlp,mirror_demo.wlp"},
    {"mirsuite", "prx", "sample_proxy.prx"},
    {"mirsuite", "llp", "sample_links.llp"},
    {"mirsuite", "alp", "sample_alert.alp"},
    {"mirsuite", "arp", "daily_summary.arp"},
    {"mirsuite", "mss", "standard.mss,mirror_summary.mss"},

    {"log", "wlp", "sample.wlp,demo_site.wlp"},
    {"log", "mss", "standard.mss"},

    // The reporting-server edition ships exactly three sample profiles.
    {"obx", "wlp", "obx_sample.wlp,obx_demo_site.wlp,obx_intranet.wlp"},
    {"obx", "alp", "obx_sample_alert.alp"},
    {"obx", "arp", "obx_daily.arp,obx_monthly.arp"},
    {"obx", "mss", "obx_standard.mss,obx_executive.mss"},
    {"obx", "wct", "CompleteSummary.wct"},

    {"tqrs", "wlp", "tqrs_sample.wlp,tqrs_demo.wlp"},
    {"tqrs", "arp", "tqrs_daily.arp"},
    {"tqrs", "mss", "tqrs_standard.mss"},

    {"bastion", "wlp", "sample.wlp"},
    {"bastion", "prx", "sample_firewall.prx,sample_proxy.prx,perimeter_demo.prx"},
    {"bastion", "alp", "intrusion_alert.alp"},
    {"bastion", "mss", "firewall_standard.mss"},
};

}  // namespace

const char* GetSampleFileList(const char* product, const char* kind) {
  if (product == nullptr || kind == nullptr) return "";
  for (const SampleList& entry : kSampleLists) {
    if (vxEqualsIgnoreCase(entry.product, product) && vxEqualsIgnoreCase(entry.kind, kind)) {
      return entry.names;
    }
  }
  return "";
}
