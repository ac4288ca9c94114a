// Preset categories: the request in the user's language, the walk of the reply
// into the session's map, which is returned whole.
#include <string>
#include <utility>

#include "diag/trace.h"
#include "platform/text.h"
#include "platform/xml.h"
#include "service/OBLoginData.h"
#include "service/reply_walk.h"
#include "service/server_request.h"

namespace service {

namespace {

constexpr wchar_t kCategoryServlet[] = L"/servlet/getPresetCategory";
constexpr wchar_t kCategoriesElement[] = L"categories";
constexpr wchar_t kCategoryElement[] = L"category";
constexpr char kCategoryIdAttribute[] = "categoryid";
// Far more than the service has; what a hostile reply may add to the session's
// map, which never shrinks.
constexpr int kMostCategoriesPerReply = 10000;

// Adds the reply's categories to the map, replacing the names of known ids;
// past the bound the rest of the reply is ignored.
void AddCategories(const platform::xml::Document& reply, OBLoginData::Categories& categories) {
  int taken = 0;
  for (const platform::xml::Node& list : ChildrenNamed(reply.Top(), kCategoriesElement)) {
    for (const platform::xml::Node& category : ChildrenNamed(list, kCategoryElement)) {
      const std::wstring id = category.Attribute(kCategoryIdAttribute);
      if (id.empty()) continue;
      if (taken == kMostCategoriesPerReply) {
        diag::TraceMessage(L"GetPresetCategory: only the first %d categories of the reply are kept.",
                     kMostCategoriesPerReply);
        return;
      }
      categories[id] = category.Text();
      ++taken;
    }
  }
}

}  // namespace

const OBLoginData::Categories& OBLoginData::GetPresetCategory(const wchar_t* language) {
  EnsureServerUrl();
  const std::wstring path =
      QueryPath(kCategoryServlet, {{L"Locid", platform::WideView(language)}, {L"Version", m_strVersion}});
  // A failed exchange adds nothing: the categories of earlier calls are returned.
  if (auto reply = PostToServer(m_strServerUrl, path, ReplyCoding::kUtf8)) {
    AddCategories(platform::xml::Document(std::move(*reply)), m_mapCategory);
  }
  return m_mapCategory;
}

int OBLoginData::GetCategroyName(int id, std::wstring& name) const {
  const auto found = m_mapCategory.find(std::to_wstring(id));
  if (found == m_mapCategory.end()) return 0;
  name = found->second;
  return 1;
}

}  // namespace service
