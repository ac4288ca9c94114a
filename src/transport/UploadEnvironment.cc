#include "transport/UploadEnvironment.h"

#include "platform/clock.h"
#include "platform/http.h"
#include "transport/HttpUploadConnection.h"

namespace transport {

UploadEnvironment UploadEnvironment::Platform() {
  return UploadEnvironment{&platform::TickCount, &platform::Sleep,
                           HttpUploadConnection::Opener(platform::http::kHttpPort)};
}

}  // namespace transport
