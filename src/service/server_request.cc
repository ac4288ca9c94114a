#include "service/server_request.h"

namespace service {

std::wstring QueryPath(std::wstring_view servlet, std::initializer_list<QueryField> fields) {
  std::wstring path(servlet);
  wchar_t separator = L'?';
  for (const auto& [name, value] : fields) {
    path += separator;
    path += name;
    path += L'=';
    path += service::EscapePathValue(value);
    separator = L'&';
  }
  return path;
}

std::optional<std::string> PostToServer(const std::wstring& host, const std::wstring& path,
                                        ReplyCoding coding) {
  service::ServiceRequest request;
  request.host = host;
  request.path = path;
  std::optional<std::string> reply = service::RunExchange(request);
  if (!reply) return std::nullopt;
  return coding == ReplyCoding::kUtf8 ? service::DecodeUtf8Reply(std::move(*reply))
                                      : service::DecodeAnsiReply(std::move(*reply));
}

}  // namespace service
