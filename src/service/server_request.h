// The requests of the category, related-video and effect operations: a POST with
// an empty body to the server host, its path a servlet with a query, its reply
// read as text for the XML reader.
#pragma once

#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "service/exchange.h"

namespace service {

// How the reply's bytes become text.
enum class ReplyCoding { kUtf8, kAnsi };

using QueryField = std::pair<const wchar_t*, std::wstring_view>;

// "servlet?name=value&name=value...", every value escaped to stand in a request
// target; the path is built whole, whatever its length.
std::wstring QueryPath(std::wstring_view servlet, std::initializer_list<QueryField> fields);

// The reply text (UTF-8), whatever the HTTP status; nothing when the exchange failed.
std::optional<std::string> PostToServer(const std::wstring& host, const std::wstring& path,
                                         ReplyCoding coding);

}  // namespace service
