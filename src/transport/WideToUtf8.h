// Wide text to a newly allocated UTF-8 copy, for the values of text fields.
#pragma once

// On true, `*out` holds a zero-terminated copy the caller releases with
// delete[]. A null `text` gives false and leaves `*out` as it was.
bool WideToUtf8(const wchar_t* text, char** out);
