#include "transport/UploadEnvironment.h"

#include "platform/clock.h"
#include "platform/http.h"
#include "transport/HttpUploadConnection.h"

UploadEnvironment UploadEnvironment::Platform() {
  return UploadEnvironment{&timing::TickCount, &timing::Sleep,
                           HttpUploadConnection::Opener(http::kHttpPort)};
}
