#include "service/OBLoginData.h"

#include <cstring>

#include "diag/trace.h"
#include "platform/text.h"

namespace service {

namespace {

constexpr char kTraceName[] = "OBLoginData";
constexpr wchar_t kSignUpPath[] = L"/signUp";
constexpr wchar_t kForgetPasswordPath[] = L"/forgetpwd";

}  // namespace

OBLoginData::OBLoginData(const wchar_t* version, const wchar_t* versionType, const wchar_t* uuid)
    : m_hInternet(nullptr),
      m_hConnect(nullptr),
      m_hRequest(nullptr),
      m_bServerReachable(0),
      m_bLoggedIn(0),
      m_strVersion(platform::WideView(version)),
      m_strVersionType(platform::WideView(versionType)),
      m_strUuid(platform::WideView(uuid)),
      hosts_(ServiceHosts::FromEnvironment()) {
  m_strSignUpURL = DefaultLink(kSignUpPath);
  m_strForgetPasswordURL = DefaultLink(kForgetPasswordPath);
  diag::TraceSetPrefix(kTraceName);
  std::memset(m_szChkServerUrl, 0, sizeof m_szChkServerUrl);
  diag::TraceMessage(L"KRV version = %s", m_strVersion.c_str());
  diag::TraceMessage(L"KRV versionType = %s", m_strVersionType.c_str());
}

OBLoginData::~OBLoginData() { runningOperations_.Close(); }

std::wstring OBLoginData::GetUserName() const { return m_strUserName; }

std::wstring OBLoginData::GetServerUrl() const { return m_strServerUrl; }

std::wstring OBLoginData::GetLoginTokenID() const { return GetToken(); }

int OBLoginData::GetCategoryCount() const { return static_cast<int>(m_mapCategory.size()); }

std::wstring OBLoginData::GetToken() const {
  std::lock_guard<std::mutex> lock(m_csToken);
  return m_strLoginTokenID;
}

void OBLoginData::SetLoginTokenID(const std::wstring& token) {
  std::lock_guard<std::mutex> lock(m_csToken);
  m_strLoginTokenID = token;
}

void OBLoginData::SetUserName(const std::wstring& name) { m_strUserName = name; }

void OBLoginData::SetProfileURL(const std::wstring& link) { m_strProfileURL = link; }

std::wstring OBLoginData::DefaultLink(const wchar_t* path) const {
  return L"http://" + hosts_.defaultHost + path;
}

}  // namespace service
