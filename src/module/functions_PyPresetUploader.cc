#include "module/function_table.h"

#include <iterator>

#include "module/runtime/call.h"
#include "module/types.h"
#include "upload/PyPresetUploader.h"

namespace module {

namespace {

using namespace runtime;
using upload::PyPresetUploader;

constexpr char kUploaderType[] = "PyPresetUploader *";

PointerKind<PyPresetUploader> Uploader() {
  return Pointer<PyPresetUploader>(Type(TypeId::PyPresetUploader), kUploaderType);
}

}  // namespace

const ModuleFunction kPyPresetUploaderFunctions[] = {
    {"new_PyPresetUploader",  // 39
     [](PyObject* args, const char* name) {
       return Call(args, name,
                   NewPointer(Type(TypeId::PyPresetUploader), POINTER_OWN | POINTER_NOSHADOW),
                   [](const wchar_t* serverHost, const wchar_t* token, const wchar_t* version,
                      const wchar_t* versionType, const wchar_t* uuid) {
                     return new PyPresetUploader(serverHost, token, version, versionType, uuid);
                   },
                   WideString(), WideString(), WideString(), WideString(), WideString());
     }},
    {"delete_PyPresetUploader",  // 40
     [](PyObject* args, const char* name) {
       return Delete<PyPresetUploader>(args, name,
                                       Type(TypeId::PyPresetUploader), kUploaderType);
     }},
    {"PyPresetUploader_SetCallback",  // 41
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsInt{},
                   [](PyPresetUploader* self, PyObject* callable) { return self->SetCallback(callable); },
                   Uploader(), Object());
     }},
    // The preset file, images 1 to 12, template key, title, category, tags and
    // description, in this order.
    {"PyPresetUploader_StartUpload",  // 42
     [](PyObject* args, const char* name) {
       const WideStringKind text = WideString();
       return Call(args, name, ReturnsInt{},
                   [](PyPresetUploader* self, auto... texts) { return self->StartUpload(texts...); },
                   Uploader(), text, text, text, text, text, text, text, text, text, text, text, text,
                   text, text, text, text, text, text);
     }},
    {"PyPresetUploader_CancelUpload",  // 43
     [](PyObject* args, const char* name) {
       return Call(args, name, ReturnsNone{},
                   [](PyPresetUploader* self) { self->CancelUpload(); }, Uploader());
     }},
    {"PyPresetUploader_GetUploadedFileUrl",  // 44
     [](PyObject* args, const char* name) {
       return Call(args, name, PassedThrough{},
                   [](PyPresetUploader* self) { return self->GetUploadedFileUrl(); }, Uploader());
     }},
    {"PyPresetUploader_swigregister",  // 45
     [](PyObject* args, const char*) {
       return Register(args, Type(TypeId::PyPresetUploader));
     }},
};
static_assert(std::size(kPyPresetUploaderFunctions) == kPyPresetUploaderCount);

}  // namespace module
