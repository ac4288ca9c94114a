#pragma once

#include <Python.h>

#include "interpreter/ParkIfStopped.h"

// Holds the interpreter lock for the guard's scope, whether or not the calling
// thread held it already.
class GilStateGuard {
 public:
  GilStateGuard() { ParkIfStopped([this] { state_ = PyGILState_Ensure(); }); }
  ~GilStateGuard() { PyGILState_Release(state_); }
  GilStateGuard(const GilStateGuard&) = delete;
  GilStateGuard& operator=(const GilStateGuard&) = delete;

 private:
  PyGILState_STATE state_;
};
