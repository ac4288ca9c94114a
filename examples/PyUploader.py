"""Companion module: Python classes over the flat functions of _PyUploader.

Each class keeps the owning pointer object returned by its "new_" function in
``self.this``, names its "delete_" function as ``__swig_destroy__`` and registers
itself once, so the native object is destroyed when the instance goes away.
"""
import _PyUploader as _native


def _member(getter, setter):
    return property(lambda self: getter(self), lambda self, value: setter(self, value))


class infoEffectURL(object):
    """A record of three strings (effect, tag, URL), each a "CString *" object."""

    __swig_destroy__ = _native.delete_infoEffectURL

    def __init__(self, effect, tag, url):
        self.this = _native.new_infoEffectURL(effect, tag, url)

    strEffect = _member(_native.infoEffectURL_strEffect_get, _native.infoEffectURL_strEffect_set)
    strTag = _member(_native.infoEffectURL_strTag_get, _native.infoEffectURL_strTag_set)
    strURL = _member(_native.infoEffectURL_strURL_get, _native.infoEffectURL_strURL_set)


_native.infoEffectURL_swigregister(infoEffectURL)


class OBLoginData(object):
    """A session with the community service."""

    __swig_destroy__ = _native.delete_OBLoginData

    def __init__(self, version, versionType, uuid):
        self.this = _native.new_OBLoginData(version, versionType, uuid)

    def LoginOrbishare(self, account, password):
        return _native.OBLoginData_LoginOrbishare(self, account, password)

    def LogoutOrbishare(self):
        return _native.OBLoginData_LogoutOrbishare(self)

    def InitOBServerURL(self):
        return _native.OBLoginData_InitOBServerURL(self)

    def SetOBURLAsReg(self, host):
        return _native.OBLoginData_SetOBURLAsReg(self, host)

    def GetUserName(self):
        return _native.OBLoginData_GetUserName(self)

    def GetServerUrl(self):
        return _native.OBLoginData_GetServerUrl(self)

    def GetLoginTokenID(self):
        return _native.OBLoginData_GetLoginTokenID(self)

    def GetSignUpURL(self):
        return _native.OBLoginData_GetSignUpURL(self)

    def GetForgetPasswordURL(self):
        return _native.OBLoginData_GetForgetPasswordURL(self)

    def GetLensCorrectionURL(self):
        return _native.OBLoginData_GetLensCorrectionURL(self)

    def GetPresetCategory(self, language):
        return _native.OBLoginData_GetPresetCategory(self, language)

    def GetCategroyName(self, categoryId, name):
        return _native.OBLoginData_GetCategroyName(self, categoryId, name)

    def GetCategoryCount(self):
        return _native.OBLoginData_GetCategoryCount(self)

    def SetRelateVideo(self, videoURL, website, videoInfo):
        return _native.OBLoginData_SetRelateVideo(self, videoURL, website, videoInfo)

    def GetPresetDownloadURL(self):
        return _native.OBLoginData_GetPresetDownloadURL(self)

    def GetEffectByGUID(self, guid):
        return _native.OBLoginData_GetEffectByGUID(self, guid)

    m_hInternet = _member(_native.OBLoginData_m_hInternet_get, _native.OBLoginData_m_hInternet_set)
    m_hConnect = _member(_native.OBLoginData_m_hConnect_get, _native.OBLoginData_m_hConnect_set)
    m_hRequest = _member(_native.OBLoginData_m_hRequest_get, _native.OBLoginData_m_hRequest_set)
    m_bServerReachable = _member(_native.OBLoginData_m_bServerReachable_get,
                                 _native.OBLoginData_m_bServerReachable_set)
    m_szChkServerUrl = _member(_native.OBLoginData_m_szChkServerUrl_get,
                               _native.OBLoginData_m_szChkServerUrl_set)


_native.OBLoginData_swigregister(OBLoginData)


class PyPresetUploader(object):
    """Publishes one preset on a worker thread; reports reach the callable on this thread.

    Create it and call it on the interpreter's main thread: reports are delivered
    whenever that thread runs Python code.
    """

    __swig_destroy__ = _native.delete_PyPresetUploader

    def __init__(self, serverHost, token, version, versionType, uuid):
        self.this = _native.new_PyPresetUploader(serverHost, token, version, versionType, uuid)

    def SetCallback(self, callback):
        return _native.PyPresetUploader_SetCallback(self, callback)

    def StartUpload(self, presetFile, images, templateKey, title, category, tags, description):
        """Starts the upload of a preset file and exactly twelve images; 1 when started."""
        if len(images) != 12:
            raise ValueError("a preset carries twelve images")
        args = [presetFile] + list(images) + [templateKey, title, category, tags, description]
        return _native.PyPresetUploader_StartUpload(self, *args)

    def CancelUpload(self):
        return _native.PyPresetUploader_CancelUpload(self)

    def GetUploadedFileUrl(self):
        return _native.PyPresetUploader_GetUploadedFileUrl(self)


_native.PyPresetUploader_swigregister(PyPresetUploader)
