#include "module/types.h"

#include "module/runtime/ModuleTypes.h"

namespace module {

namespace {

// Lives as long as the process: other modules of the ring keep pointers into it.
runtime::ModuleTypes& Types() {
  static auto* types = new runtime::ModuleTypes({
      {"_p_CString", "CString *"},
      {"_p_HINTERNET", "HINTERNET *"},
      {"_p_OBLoginData", "OBLoginData *"},
      {"_p_PyPresetUploader", "PyPresetUploader *"},
      {"_p_char", "char *|TCHAR *"},
      {"_p_double", "double *|DOUBLE *"},
      {"_p_float", "float *|FLOAT *"},
      {"_p_infoEffectURL", "infoEffectURL *"},
      {"_p_int", "int *|INT_PTR *"},
      {"_p_long", "long *|LRESULT *"},
      {"_p_long_long", "long long *|int64 *"},
      {"_p_unsigned_char", "unsigned char *|uint8 *"},
      {"_p_unsigned_int", "unsigned int *|WPARAM *"},
      {"_p_unsigned_long", "unsigned long *|ULONG_PTR *"},
      {"_p_unsigned_long_long", "unsigned long long *|uint64 *"},
      {"_p_unsigned_short", "unsigned short *|WORD *"},
      {"_p_wchar_t", "wchar_t *|WCHAR *"},
  });
  return *types;
}

}  // namespace

runtime::TypeTable& ModuleTypeTable() { return Types().table(); }

runtime::TypeInfo* Type(TypeId id) { return Types()[static_cast<size_t>(id)]; }

}  // namespace module
