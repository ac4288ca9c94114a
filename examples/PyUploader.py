"""Companion module: Python classes over the flat functions of _PyUploader.

Each class keeps the owning pointer object returned by its "new_" function in
``self.this``, names its "delete_" function as ``__swig_destroy__`` and registers
itself once, so the native object is destroyed when the instance goes away.
"""
import _PyUploader as _native


def _member(cls_name, name, doc):
    """The data member `name` through its "_get" and "_set" functions."""
    getter = getattr(_native, "%s_%s_get" % (cls_name, name))
    setter = getattr(_native, "%s_%s_set" % (cls_name, name))
    return property(lambda self: getter(self), lambda self, value: setter(self, value), doc=doc)


class infoEffectURL(object):
    """A record of three strings (effect, tag, URL), each a "CString *" object."""

    __swig_destroy__ = _native.delete_infoEffectURL

    def __init__(self, effect, tag, url):
        """Makes the record from copies of three "CString *" objects."""
        self.this = _native.new_infoEffectURL(effect, tag, url)

    strEffect = _member('infoEffectURL', 'strEffect', 'The effect, as a new "CString *".')
    strTag = _member('infoEffectURL', 'strTag', 'The tag, as a new "CString *".')
    strURL = _member('infoEffectURL', 'strURL', 'The URL, as a new "CString *".')


_native.infoEffectURL_swigregister(infoEffectURL)


class OBLoginData(object):
    """A session with the community service.

    The first operation that needs the server asks the detection host for it
    once (discovery); each operation is one exchange on the calling thread.
    """

    __swig_destroy__ = _native.delete_OBLoginData

    def __init__(self, version, versionType, uuid):
        """A session for this product version, version type and machine identifier."""
        self.this = _native.new_OBLoginData(version, versionType, uuid)

    def LoginOrbishare(self, account, password):
        """Signs the member in over TLS; 1 when signed in, else 0.

        A first-login page the service asks for is opened in the browser, and
        the sign-in then counts as not done (0)."""
        return _native.OBLoginData_LoginOrbishare(self, account, password)

    def LogoutOrbishare(self):
        """Forgets the member and what discovery found; sends nothing."""
        return _native.OBLoginData_LogoutOrbishare(self)

    def InitOBServerURL(self):
        """Runs discovery now, if it has not run; other Python threads run meanwhile."""
        return _native.OBLoginData_InitOBServerURL(self)

    def SetOBURLAsReg(self, host):
        """Sets the server host, unchecked; an empty one makes it unknown again."""
        return _native.OBLoginData_SetOBURLAsReg(self, host)

    def GetUserName(self):
        """The signed-in member's name; empty when signed out."""
        return _native.OBLoginData_GetUserName(self)

    def GetServerUrl(self):
        """The server host that discovery found or that was set; may be empty."""
        return _native.OBLoginData_GetServerUrl(self)

    def GetLoginTokenID(self):
        """The sign-in token (what PyPresetUploader needs); empty when signed out."""
        return _native.OBLoginData_GetLoginTokenID(self)

    def GetSignUpURL(self):
        """The link of the service's sign-up page."""
        return _native.OBLoginData_GetSignUpURL(self)

    def GetForgetPasswordURL(self):
        """The link of the service's forgotten-password page."""
        return _native.OBLoginData_GetForgetPasswordURL(self)

    def GetLensCorrectionURL(self):
        """The link of the service's lens-correction page."""
        return _native.OBLoginData_GetLensCorrectionURL(self)

    def GetPresetCategory(self, language):
        """Asks for the preset categories named in `language` (say u"ENU").

        Returns a dict of category id to name, or None; the session keeps
        them for GetCategroyName and GetCategoryCount."""
        return _native.OBLoginData_GetPresetCategory(self, language)

    def GetCategroyName(self, categoryId, name):
        """Writes the kept name of `categoryId` into the "CString *" `name`; 1 if known, else 0."""
        return _native.OBLoginData_GetCategroyName(self, categoryId, name)

    def GetCategoryCount(self):
        """The number of categories kept from the last GetPresetCategory."""
        return _native.OBLoginData_GetCategoryCount(self)

    def SetRelateVideo(self, videoURL, website, videoInfo):
        """Attaches a video published on `website` to the member's account.

        `videoInfo` is a ready query-string fragment ("name=value&..."). Returns
        the video's page on the service, or None."""
        return _native.OBLoginData_SetRelateVideo(self, videoURL, website, videoInfo)

    def GetPresetDownloadURL(self):
        """The link of the service's preset download page."""
        return _native.OBLoginData_GetPresetDownloadURL(self)

    def GetEffectByGUID(self, guid):
        """Where the picture-in-picture effect `guid` can be downloaded, or None."""
        return _native.OBLoginData_GetEffectByGUID(self, guid)

    m_hInternet = _member('OBLoginData', 'm_hInternet', 'The internet handle.')
    m_hConnect = _member('OBLoginData', 'm_hConnect', 'The connection handle.')
    m_hRequest = _member('OBLoginData', 'm_hRequest', 'The request handle.')
    m_bServerReachable = _member('OBLoginData', 'm_bServerReachable', 'Reachable at last check.')
    m_szChkServerUrl = _member('OBLoginData', 'm_szChkServerUrl', 'The reachability check address.')


_native.OBLoginData_swigregister(OBLoginData)


class PyPresetUploader(object):
    """Publishes one preset on a worker thread; reports reach the callable on this thread.

    Create it and call it on the interpreter's main thread: reports are delivered
    whenever that thread runs Python code. The pause after each chunk is read from
    PYUPLOADER_CHUNK_PAUSE_MS (0 to 1000 ms, default 50) when the object is made.
    """

    __swig_destroy__ = _native.delete_PyPresetUploader

    def __init__(self, serverHost, token, version, versionType, uuid):
        """An uploader for a signed-in session's server host, token, version, version
        type and machine identifier."""
        self.this = _native.new_PyPresetUploader(serverHost, token, version, versionType, uuid)

    def SetCallback(self, callback):
        """Registers the callable for reports (None unregisters); returns 1.

        It is called as callback(u"PROGRESS", u"ProgressChanged", percent,
        half_seconds_left_for_this_file) while the upload runs, and once at the end
        as callback(u"PROGRESS", u"UploadComplete", 100, success, url, error_text)."""
        return _native.PyPresetUploader_SetCallback(self, callback)

    def StartUpload(self, presetFile, images, templateKey, title, category, tags, description):
        """Starts the upload of a preset file and exactly twelve images; 1 when started.

        0 when an upload is running, the preset file or one of the first four
        images is missing, or the server host gives no upload address."""
        if len(images) != 12:
            raise ValueError("a preset carries twelve images")
        args = [presetFile] + list(images) + [templateKey, title, category, tags, description]
        return _native.PyPresetUploader_StartUpload(self, *args)

    def CancelUpload(self):
        """Asks the running upload to stop; it ends with an unsuccessful completion report."""
        return _native.PyPresetUploader_CancelUpload(self)

    def GetUploadedFileUrl(self):
        """The published preset's address from the last upload's reply; empty while one runs
        or when the reply gave none."""
        return _native.PyPresetUploader_GetUploadedFileUrl(self)


_native.PyPresetUploader_swigregister(PyPresetUploader)
