// Related video: a fresh video identifier for the signed-in member, then the
// registration of the video's address under it; the service answers with the
// address of the video's page.
#include <optional>
#include <string>
#include <utility>

#include "diag/trace.h"
#include "platform/xml.h"
#include "service/OBLoginData.h"
#include "service/server_request.h"

namespace service {

namespace {

constexpr wchar_t kRelateVideoServlet[] = L"/servlet/setRelateVideo";
constexpr wchar_t kApplication[] = L"KRV";
constexpr char kVideoIdPath[] = "info/videoId";
constexpr char kVideoUrlPath[] = "info/videoUrl";

// The text of the reply's node at `path`; nothing for an empty reply, a reply that
// is not XML or one without the node.
std::optional<std::wstring> ReplyField(std::optional<std::string> reply, const char* path) {
  if (!reply || reply->empty()) return std::nullopt;
  platform::xml::Lookup field = platform::xml::Document(std::move(*reply)).NodeText(path);
  if (!field.found()) return std::nullopt;
  return std::move(field.text);
}

}  // namespace

std::optional<std::wstring> OBLoginData::SetRelateVideo(const wchar_t* videoURL, const wchar_t* website,
                                                        const wchar_t* videoInfo) {
  if (!videoURL || !website || !videoInfo) {
    diag::TraceMessage(L"SetRelateVideo wszVideoURL|wszWebsite|wszVideoInfo fail");
    return std::nullopt;
  }
  const std::wstring token = GetToken();
  if (token.empty()) {
    diag::TraceMessage(L"SetRelateVideo GetTokenID fail");
    return std::nullopt;
  }
  std::wstring videoID;
  GetVideoID(videoID);
  if (videoID.empty()) {
    diag::TraceMessage(L"SetRelateVideo GetVideoID fail");
    return std::nullopt;
  }
  EnsureServerUrl();
  // The details are a ready-made query fragment and come last.
  const std::wstring path = QueryPath(kRelateVideoServlet, {{L"tokenid", token},
                                                            {L"videoID", videoID},
                                                            {L"videoURL", videoURL},
                                                            {L"website", website},
                                                            {L"AP", kApplication},
                                                            {L"Version", m_strVersion},
                                                            {L"versionType", m_strVersionType},
                                                            {L"uuid", m_strUuid}}) +
                            L'&' + service::EscapePathValue(videoInfo);
  return ReplyField(PostToServer(m_strServerUrl, path, ReplyCoding::kAnsi),
                    kVideoUrlPath);
}

void OBLoginData::GetVideoID(std::wstring& videoID) {
  const std::wstring token = GetToken();
  EnsureServerUrl();
  const std::wstring path = QueryPath(kRelateVideoServlet, {{L"tokenid", token},
                                                            {L"AP", kApplication},
                                                            {L"Version", m_strVersion},
                                                            {L"versionType", m_strVersionType},
                                                            {L"uuid", m_strUuid}});
  // Sent as a fresh request where the registration may reuse a connection; this
  // transport keeps no connection or cache between requests, so both go out alike.
  if (auto id = ReplyField(PostToServer(m_strServerUrl, path, ReplyCoding::kAnsi),
                           kVideoIdPath)) {
    videoID = std::move(*id);
  }
}

}  // namespace service
