#pragma once

#include <string>

namespace service {

// The three host names of the community service, read when a session is made:
// compiled defaults, each overridden by its environment variable when that is set
// and not empty.
struct ServiceHosts {
  static constexpr char kDefaultHostVariable[] = "PYUPLOADER_DEFAULT_HOST";
  static constexpr char kStagingHostVariable[] = "PYUPLOADER_STAGING_HOST";
  static constexpr char kDetectionHostVariable[] = "PYUPLOADER_DETECTION_HOST";
  static constexpr wchar_t kDefaultHost[] = L"www.orbishare.com";
  static constexpr wchar_t kStagingHost[] = L"staging.orbishare.com";
  static constexpr wchar_t kDetectionHost[] = L"detect.orbishare.com";

  static ServiceHosts FromEnvironment();

  std::wstring defaultHost;    // default links; probe address before sign-in
  std::wstring stagingHost;    // server host when discovery finds none
  std::wstring detectionHost;  // host of the detection request and its probe
};

}  // namespace service
