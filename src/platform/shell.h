// Opens a web link in the user's browser, as a desktop does for a clicked link.
#pragma once

#include <string_view>

namespace platform {

// Hands an http or https link to the user's handler: each command of $BROWSER
// in turn (colon-separated; "%s" in a command's words becomes the link, "%%" a
// percent sign, and a command without "%s" gets the link as its last argument),
// else xdg-open. No shell reads the link; the handler is not waited for and is
// reaped when it ends. Returns false for any other kind of link, for a link
// holding control characters, and when no handler could be started.
bool OpenLink(std::wstring_view link);

}  // namespace platform
