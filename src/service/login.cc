// Sign-in over TLS with the member's escaped credentials, and sign-out, which
// only forgets.
#include <mutex>
#include <string>

#include "diag/trace.h"
#include "platform/blocking_scope.h"
#include "platform/shell.h"
#include "platform/text.h"
#include "platform/xml.h"
#include "service/OBLoginData.h"
#include "service/escape_form_value.h"
#include "service/exchange.h"

namespace service {

namespace {

constexpr wchar_t kSignInPath[] = L"/servlet/memLogin";
constexpr char kSignInHeaders[] =
    "User-Agent: Lumivanta\nContent-Type: application/x-www-form-urlencoded";

bool IsEmpty(const wchar_t* text) { return !text || !*text; }

// The form, with only the account and the password escaped.
std::string SignInBody(const std::wstring& account, const std::wstring& password,
                       const std::wstring& version, const std::wstring& versionType,
                       const std::wstring& uuid) {
  const std::wstring body = L"account=" + account + L"&pwd=" + password + L"&AP=KRV&Version=" +
                            version + L"&versionType=" + versionType + L"&uuid=" + uuid;
  return platform::WideToUtf8(body);
}

// Member fields of the reply after the token, in the order they are read.
struct ReplyField {
  const char* path;
  void (*store)(OBLoginData& session, const std::wstring& text);  // null: not kept
  const wchar_t* failedLine;
};

}  // namespace

unsigned int OBLoginData::LoginOrbishare(const wchar_t* account, const wchar_t* password) {
  if (IsEmpty(account) || IsEmpty(password)) {
    diag::TraceMessage(L"Login OB fail: Empty user name or password");
    m_bLoggedIn = 0;
    return 0;
  }
  // Ends last: after every use of the session, with the lock taken back.
  const platform::OperationGate::Pass running(runningOperations_);
  if (!running) return 0;
  const platform::BlockingScope blocking;
  EnsureServerUrl();
  const std::string probeUrl = "http://" + platform::WideToUtf8(hosts_.defaultHost);
  if (!CheckServerReachable(probeUrl.c_str())) {
    diag::TraceMessage(L"Login OB fail: Can not reach the OB server");
    return 0;
  }

  service::ServiceRequest request;
  request.host = m_strServerUrl;
  request.transport = service::Transport::kTls;
  request.path = kSignInPath;
  request.headers = kSignInHeaders;
  request.body = SignInBody(EscapeFormValue(account), EscapeFormValue(password), m_strVersion,
                            m_strVersionType, m_strUuid);
  std::optional<std::string> reply = service::RunExchange(request);
  if (!reply) return 0;

  std::wstring token;
  bool firstLogin = false;
  const unsigned int result =
      ReadSignInReply(platform::xml::Document(service::DecodeUtf8Reply(std::move(*reply))), token, firstLogin);
  if (firstLogin) return 0;
  if (result == 1) {
    m_bLoggedIn = 1;
    SetLoginTokenID(token);
  }
  return result;
}

unsigned int OBLoginData::ReadSignInReply(const platform::xml::Document& reply, std::wstring& token,
                                          bool& firstLogin) {
  const platform::xml::Lookup firstLoginUrl = reply.NodeText("info/firstloginUrl");
  if (firstLoginUrl.found() && !firstLoginUrl.text.empty()) {
    platform::OpenLink(firstLoginUrl.text);  // only an http or https link is opened
    firstLogin = true;
  }

  unsigned int result = 0;
  const platform::xml::Lookup tokenNode = reply.NodeText("info/tokenid");
  if (tokenNode.failed()) diag::TraceMessage(L"Login OB fail: Can not parse tokenid from xml.");
  if (tokenNode.found()) {
    token = tokenNode.text;
    result = 1;
  } else {
    diag::TraceMessage(L"No tokenID, login failed!!");
  }

  const ReplyField fields[] = {
      {"info/username", [](OBLoginData& s, const std::wstring& t) { s.SetUserName(t); },
       L"Login OB fail: Can not parse username from xml."},
      {"info/profileURL", [](OBLoginData& s, const std::wstring& t) { s.SetProfileURL(t); },
       L"Login OB fail: Can not parse profileURL from xml."},
      {"info/AdjustmentPreset",
       [](OBLoginData& s, const std::wstring& t) { s.m_strAdjustmentPresetURL = t; },
       L"Login OB fail: Can not parse AdjustmentPreset from xml."},
      {"info/search", nullptr, L"Login OB fail: Can not parse search from xml."},
      {"info/errMsg", nullptr, L"Login OB fail: Can not parse errMsg from xml."},
  };
  for (const ReplyField& field : fields) {
    const platform::xml::Lookup node = reply.NodeText(field.path);
    if (node.failed()) {
      diag::TraceMessage(field.failedLine);
      result = 0;
    }
    if (node.found() && field.store) field.store(*this, node.text);
  }
  return result;
}

void OBLoginData::LogoutOrbishare() {
  m_bServerReachable = 0;
  m_strServerUrl.clear();
  m_strProfileURL.clear();
  m_bLoggedIn = 0;
  SetLoginTokenID(std::wstring());
  m_strUserName.clear();
  m_strAdjustmentPresetURL.clear();
  m_strSignUpURL.clear();
  m_strForgetPasswordURL.clear();
  m_strLensCorrectionURL.clear();
  m_strVideoGalleryURL.clear();
}

}  // namespace service
