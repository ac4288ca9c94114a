// Work posted to a window and run by the thread that owns it. Whoever dispatches
// a command deletes it.
#pragma once

class BackgroundUploadProgress;

class Command {
 public:
  virtual ~Command() = default;
  virtual void Execute() = 0;
};

// A command that calls one upload event operation on its target.
class UploadProgressCommand : public Command {
 protected:
  explicit UploadProgressCommand(BackgroundUploadProgress* target) : target(target) {}

  BackgroundUploadProgress* target;  // not owned
};
