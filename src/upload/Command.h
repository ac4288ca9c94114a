// Work posted to a window and run by the thread that owns it. Whoever dispatches
// a command deletes it.
#pragma once

namespace transport {
class BackgroundUploadProgress;
}

namespace upload {

class Command {
 public:
  virtual ~Command() = default;
  virtual void Execute() = 0;
};

// A command that calls one upload event operation on its target.
class UploadProgressCommand : public Command {
 protected:
  explicit UploadProgressCommand(transport::BackgroundUploadProgress* target) : target(target) {}

  transport::BackgroundUploadProgress* target;  // not owned
};

}  // namespace upload
