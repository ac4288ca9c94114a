#include "module/functions_PyPresetUploader.h"

#include "module/runtime/call.h"
#include "module/types.h"
#include "upload/PyPresetUploader.h"

namespace module {

namespace {

using namespace binding;

constexpr char kUploaderType[] = "PyPresetUploader *";

PointerKind<PyPresetUploader> Uploader() {
  return Pointer<PyPresetUploader>(Type(TypeId::PyPresetUploader), kUploaderType);
}

}  // namespace

PyObject* new_PyPresetUploader(PyObject*, PyObject* args) {
  return Call(args, "new_PyPresetUploader",
              NewPointer(Type(TypeId::PyPresetUploader), POINTER_OWN | POINTER_NOSHADOW),
              [](const wchar_t* serverHost, const wchar_t* token, const wchar_t* version,
                 const wchar_t* versionType, const wchar_t* uuid) {
                return new PyPresetUploader(serverHost, token, version, versionType, uuid);
              },
              WideString(), WideString(), WideString(), WideString(), WideString());
}

PyObject* delete_PyPresetUploader(PyObject*, PyObject* args) {
  return Delete<PyPresetUploader>(args, "delete_PyPresetUploader",
                                  Type(TypeId::PyPresetUploader), kUploaderType);
}

PyObject* PyPresetUploader_SetCallback(PyObject*, PyObject* args) {
  return Call(args, "PyPresetUploader_SetCallback", ReturnsInt{},
              [](PyPresetUploader* self, PyObject* callable) { return self->SetCallback(callable); },
              Uploader(), Object());
}

// The preset file, images 1 to 12, template key, title, category, tags and
// description, in this order.
PyObject* PyPresetUploader_StartUpload(PyObject*, PyObject* args) {
  const WideStringKind text = WideString();
  return Call(args, "PyPresetUploader_StartUpload", ReturnsInt{},
              [](PyPresetUploader* self, auto... texts) { return self->StartUpload(texts...); },
              Uploader(), text, text, text, text, text, text, text, text, text, text, text, text,
              text, text, text, text, text, text);
}

PyObject* PyPresetUploader_CancelUpload(PyObject*, PyObject* args) {
  return Call(args, "PyPresetUploader_CancelUpload", ReturnsNone{},
              [](PyPresetUploader* self) { self->CancelUpload(); }, Uploader());
}

PyObject* PyPresetUploader_GetUploadedFileUrl(PyObject*, PyObject* args) {
  return Call(args, "PyPresetUploader_GetUploadedFileUrl", PassedThrough{},
              [](PyPresetUploader* self) { return self->GetUploadedFileUrl(); }, Uploader());
}

PyObject* PyPresetUploader_swigregister(PyObject*, PyObject* args) {
  return Register(args, Type(TypeId::PyPresetUploader));
}

}  // namespace module
