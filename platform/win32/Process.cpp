// Child processes on Windows.
#include "platform/Process.h"

#include <algorithm>
#include <atomic>
#include <mutex>
#include <system_error>

#include <windows.h>

namespace kyv {
namespace {

constexpr DWORD kPipeBytes = 1 << 20;
constexpr size_t kPieceBytes = 1 << 20; // of one read or write

[[noreturn]] void Fail(const std::string& what) {
    throw std::system_error(static_cast<int>(GetLastError()), std::system_category(), what);
}

std::wstring Wide(const std::string& text) {
    return std::filesystem::path(std::u8string(text.begin(), text.end())).native();
}

class CHandle {
public:
    CHandle() = default;
    explicit CHandle(HANDLE handle) : m_handle(handle) {}
    ~CHandle() { Close(); }
    CHandle(const CHandle&) = delete;
    CHandle& operator=(CHandle&& other) noexcept {
        std::swap(m_handle, other.m_handle);
        return *this;
    }

    HANDLE Get() const { return m_handle; }
    void Close() {
        if (m_handle != INVALID_HANDLE_VALUE && m_handle) {
            CloseHandle(m_handle);
        }
        m_handle = INVALID_HANDLE_VALUE;
    }

private:
    HANDLE m_handle = INVALID_HANDLE_VALUE;
};

// One command line from which the usual argument rules restore the list: quotes round everything,
// backslashes doubled where a quote follows.
std::wstring Quote(const std::wstring& argument) {
    std::wstring quoted = L"\"";
    size_t backslashes = 0;
    for (const wchar_t unit : argument) {
        if (unit == L'\\') {
            ++backslashes;
            continue;
        }
        quoted.append(unit == L'"' ? 2 * backslashes + 1 : backslashes, L'\\');
        backslashes = 0;
        quoted += unit;
    }
    quoted.append(2 * backslashes, L'\\');
    return quoted + L'"';
}

// Our end of a stream. What is read or written is waited for together with the child's end, which
// takes a pipe with a name: those without do not know such operations.
struct Stream {
    CHandle pipe;
    CHandle done; // the event of the operation under way
};

// The child's end is inheritable, ours is not.
void Connect(ChildStream kind, DWORD standard, Stream& ours, CHandle& theirs) {
    const bool isInput = standard == STD_INPUT_HANDLE;
    SECURITY_ATTRIBUTES inherit = {sizeof inherit, nullptr, TRUE};
    if (kind == ChildStream::Own) {
        HANDLE same = nullptr;
        if (!DuplicateHandle(GetCurrentProcess(), GetStdHandle(standard), GetCurrentProcess(),
                             &same, 0, TRUE, DUPLICATE_SAME_ACCESS)) {
            Fail("standard stream");
        }
        theirs = CHandle(same);
        return;
    }
    std::wstring name = L"NUL";
    if (kind == ChildStream::Pipe) {
        static std::atomic<uint32_t> pipes;
        name = L"\\\\.\\pipe\\kyv-" + std::to_wstring(GetCurrentProcessId()) + L'-' +
               std::to_wstring(++pipes);
        ours.pipe = CHandle(CreateNamedPipeW(
            name.c_str(),
            (isInput ? PIPE_ACCESS_OUTBOUND : PIPE_ACCESS_INBOUND) | FILE_FLAG_OVERLAPPED |
                FILE_FLAG_FIRST_PIPE_INSTANCE,
            PIPE_TYPE_BYTE | PIPE_REJECT_REMOTE_CLIENTS, 1, kPipeBytes, kPipeBytes, 0, nullptr));
        ours.done = CHandle(CreateEventW(nullptr, TRUE, FALSE, nullptr));
        if (ours.pipe.Get() == INVALID_HANDLE_VALUE || !ours.done.Get()) {
            Fail("pipe");
        }
    }
    theirs = CHandle(CreateFileW(name.c_str(), isInput ? GENERIC_READ : GENERIC_WRITE,
                                 FILE_SHARE_READ | FILE_SHARE_WRITE, &inherit, OPEN_EXISTING, 0,
                                 nullptr));
    if (theirs.Get() == INVALID_HANDLE_VALUE) {
        Fail("pipe");
    }
}

} // namespace

struct CProcess::State {
    CHandle child;
    Stream input, output, error;

    // Reads or writes once, as the operation says. The bytes moved: 0 when the other side has
    // closed the stream, and when the child has ended and the operation still cannot go on.
    template <class Operation>
    DWORD Transfer(const Stream& stream, Operation operation) const {
        OVERLAPPED transfer = {};
        transfer.hEvent = stream.done.Get();
        if (!operation(stream.pipe.Get(), &transfer) && GetLastError() != ERROR_IO_PENDING) {
            return 0;
        }
        const HANDLE either[] = {transfer.hEvent, child.Get()}; // the first that is set decides
        if (WaitForMultipleObjects(2, either, FALSE, INFINITE) != WAIT_OBJECT_0) {
            CancelIoEx(stream.pipe.Get(), &transfer);
        }
        DWORD count = 0;
        return GetOverlappedResult(stream.pipe.Get(), &transfer, &count, TRUE) ? count : 0;
    }

    size_t Read(const Stream& from, void* buffer, size_t size) const {
        const auto wanted = static_cast<DWORD>(std::min(size, kPieceBytes));
        return Transfer(from, [=](HANDLE pipe, OVERLAPPED* transfer) {
            return ReadFile(pipe, buffer, wanted, nullptr, transfer);
        });
    }
};

std::filesystem::path ExecutableFile() {
    std::wstring name(32768, L'\0');
    name.resize(GetModuleFileNameW(nullptr, name.data(), static_cast<DWORD>(name.size())));
    return name;
}

CProcess::CProcess(const std::string& program, const std::vector<std::string>& arguments,
                   ChildStream input, ChildStream output, ChildStream error)
    : m_pState(std::make_unique<State>()) {
    // While a child's ends are inheritable no other start may run: its child would hold them open.
    static std::mutex starting;
    const std::lock_guard lock(starting);

    CHandle childInput, childOutput, childError;
    Connect(input, STD_INPUT_HANDLE, m_pState->input, childInput);
    Connect(output, STD_OUTPUT_HANDLE, m_pState->output, childOutput);
    Connect(error, STD_ERROR_HANDLE, m_pState->error, childError);

    STARTUPINFOW startup = {};
    startup.cb = sizeof startup;
    startup.dwFlags = STARTF_USESTDHANDLES;
    startup.hStdInput = childInput.Get();
    startup.hStdOutput = childOutput.Get();
    startup.hStdError = childError.Get();

    std::wstring commandLine = Quote(Wide(program));
    for (const std::string& argument : arguments) {
        commandLine += L' ' + Quote(Wide(argument));
    }
    PROCESS_INFORMATION info = {};
    if (!CreateProcessW(nullptr, commandLine.data(), nullptr, nullptr, TRUE,
                        CREATE_NEW_PROCESS_GROUP, nullptr, nullptr, &startup, &info)) {
        Fail(program);
    }
    CloseHandle(info.hThread);
    m_pState->child = CHandle(info.hProcess);
}

CProcess::~CProcess() {
    Kill();
    Wait();
}

size_t CProcess::ReadOutput(void* buffer, size_t size) {
    return m_pState->Read(m_pState->output, buffer, size);
}

size_t CProcess::ReadError(void* buffer, size_t size) {
    return m_pState->Read(m_pState->error, buffer, size);
}

bool CProcess::WriteInput(const void* data, size_t size) {
    const char* next = static_cast<const char*>(data);
    while (size > 0) {
        const auto wanted = static_cast<DWORD>(std::min(size, kPieceBytes));
        const DWORD count =
            m_pState->Transfer(m_pState->input, [=](HANDLE pipe, OVERLAPPED* transfer) {
                return WriteFile(pipe, next, wanted, nullptr, transfer);
            });
        if (count == 0) {
            return false;
        }
        next += count;
        size -= count;
    }
    return true;
}

void CProcess::CloseInput() {
    m_pState->input.pipe.Close();
}

void CProcess::Kill() {
    TerminateProcess(m_pState->child.Get(), 128);
}

int CProcess::Wait() {
    DWORD status = 0;
    WaitForSingleObject(m_pState->child.Get(), INFINITE);
    GetExitCodeProcess(m_pState->child.Get(), &status);
    return static_cast<int>(status);
}

} // namespace kyv
