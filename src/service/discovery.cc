// Server discovery: the service information from the detection host, asked for
// once per session, with the staging host as the fallback server host.
#include <algorithm>
#include <string>
#include <string_view>

#include "diag/trace.h"
#include "platform/ascii.h"
#include "platform/blocking_scope.h"
#include "platform/text.h"
#include "platform/xml.h"
#include "service/OBLoginData.h"
#include "service/exchange.h"

namespace service {

namespace {

constexpr wchar_t kDetectionPage[] = L"observer.jsp";
constexpr char kDetectionVerb[] = "GET";

// One field of the service information, in the order it is read.
struct InfoField {
  const char* path;
  std::wstring OBLoginData::*member;
  const wchar_t* storedLine;  // with the new value; null for none
  const wchar_t* failedLine;  // when the query fails; null for none
  bool (*acceptable)(std::wstring_view value) = nullptr;  // null: any value is stored
  const wchar_t* refusedLine = nullptr;                   // with the refused value
};

bool IsHostNameCharacter(wchar_t c) {
  return platform::IsLetterOrDigit(c) || c == L'-' || c == L'.';
}

// The server host is spliced into every later URL: a port, a path, a user or a
// query in it would send those requests, the sign-in password among them, elsewhere.
bool IsBareHostName(std::wstring_view value) {
  return !value.empty() && std::all_of(value.begin(), value.end(), IsHostNameCharacter);
}

}  // namespace

void OBLoginData::InitOBServerURL() {
  // Ends last: after every use of the session, with the lock taken back.
  const platform::OperationGate::Pass running(runningOperations_);
  if (!running) return;
  const platform::BlockingScope blocking;
  EnsureServerUrl();
}

void OBLoginData::SetOBURLAsReg(const wchar_t* serverHost) {
  m_strServerUrl = platform::WideView(serverHost);
}

void OBLoginData::EnsureServerUrl() {
  if (!m_strServerUrl.empty()) return;
  DetectServerInfo();
  diag::TraceMessage(L"Get OB server URL from server. URL = %s", m_strServerUrl.c_str());
  if (m_strServerUrl.empty()) {
    m_strServerUrl = hosts_.stagingHost;
    diag::TraceMessage(L"Use static URL as OB server URL.");
  }
}

void OBLoginData::DetectServerInfo() {
  const std::string probeUrl = "http://" + platform::WideToUtf8(hosts_.detectionHost);
  if (!CheckServerReachable(probeUrl.c_str())) return;

  service::ServiceRequest request;
  request.host = hosts_.detectionHost;
  request.verb = kDetectionVerb;
  request.path = std::wstring(kDetectionPage) + L"?ap=lumivanta&version=" +
                 service::EscapePathValue(m_strVersion);
  if (!m_strVersionType.empty()) {
    request.path += L"&versionType=" + service::EscapePathValue(m_strVersionType);
  }
  std::optional<std::string> reply = service::RunExchange(request);
  if (reply) StoreServiceInfo(platform::xml::Document(service::DecodeAnsiReply(std::move(*reply))));
}

void OBLoginData::StoreServiceInfo(const platform::xml::Document& reply) {
  const InfoField fields[] = {
      {"INFO/APIUrl", &OBLoginData::m_strServerUrl, nullptr, nullptr, IsBareHostName,
       L"Update OBInfo fail: APIUrl is not a host name: %s"},
      {"INFO/AdjustmentPreset", &OBLoginData::m_strAdjustmentPresetURL, nullptr, nullptr},
      {"INFO/SignUp", &OBLoginData::m_strSignUpURL, L"KRV SignUp = %s",
       L"Update OBInfo fail: Can not parse SignUp from xml."},
      {"INFO/ForgetPassword", &OBLoginData::m_strForgetPasswordURL, L"KRV ForgetPassword = %s",
       L"Update OBInfo fail: Can not parse ForgetPassword from xml."},
      {"INFO/LensCorrection", &OBLoginData::m_strLensCorrectionURL, L"KRV LensCorrection = %s",
       L"Update OBInfo fail: Can not parse LensCorrection from xml."},
      {"INFO/VideoGallery", &OBLoginData::m_strVideoGalleryURL, L"KRV VideoGallery = %s",
       L"Update OBInfo fail: Can not parse VideoGallery from xml."},
  };
  for (const InfoField& field : fields) {
    const platform::xml::Lookup node = reply.NodeText(field.path);
    if (node.failed() && field.failedLine) diag::TraceMessage(field.failedLine);
    if (!node.found()) continue;
    if (field.acceptable && !field.acceptable(node.text)) {
      diag::TraceMessage(field.refusedLine, node.text.c_str());
      continue;
    }
    this->*field.member = node.text;
    if (field.storedLine) diag::TraceMessage(field.storedLine, (this->*field.member).c_str());
  }
}

}  // namespace service
