// The links to the service's pages: as stored when signed in; signed out, composed
// from the server host, the stored link and the machine identifier. Every link is
// percent-decoded before it is handed out.
#include <string>

#include "service/OBLoginData.h"
#include "service/unescape_url.h"

namespace service {

std::wstring OBLoginData::GetPresetDownloadURL() { return ServiceLink(&OBLoginData::m_strAdjustmentPresetURL); }

std::wstring OBLoginData::GetSignUpURL() { return ServiceLink(&OBLoginData::m_strSignUpURL); }

std::wstring OBLoginData::GetForgetPasswordURL() { return ServiceLink(&OBLoginData::m_strForgetPasswordURL); }

std::wstring OBLoginData::GetLensCorrectionURL() { return ServiceLink(&OBLoginData::m_strLensCorrectionURL); }

// Plain concatenation: nothing goes between the host and the stored link, and
// "&uuid=" follows even a link without a query.
std::wstring OBLoginData::ServiceLink(std::wstring OBLoginData::*storedLink) {
  if (m_bLoggedIn) return UnescapeUrl(this->*storedLink);
  // Discovery may replace the stored link, so it is read afterwards.
  EnsureServerUrl();
  return UnescapeUrl(L"http://" + m_strServerUrl + this->*storedLink + L"&uuid=" + m_strUuid);
}

}  // namespace service
