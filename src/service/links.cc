// The links to the service's pages: as stored when signed in; signed out, composed
// from the server host, the stored link and the machine identifier. Every link is
// percent-decoded before Python sees it.
#include <string>

#include "service/OBLoginData.h"
#include "service/UnicodeResult.h"
#include "service/unescape_url.h"

PyObject* OBLoginData::GetPresetDownloadURL() { return ServiceLink(&OBLoginData::m_strAdjustmentPresetURL); }

PyObject* OBLoginData::GetSignUpURL() { return ServiceLink(&OBLoginData::m_strSignUpURL); }

PyObject* OBLoginData::GetForgetPasswordURL() { return ServiceLink(&OBLoginData::m_strForgetPasswordURL); }

PyObject* OBLoginData::GetLensCorrectionURL() { return ServiceLink(&OBLoginData::m_strLensCorrectionURL); }

// Plain concatenation: nothing goes between the host and the stored link, and
// "&uuid=" follows even a link without a query.
PyObject* OBLoginData::ServiceLink(std::wstring OBLoginData::*storedLink) {
  if (m_bLoggedIn) return NewUnicodeResult(UnescapeUrl(this->*storedLink));
  // Discovery may replace the stored link, so it is read afterwards.
  EnsureServerUrl();
  return NewUnicodeResult(UnescapeUrl(L"http://" + m_strServerUrl + this->*storedLink + L"&uuid=" + m_strUuid));
}
