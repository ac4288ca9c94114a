#include "service/ServiceHosts.h"

#include <cstdlib>

#include "platform/text.h"

namespace service {

namespace {

std::wstring Setting(const char* variable, const wchar_t* fallback) {
  const char* value = std::getenv(variable);
  return value && *value ? platform::Utf8ToWide(value) : fallback;
}

}  // namespace

ServiceHosts ServiceHosts::FromEnvironment() {
  return ServiceHosts{Setting(kDefaultHostVariable, kDefaultHost), Setting(kStagingHostVariable, kStagingHost),
                      Setting(kDetectionHostVariable, kDetectionHost)};
}

}  // namespace service
