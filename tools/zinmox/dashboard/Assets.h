// The page's files, embedded in the binary at build time from dashboard/web (nothing is
// fetched from elsewhere).
#ifndef ZINMOX_DASHBOARD_ASSETS_H
#define ZINMOX_DASHBOARD_ASSETS_H

#include <string_view>

namespace zinmox::dashboard {

struct Asset {
  std::string_view path;  // "/index.html"
  std::string_view type;  // "text/html; charset=utf-8"
  std::string_view body;
};

/// The embedded files, and how many there are.
extern const Asset kAssets[];
extern const size_t kAssetCount;

}  // namespace zinmox::dashboard

#endif
