#include "device/CurlTransfer.h"

#include "device/CurlLibrary.h"
#include "device/Loader.h"
#include "foundation/File.h"
#include "foundation/Log.h"
#include "foundation/Uri.h"

#define CURL_DISABLE_DEPRECATION // CURLOPT_PUT
#include <curl/curl.h>

#include <csignal>
#include <cstdio>
#include <ctime>
#include <dlfcn.h>
#include <exception>
#include <memory>
#include <mutex>
#include <sys/stat.h>
#include <type_traits>
#include <unistd.h>
#include <utility>

namespace cimple
{

namespace
{

/// What fails without a code of libcurl.
constexpr int downloadFailed = 1;
constexpr int uploadFailed = -1;

/// Those of CurlLibrary.cpp and the folder of 64-bit libraries that some systems have.
constexpr const char* downloadLibraries[] = {"/lib/libcurl.so.4", "/usr/lib/libcurl.so.4", "/usr/lib64/libcurl.so.4",
                                             "libcurl.so", "libcurl.so.4"};
constexpr int openMode = RTLD_LAZY | RTLD_GLOBAL;

// A server that does not answer, or does not stop, must not hold a method.
constexpr long connectSeconds = 30;
constexpr long idleSeconds = 60;
constexpr long downloadSeconds = 3600;
constexpr long uploadSeconds = 100;
constexpr std::size_t maxFileSize = std::size_t{256} << 20;

/// Local files are this module's own to open: libcurl would wait at a pipe, and write through a link. A login by
/// telnet is no transfer.
constexpr long protocols = ~((1L << 10) | (1L << 6)) & 0x7FFF'FFFF; // CURLPROTO_FILE, CURLPROTO_TELNET
constexpr auto setProtocols = static_cast<CURLoption>(181);         // CURLOPT_PROTOCOLS, of which newer headers warn

/// Older libraries count the users of their global state without a lock.
constinit std::mutex globalState;

/// While it lives, a connection that its peer has closed is an error and no signal, which would end the server: told to
/// leave signals alone, libcurl does not see to that itself.
class NoPipeSignal
{
public:
    NoPipeSignal()
    {
        sigemptyset(&_pipe);
        sigaddset(&_pipe, SIGPIPE);
        sigset_t pending;
        _waits = sigpending(&pending) == 0 && sigismember(&pending, SIGPIPE) == 1;
        pthread_sigmask(SIG_BLOCK, &_pipe, &_before);
    }
    ~NoPipeSignal()
    {
        constexpr timespec now{};
        if (!_waits)
            sigtimedwait(&_pipe, nullptr, &now);
        pthread_sigmask(SIG_SETMASK, &_before, nullptr);
    }
    NoPipeSignal(const NoPipeSignal&) = delete;
    NoPipeSignal& operator=(const NoPipeSignal&) = delete;

private:
    sigset_t _pipe, _before;
    bool _waits; ///< one that is not of this transfer
};

/// libcurl, open, and its one transfer. At the end of its life both are given back, whatever came between.
class Curl
{
public:
    explicit Curl(void* library) : _library(library) {}
    ~Curl();
    Curl(const Curl&) = delete;
    Curl& operator=(const Curl&) = delete;

    void logVersion() const;
    /// False, with a log line, when there can be no transfer. The line for a library without curl_global_init is the
    /// caller's.
    bool start(const char* noGlobalInit);
    /// False, with the line, whose "%d" is the code, when libcurl does not take the option.
    template <class Value> bool set(CURLoption option, Value value, const char* refused)
    {
        _code = _setOption(_transfer, option, value);
        if (_code == CURLE_OK)
            return true;
        TVR_LOG(TVR_DBG, refused, static_cast<int>(_code));
        return false;
    }
    /// Of the last call; no success before the first.
    CURLcode code() const { return _code; }
    CURLcode perform();

private:
    /// A null pointer, with a log line, if the library does not have the function.
    template <class Function> Function* find(const char* name) const
    {
        void* found = _loader.symbol(_library, name);
        if (!found)
        {
            const char* text = _loader.error();
            TVR_LOG(TVR_DBG, "A dynamic linking error occurred:(%s)", text ? text : "");
        }
        return reinterpret_cast<Function*>(found);
    }

    const NoPipeSignal _noSignal; // to the end of the connection
    const DynamicLoader& _loader = dynamicLoaderInUse();
    void* const _library;
    bool _globalIsUp = false;
    CURL* _transfer = nullptr;
    decltype(&curl_easy_setopt) _setOption = nullptr;
    CURLcode _code = CURLE_FAILED_INIT;
};

void Curl::logVersion() const
{
    const std::lock_guard lock(globalState); // the text is one for all threads
    if (auto* const version = find<decltype(curl_version)>("curl_version"))
        if (const char* text = version())
            TVR_LOG(TVR_DBG, "Curl version = %s", text);
}

bool Curl::start(const char* noGlobalInit)
{
    auto* const globalInit = find<decltype(curl_global_init)>("curl_global_init");
    if (!globalInit)
    {
        TVR_LOG(TVR_DBG, "%s", noGlobalInit);
        return false;
    }
    {
        const std::lock_guard lock(globalState);
        _globalIsUp = globalInit(CURL_GLOBAL_DEFAULT) == CURLE_OK;
    }
    if (!_globalIsUp)
    {
        TVR_LOG(TVR_DBG, "unable to initalize curl");
        return false;
    }
    auto* const easyInit = find<decltype(curl_easy_init)>("curl_easy_init");
    if (!easyInit)
    {
        TVR_LOG(TVR_DBG, "unable to locate function curl_easy_init in curl so");
        return false;
    }
    _transfer = easyInit();
    if (!_transfer)
    {
        TVR_LOG(TVR_DBG, "ERROR: Could not initialise the curl");
        return false;
    }
    _setOption = find<std::remove_pointer_t<decltype(_setOption)>>("curl_easy_setopt");
    return _setOption != nullptr;
}

CURLcode Curl::perform()
{
    auto* const run = find<decltype(curl_easy_perform)>("curl_easy_perform");
    return _code = run ? run(_transfer) : CURLE_FAILED_INIT;
}

Curl::~Curl()
{
    if (_transfer)
    {
        if (auto* const cleanup = find<decltype(curl_easy_cleanup)>("curl_easy_cleanup"))
            cleanup(_transfer);
        else
            TVR_LOG(TVR_DBG, "unable to locate function curl_easy_cleanup in curl so");
    }
    if (_globalIsUp)
    {
        const std::lock_guard lock(globalState);
        if (auto* const cleanup = find<decltype(curl_global_cleanup)>("curl_global_cleanup"))
            cleanup();
        else
            TVR_LOG(TVR_DBG, "could not locate curl_global_cleanup in libcurl");
    }
    if (_loader.close(_library) == 0)
        TVR_LOG(TVR_DBG, "Successfully closed curl so");
    else
        TVR_LOG(TVR_DBG, "UNABLE TO CLOSE DYNAMIC LIB");
}

/// What both directions set beyond what they transfer: certificates are not checked, and an answer that is a failure,
/// or names another place, is one.
bool setCommon(Curl& curl)
{
    return curl.set(setProtocols, protocols, "Error Sending the CURLOPT_PROTOCOLS to the Curl library %d") &&
           curl.set(CURLOPT_SSL_VERIFYPEER, 0L, "Error Sending the CURLOPT_SSL_VERIFYPEER to the Curl library %d") &&
           curl.set(CURLOPT_SSL_VERIFYHOST, 0L, "Error Sending the CURLOPT_SSL_VERIFYHOST to the Curl library %d") &&
           curl.set(CURLOPT_NOSIGNAL, 1L, "Error Sending the CURLOPT_NOSIGNAL to the Curl library %d") &&
           curl.set(CURLOPT_FAILONERROR, 1L, "Error Sending the CURLOPT_FAILONERROR to the Curl library %d") &&
           curl.set(CURLOPT_FOLLOWLOCATION, 1L, "Error Sending the CURLOPT_FOLLOWLOCATION to the Curl library %d") &&
           curl.set(CURLOPT_MAXREDIRS, 0L, "Error Sending the CURLOPT_MAXREDIRS to the Curl library %d") &&
           curl.set(CURLOPT_CONNECTTIMEOUT, connectSeconds,
                    "Error Sending the CURLOPT_CONNECTTIMEOUT to the Curl library %d");
}

// --- download

void* openForDownload()
{
    for (const char* file : downloadLibraries)
    {
        TVR_LOG(TVR_DBG, "Trying to load %s", file);
        if (void* library = dynamicLoaderInUse().open(file, openMode))
            return library;
    }
    return nullptr;
}

/// The file that a download fills. It is removed again unless all of it came.
class Arriving
{
public:
    explicit Arriving(const std::string& name) : _name(name), _file(createNamedFile(name)), _isThere(_file) {}
    ~Arriving()
    {
        if (_isThere)
            unlink(_name.c_str());
    }
    Arriving(const Arriving&) = delete;
    Arriving& operator=(const Arriving&) = delete;

    explicit operator bool() const { return _isThere; }
    /// False if something of it did not reach its place.
    bool keep()
    {
        const bool isWhole = _file.close();
        _isThere = !isWhole;
        return isWhole;
    }

    /// libcurl's write function; a count other than that of the bytes ends the transfer.
    static std::size_t write(char* data, std::size_t size, std::size_t count, void* to) noexcept
    {
        auto& file = *static_cast<Arriving*>(to);
        const std::size_t bytes = size * count;
        file._size += bytes;
        return file._size <= maxFileSize && write_all(file._file.get(), data, bytes) ? bytes : 0;
    }

private:
    const std::string& _name;
    File_Descriptor _file;
    bool _isThere;
    std::size_t _size = 0;
};

bool setDownload(Curl& curl, const std::string& uri, Arriving& file, char (&errorText)[CURL_ERROR_SIZE])
{
    TVR_LOG(TVR_DBG, "Sending the URI %s to the Curl library", uriForLog(uri).c_str());
    return curl.set(CURLOPT_URL, uri.c_str(), "Error Sending the URI to the Curl library %d") &&
           curl.set(CURLOPT_WRITEFUNCTION, &Arriving::write,
                    "Error Sending the CURLOPT_WRITEFUNCTION to the Curl library %d") &&
           curl.set(CURLOPT_FILE, static_cast<void*>(&file), "Error Sending the CURLOPT_FILE to the Curl library %d") &&
           curl.set(CURLOPT_ERRORBUFFER, &errorText[0],
                    "Error Sending the CURLOPT_ERRORBUFFER to the Curl library %d") &&
           setCommon(curl) &&
           curl.set(CURLOPT_LOW_SPEED_LIMIT, 1L, "Error Sending the CURLOPT_LOW_SPEED_LIMIT to the Curl library %d") &&
           curl.set(CURLOPT_LOW_SPEED_TIME, idleSeconds,
                    "Error Sending the CURLOPT_LOW_SPEED_TIME to the Curl library %d") &&
           curl.set(CURLOPT_TIMEOUT, downloadSeconds, "Error Sending the CURLOPT_TIMEOUT to the Curl library %d");
}

int download(const std::string& uri, std::string& file)
{
    void* const library = openForDownload();
    if (!library)
    {
        TVR_LOG(TVR_ERR, "ERROR: Could not load the curl library to download from internet");
        return downloadFailed;
    }
    char errorText[CURL_ERROR_SIZE] = ""; // libcurl's for as long as it is open
    Curl curl(library);
    std::optional<std::string> name = lastPartOf(takeLogin(uri).uri);
    if (!name)
    {
        TVR_LOG(TVR_ERR, "ERROR: Could not parse the URI to get the firmware file name");
        return downloadFailed;
    }
    Arriving arriving(*name);
    if (!arriving)
    {
        TVR_LOG(TVR_DBG, "ERROR: Could not open the file for writing");
        return downloadFailed;
    }
    curl.logVersion();
    if (!curl.start("unable to locate function curl_easy_init in curl so") ||
        !setDownload(curl, uri, arriving, errorText))
        return static_cast<int>(curl.code());
    if (const CURLcode code = curl.perform(); code != CURLE_OK)
    {
        TVR_LOG(TVR_DBG, "download failed %d", static_cast<int>(code));
        return static_cast<int>(code);
    }
    if (!arriving.keep())
        return CURLE_WRITE_ERROR;
    file = std::move(*name);
    return 0;
}

// --- upload

struct CloseFile
{
    void operator()(std::FILE* file) const { std::fclose(file); }
};
using OpenFile = std::unique_ptr<std::FILE, CloseFile>;

/// libcurl reads it by itself, as C does.
OpenFile openForReading(const std::string& path)
{
    File_Descriptor descriptor = open_regular(path.c_str(), O_RDONLY);
    const int own = descriptor ? fcntl(descriptor.get(), F_DUPFD_CLOEXEC, 0) : -1;
    std::FILE* const file = own >= 0 ? fdopen(own, "rb") : nullptr;
    if (!file && own >= 0)
        close(own);
    return OpenFile(file);
}

bool setUpload(Curl& curl, const UriAndLogin& to, std::FILE* file, off_t size)
{
    if (!curl.set(CURLOPT_UPLOAD, 1L, "Error Setting CURLOPT_UPLOAD, errorcode = %d"))
        return false;
    TVR_LOG(TVR_DBG, "Successfully Set CURLOPT_UPLOAD = %d", 1);
    if (!curl.set(CURLOPT_PUT, 1L, "Error setting the CURLOPT_PUT,error code %d") ||
        !curl.set(CURLOPT_URL, to.uri.c_str(), "Error setting the CURLOPT_URL,error code %d") ||
        !curl.set(CURLOPT_READDATA, static_cast<void*>(file), "Error setting the CURLOPT_READDATA,error code %d") ||
        !curl.set(CURLOPT_TIMEOUT, uploadSeconds, "Error setting the CURLOPT_TIMEOUT,error code %d"))
        return false;
    TVR_LOG(TVR_DBG, "iFileSize size:: %ld", static_cast<long>(size));
    return curl.set(CURLOPT_INFILESIZE, static_cast<long>(size),
                    "Error setting the CURLOPT_INFILESIZE,error code %d") &&
           curl.set(CURLOPT_INFILESIZE_LARGE, static_cast<curl_off_t>(size),
                    "Error setting the CURLOPT_INFILESIZE_LARGE,error code %d") &&
           setCommon(curl) &&
           (!to.login ||
            (curl.set(CURLOPT_USERPWD, to.login->c_str(), "Error setting the CURLOPT_USERPWD,error code %d") &&
             curl.set(CURLOPT_HTTPAUTH, static_cast<long>(CURLAUTH_BASIC),
                      "Error setting the CURLOPT_HTTPAUTH,error code %d")));
}

int upload(const std::string& uri, const std::string& path)
{
    struct stat status;
    if (const int missing = stat(path.c_str(), &status); missing != 0)
        return missing;
    const UriAndLogin to = takeLogin(uri);
    TVR_LOG(TVR_DBG, "Searching for /lib Curl on the machine");
    void* const library = openCurl(openMode);
    if (!library)
    {
        TVR_LOG(TVR_DBG, "ERROR: Could not load the curl library ");
        TVR_LOG(TVR_DBG, "couldnot initialize curl library");
        return uploadFailed;
    }
    OpenFile file;
    Curl curl(library);
    if (!curl.start("unable to locate function curl_global_init in curl so"))
    {
        TVR_LOG(TVR_DBG, "couldnot initialize curl library");
        return uploadFailed;
    }
    file = openForReading(path);
    if (!file || fstat(fileno(file.get()), &status) != 0)
    {
        TVR_LOG(TVR_DBG, "couldnot locate the file %s, to be uploaded", path.c_str());
        return uploadFailed;
    }
    if (!setUpload(curl, to, file.get(), status.st_size))
        return static_cast<int>(curl.code());
    if (const CURLcode code = curl.perform(); code != CURLE_OK)
    {
        TVR_LOG(TVR_DBG, "curl upload file failed, errorcode %d", static_cast<int>(code));
        return static_cast<int>(code);
    }
    return 0;
}

} // namespace

int downloadFileUsingCurl(const std::string& uri, std::string& file)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::downloadFileUsingCurl: %s", uriForLog(uri).c_str());
    const std::string path = localPathOf(uri);
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::Firmware file path: %s", uriForLog(path).c_str());
    struct stat status;
    if (stat(path.c_str(), &status) == 0)
    {
        TVR_LOG(TVR_DBG, "File found in local file system.");
        file = path;
        return 0;
    }
    TVR_LOG(TVR_INFO, "File not found on local file system. Trying libcURL...");
    return download(uri, file);
}
catch (const std::exception&)
{
    TVR_LOG(TVR_DBG, "ERROR: error caught in accessing Curl Library");
    return downloadFailed;
}

int uploadFileUsingCurl(const std::string& uri, const std::string& file)
try
{
    TVR_LOG(TVR_DBG, "Inside TVR_MethodWrapper::uploadFileUsingCurl");
    return upload(uri, file);
}
catch (const std::exception&)
{
    TVR_LOG(TVR_DBG, "ERROR: error caught in accessing Curl Library");
    return uploadFailed;
}

} // namespace cimple
