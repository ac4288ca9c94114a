// The client session of the community service: server host, the signed-in
// member's token and details, the service links, the preset categories and the
// state of the reachability probe. Operations run on the caller's thread, one at a
// time; only the token may be read from another thread.
#pragma once

#include <cstddef>
#include <map>
#include <mutex>
#include <optional>
#include <string>

#include "platform/operation_gate.h"
#include "platform/windows_names.h"
#include "service/ServiceHosts.h"

namespace platform::http {
class Probe;
}
namespace platform::xml {
class Document;
}

namespace service {

class OBLoginData {
 public:
  // Null arguments are taken as empty texts.
  OBLoginData(const wchar_t* version, const wchar_t* versionType, const wchar_t* uuid);
  // Sends nothing to the service. An operation inside its BlockingScope on
  // another thread is waited for (in a BlockingScope too);
  // sign-in and discovery begun meanwhile do nothing (sign-in returns 0).
  ~OBLoginData();
  OBLoginData(const OBLoginData&) = delete;
  OBLoginData& operator=(const OBLoginData&) = delete;

  using Categories = std::map<std::wstring, std::wstring>;  // decimal category id to name

  std::wstring GetUserName() const;
  std::wstring GetServerUrl() const;
  std::wstring GetLoginTokenID() const;
  int GetCategoryCount() const;

  // For the service operations: the token is read and written only under m_csToken.
  std::wstring GetToken() const;
  void SetLoginTokenID(const std::wstring& token);
  void SetUserName(const std::wstring& name);
  void SetProfileURL(const std::wstring& link);

  // Service operations: each is defined in its own file of src/service/ and
  // declared here.

  // Sign-in and sign-out (login.cc).
  unsigned int LoginOrbishare(const wchar_t* account, const wchar_t* password);
  void LogoutOrbishare();
  // Server discovery (discovery.cc).
  void InitOBServerURL();
  void SetOBURLAsReg(const wchar_t* serverHost);
  // The reachability probe (reachability.cc): nonzero when the URL could be opened.
  BOOL CheckServerReachable(const char* url);

  // Preset categories (categories.cc): every category known so far.
  const Categories& GetPresetCategory(const wchar_t* language);
  int GetCategroyName(int id, std::wstring& name) const;
  // Related video (related_video.cc): the video page's address, or nothing.
  std::optional<std::wstring> SetRelateVideo(const wchar_t* videoURL, const wchar_t* website,
                                             const wchar_t* videoInfo);
  // Effect lookup (effect_lookup.cc): nothing without a GUID; and the links to
  // the service's pages (links.cc).
  std::optional<std::wstring> GetEffectByGUID(const wchar_t* guid);
  std::wstring GetPresetDownloadURL();
  std::wstring GetSignUpURL();
  std::wstring GetForgetPasswordURL();
  std::wstring GetLensCorrectionURL();

  // The reachability probe's state, also read and written from Python.
  HINTERNET m_hInternet;
  HINTERNET m_hConnect;
  HINTERNET m_hRequest;  // no operation uses it
  BOOL m_bServerReachable;
  char m_szChkServerUrl[kMaxPath];  // may hold kMaxPath bytes without a terminator

 private:
  std::wstring DefaultLink(const wchar_t* path) const;
  // Makes the server host known: detection once, else the staging host.
  void EnsureServerUrl();
  void DetectServerInfo();
  void StoreServiceInfo(const platform::xml::Document& reply);
  void ProbeThreadProc(platform::http::Probe& probe);
  // Stores what a sign-in reply carries but the token; returns 1 with the token.
  unsigned int ReadSignInReply(const platform::xml::Document& reply, std::wstring& token,
                               bool& firstLogin);
  void GetVideoID(std::wstring& videoID);
  std::wstring ServiceLink(std::wstring OBLoginData::*storedLink);

  BOOL m_bLoggedIn;
  std::wstring m_strServerUrl;  // bare host name of every service request
  std::wstring m_strProfileURL;
  std::wstring m_strUserName;
  std::wstring m_strLoginTokenID;  // guarded by m_csToken
  std::wstring m_strVersion;
  std::wstring m_strVersionType;
  std::wstring m_strAdjustmentPresetURL;
  std::wstring m_strSignUpURL;
  std::wstring m_strForgetPasswordURL;
  std::wstring m_strLensCorrectionURL;
  std::wstring m_strVideoGalleryURL;
  std::wstring m_strUuid;
  Categories m_mapCategory;
  mutable std::mutex m_csToken;
  const ServiceHosts hosts_;
  // Passed by the operations that open a BlockingScope, during which another
  // Python thread may delete the session.
  platform::OperationGate runningOperations_;
};

}  // namespace service
