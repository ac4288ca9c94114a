// Effect lookup: where the picture-in-picture effect with a GUID is downloaded.
#include <optional>
#include <string>
#include <utility>

#include "platform/xml.h"
#include "service/OBLoginData.h"
#include "service/reply_walk.h"
#include "service/server_request.h"
#include "service/unescape_url.h"

namespace service {

namespace {

constexpr wchar_t kEffectServlet[] = L"/servlet/GetEffectByGUIDForQZM";
constexpr wchar_t kPipElement[] = L"PIP";
constexpr wchar_t kPipUrlElement[] = L"pipURL";

// The last "pipURL" under the last "PIP" that holds one; empty when there is none.
std::wstring EffectAddress(const platform::xml::Document& reply) {
  std::wstring address;
  for (const platform::xml::Node& pip : ChildrenNamed(reply.Top(), kPipElement)) {
    for (const platform::xml::Node& link : ChildrenNamed(pip, kPipUrlElement)) address = link.Text();
  }
  return address;
}

}  // namespace

std::optional<std::wstring> OBLoginData::GetEffectByGUID(const wchar_t* guid) {
  if (!guid) return std::nullopt;
  // Signed out, the token is empty and sent as such.
  const std::wstring token = GetToken();
  EnsureServerUrl();
  const std::wstring path = QueryPath(kEffectServlet, {{L"token", token}, {L"guid", guid}});
  std::wstring address;
  if (auto reply = PostToServer(m_strServerUrl, path, ReplyCoding::kUtf8)) {
    address = EffectAddress(platform::xml::Document(std::move(*reply)));
  }
  return UnescapeUrl(address);
}

}  // namespace service
