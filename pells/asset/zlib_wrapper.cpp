#include "pells/asset/zlib_wrapper.h"

#include <exception>
#include <sstream>

#include "pells/core/class_name.h"
#include "pells/log/log.h"

namespace pells {

namespace {

struct CodeName {
    int code;
    const char* name;
};

const char* codeName(int code) {
    static constexpr CodeName names[] = {
        {Z_OK, "Z_OK"},
        {Z_STREAM_END, "Z_STREAM_END"},
        {Z_NEED_DICT, "Z_NEED_DICT"},
        {Z_ERRNO, "Z_ERRNO"},
        {Z_STREAM_ERROR, "Z_STREAM_ERROR"},
        {Z_DATA_ERROR, "Z_DATA_ERROR"},
        {Z_MEM_ERROR, "Z_MEM_ERROR"},
        {Z_BUF_ERROR, "Z_BUF_ERROR"},
        {Z_VERSION_ERROR, "Z_VERSION_ERROR"},
    };
    for (const CodeName& each : names) {
        if (each.code == code)
            return each.name;
    }
    return "unknown";
}

}  // namespace

ZlibWrapper::ZlibError::ZlibError(const std::string& message) : std::runtime_error(message) {}

ZlibWrapper::ZlibError::~ZlibError() = default;

ZlibWrapper::ZlibWrapper(alloc_func allocate, free_func release, voidpf allocatorData)
    : z_stream_s() {
    zalloc = allocate;
    zfree = release;
    opaque = allocatorData;
}

ZlibWrapper::~ZlibWrapper() noexcept(false) = default;

void ZlibWrapper::check(const std::string& what, int result, int ok1, int ok2) const {
    if (result == ok1 || result == ok2)
        return;
    const std::string message = getMessage(what, result);
    PELLS_LOG("error", message);
    throw ZlibError(message);
}

std::string ZlibWrapper::getMessage(const std::string& what, int code) const {
    std::ostringstream message;
    message << className(typeid(*this)) << "::" << what << ": " << codeName(code) << " (" << code
            << ')';
    if (msg)
        message << ": " << msg;
    return message.str();
}

ZlibInflater::ZlibInflater(Bytef* input, uInt available, int windowBits, alloc_func allocate,
                           free_func release, voidpf allocatorData)
    : ZlibWrapper(allocate, release, allocatorData) {
    next_in = input;
    avail_in = available;
    check("ZlibInflater(" + std::to_string(windowBits) + ')', inflateInit2(this, windowBits), Z_OK,
          Z_OK);
}

ZlibInflater::~ZlibInflater() noexcept(false) {
    const int result = inflateEnd(this);
    if (std::uncaught_exceptions() == 0) {
        check("~ZlibInflater()", result, Z_OK, Z_OK);
        return;
    }
    try {
        check("~ZlibInflater()", result, Z_OK, Z_OK);
    } catch (...) {
        // Logged by then; a second exception on its way would end the process.
    }
}

}  // namespace pells
