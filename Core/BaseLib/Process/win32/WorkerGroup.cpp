#include "Core/BaseLib/Process/WorkerGroup.h"

#include "Core/BaseLib/Files/win32/WindowsText.h"
#include "Core/BaseLib/Log/FormatText.h"
#include "Core/BaseLib/Process/FaultGuard.h"
#include "Core/BaseLib/Process/win32/WorkerPipe.h"

#include <QDeadlineTimer>
#include <QDir>
#include <QRegularExpression>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cwchar>
#include <map>
#include <vector>

#include <psapi.h>

namespace {

constexpr int kMaxOutput = 2000; ///< bytes that are kept of what a worker prints
/// How often a worker's end is looked for: others may hold its pipes open.
constexpr int kLook = 50; // ms
/// The same while a worker's channel is closed, which is mostly the first sign of its end.
constexpr int kNearEnd = 2; // ms
/// What a worker that has closed its channel gets to end by itself: its own exit status says more than ours.
constexpr int kGrace = 500; // ms
/// What an ended worker's last bytes get to arrive. Others may hold its pipes open and write on.
constexpr int kLastBytes = 200; // ms
/// What an ended process gets to be gone: a driver may hold it.
constexpr DWORD kPatience = 2000; // ms
/// The status of a worker that we end: the one that the system gives to what is being ended from outside.
constexpr UINT kEndedByUs = 0xC000010A;

struct Worker {
    explicit Worker(HANDLE port)
        : job(CreateJobObjectW(nullptr, nullptr))
        , channel(WorkerPipe::Direction::Both, port)
        , printed(WorkerPipe::Direction::FromWorker, port)
    {}

    /// Ends with its last handle, which is ours: nothing in it outlives this process.
    WindowsHandle job;
    std::optional<WindowsHandle> process;
    WorkerPipe channel;
    WorkerPipe printed;
    QByteArray output;
    QDeadlineTimer grace{QDeadlineTimer::Forever}; ///< it ends by itself until then
};

/// As the C run-time library of a program takes it apart.
QString quoted(QString argument)
{
    static const QRegularExpression beforeQuote(QStringLiteral(R"x((\\*)")x"));
    static const QRegularExpression atEnd(QStringLiteral(R"((\\+)$)"));
    argument.replace(beforeQuote, QStringLiteral(R"(\1\1\")")).replace(atEnd, QStringLiteral(R"(\1\1)"));
    return QLatin1Char('"') + argument + QLatin1Char('"');
}

/// This process's variables, without an entry that made it a worker itself, and with one for the new worker:
/// the value of its handle. A command line would show to everybody what only the heir can make use of.
std::wstring environmentWith(HANDLE channel)
{
    const std::wstring name = QString::fromLatin1(WorkerChannel::kVariable).toStdWString() + L'=';
    std::wstring block = name + std::to_wstring(reinterpret_cast<quintptr>(channel)) + L'\0';
    wchar_t *own = GetEnvironmentStringsW();
    for (const wchar_t *entry = own; entry && *entry; entry += std::wcslen(entry) + 1)
        if (std::wcsncmp(entry, name.c_str(), name.size()) != 0)
            block.append(entry, std::wcslen(entry) + 1);
    FreeEnvironmentStringsW(own);
    return block + L'\0';
}

/// Start information that lets a new process inherit certain handles and no others.
class InheritedHandles {
public:
    InheritedHandles(HANDLE input, HANDLE output, HANDLE channel)
        : m_handles{input, output, channel}
    {
        SIZE_T size = 0;
        InitializeProcThreadAttributeList(nullptr, 1, 0, &size);
        m_list.resize(size);
        m_start.StartupInfo.cb = sizeof m_start;
        m_start.StartupInfo.dwFlags = STARTF_USESTDHANDLES;
        m_start.StartupInfo.hStdInput = input;
        m_start.StartupInfo.hStdOutput = output;
        m_start.StartupInfo.hStdError = output;
        m_start.lpAttributeList = reinterpret_cast<LPPROC_THREAD_ATTRIBUTE_LIST>(m_list.data());
        InitializeProcThreadAttributeList(m_start.lpAttributeList, 1, 0, &size);
        m_isValid = UpdateProcThreadAttribute(m_start.lpAttributeList, 0, PROC_THREAD_ATTRIBUTE_HANDLE_LIST,
                                              m_handles.data(), sizeof m_handles, nullptr, nullptr);
    }
    ~InheritedHandles() { DeleteProcThreadAttributeList(m_start.lpAttributeList); }
    InheritedHandles(const InheritedHandles &) = delete;
    InheritedHandles &operator=(const InheritedHandles &) = delete;

    bool isValid() const { return m_isValid; }
    STARTUPINFOW *startupInfo() { return &m_start.StartupInfo; }

private:
    std::array<HANDLE, 3> m_handles;
    std::vector<std::byte> m_list;
    STARTUPINFOEXW m_start = {};
    bool m_isValid = false;
};

/// A new process inherits it: no box waits for a user who sees none.
class QuietErrorMode {
public:
    QuietErrorMode()
        : m_before(GetErrorMode())
    {
        SetErrorMode(m_before | SEM_FAILCRITICALERRORS | SEM_NOGPFAULTERRORBOX | SEM_NOOPENFILEERRORBOX);
    }
    ~QuietErrorMode() { SetErrorMode(m_before); }
    QuietErrorMode(const QuietErrorMode &) = delete;
    QuietErrorMode &operator=(const QuietErrorMode &) = delete;

private:
    const UINT m_before;
};

bool setUpJob(HANDLE job)
{
    JOBOBJECT_EXTENDED_LIMIT_INFORMATION limits = {};
    limits.BasicLimitInformation.LimitFlags =
        JOB_OBJECT_LIMIT_KILL_ON_JOB_CLOSE | JOB_OBJECT_LIMIT_DIE_ON_UNHANDLED_EXCEPTION;
    return SetInformationJobObject(job, JobObjectExtendedLimitInformation, &limits, sizeof limits);
}

/// False with the system's last error. The process begins to run when it is in its job.
bool startProcess(Worker &worker, const std::wstring &program, std::wstring commandLine)
{
    SECURITY_ATTRIBUTES inheritable = {sizeof inheritable, nullptr, TRUE};
    const WindowsHandle input(CreateFileW(L"NUL", GENERIC_READ, FILE_SHARE_READ | FILE_SHARE_WRITE,
                                          &inheritable, OPEN_EXISTING, 0, nullptr));
    const WindowsHandle output(worker.printed.openOtherEnd());
    const WindowsHandle channel(worker.channel.openOtherEnd());
    if (!input.isValid() || !output.isValid() || !channel.isValid() || !setUpJob(worker.job.get()))
        return false;
    InheritedHandles inherited(input.get(), output.get(), channel.get());
    std::wstring environment = environmentWith(channel.get());
    const QuietErrorMode quiet;
    // NOTE: without a console, also a hidden one. Wine runs that in a process which inherits the channel and
    // would keep it open when the worker has closed it.
    PROCESS_INFORMATION process = {};
    if (!inherited.isValid() ||
        !CreateProcessW(program.c_str(), commandLine.data(), nullptr, nullptr, TRUE,
                        CREATE_SUSPENDED | DETACHED_PROCESS | CREATE_UNICODE_ENVIRONMENT |
                            EXTENDED_STARTUPINFO_PRESENT,
                        environment.data(), nullptr, inherited.startupInfo(), &process))
        return false;
    worker.process.emplace(process.hProcess);
    const WindowsHandle thread(process.hThread);
    if (AssignProcessToJobObject(worker.job.get(), process.hProcess) &&
        ResumeThread(thread.get()) != static_cast<DWORD>(-1))
        return true;
    const DWORD error = GetLastError();
    TerminateProcess(process.hProcess, kEndedByUs);
    SetLastError(error);
    return false;
}

/// The status of a crash in words; empty for one that is not known here.
QString nameOf(DWORD status)
{
    switch (status) {
    case 0x80000003:
        return QStringLiteral("breakpoint");
    case 0xC0000374:
        return QStringLiteral("heap corruption");
    case 0xC0000409:
        return QStringLiteral("failed security check");
    case 0xE06D7363:
        return QStringLiteral("unhandled C++ exception");
    case kEndedByUs:
        return QStringLiteral("ended from outside");
    default:
        return FaultCode::name(status);
    }
}

/// 0 when the system does not tell.
qint64 workingSet(HANDLE process)
{
    PROCESS_MEMORY_COUNTERS memory = {};
    return K32GetProcessMemoryInfo(process, &memory, sizeof memory)
               ? static_cast<qint64>(memory.WorkingSetSize)
               : 0;
}

WorkerEnd endOf(HANDLE process)
{
    DWORD status = 0;
    GetExitCodeProcess(process, &status);
    WorkerEnd end;
    end.code = static_cast<int>(status);
    const QString name = nameOf(status);
    // A status of the kind "error"; the bit that is always clear in one tells it from a negative exit code.
    end.crashed = (status & 0xD0000000) == 0xC0000000 || !name.isEmpty();
    if (end.crashed)
        end.text = formatText(L"%ls (0x%08lX)", name.isEmpty() ? QStringLiteral("exception") : name, status);
    return end;
}

} // namespace

struct WorkerGroup::Private {
    std::wstring program;
    std::wstring commandLine;
    WindowsHandle port{CreateIoCompletionPort(INVALID_HANDLE_VALUE, nullptr, 0, 1)};
    std::map<int, Worker> workers;
    std::map<int, QString> outputs; ///< of those that have ended
    int last = 0;

    /// Waits for a packet, which says no more than that something came.
    void waitForPacket(int milliseconds) const
    {
        DWORD count = 0;
        ULONG_PTR key = 0;
        OVERLAPPED *operation = nullptr;
        GetQueuedCompletionStatus(port.get(), &count, &key, &operation, static_cast<DWORD>(milliseconds));
    }
    void take(int number, Worker &worker, std::vector<WorkerEvent> &events);
    bool reap(int number, Worker &worker, std::vector<WorkerEvent> &events);
};

WorkerGroup::WorkerGroup(const QString &program, const QStringList &arguments)
    : m_private(std::make_unique<Private>())
{
    QStringList words{quoted(QDir::toNativeSeparators(program))};
    for (const QString &argument : arguments)
        words.append(quoted(argument));
    m_private->program = nativePath(program);
    m_private->commandLine = words.join(QLatin1Char(' ')).toStdWString();
}

WorkerGroup::~WorkerGroup()
{
    for (auto &entry : m_private->workers)
        TerminateJobObject(entry.second.job.get(), kEndedByUs);
    for (auto &entry : m_private->workers)
        WaitForSingleObject(entry.second.process->get(), kPatience);
}

std::optional<int> WorkerGroup::start(QString &reason)
{
    const int number = ++m_private->last;
    Worker &worker = m_private->workers.try_emplace(number, m_private->port.get()).first->second;
    if (!startProcess(worker, m_private->program, m_private->commandLine)) {
        reason = systemMessage(GetLastError(), QString::fromStdWString(m_private->program));
        m_private->workers.erase(number);
        return std::nullopt;
    }
    worker.channel.begin();
    worker.printed.begin();
    return number;
}

bool WorkerGroup::send(int worker, const QByteArray &bytes)
{
    const auto found = m_private->workers.find(worker);
    if (found == m_private->workers.end() || !found->second.channel.isOpen())
        return false;
    found->second.channel.send(bytes);
    return true;
}

/// Takes in what came from a worker.
void WorkerGroup::Private::take(int number, Worker &worker, std::vector<WorkerEvent> &events)
{
    worker.output = (worker.output + worker.printed.take()).right(kMaxOutput);
    if (const QByteArray bytes = worker.channel.take(); !bytes.isEmpty())
        events.push_back({number, bytes, std::nullopt});
    if (!worker.channel.isOpen() && worker.grace.isForever())
        worker.grace.setRemainingTime(kGrace); // nothing can come from it any more
    if (worker.grace.hasExpired())
        TerminateJobObject(worker.job.get(), kEndedByUs);
}

/// Takes in a worker's end, if it has come.
bool WorkerGroup::Private::reap(int number, Worker &worker, std::vector<WorkerEvent> &events)
{
    if (WaitForSingleObject(worker.process->get(), 0) != WAIT_OBJECT_0)
        return false;
    TerminateJobObject(worker.job.get(), kEndedByUs); // what it started
    const QDeadlineTimer patience(kLastBytes);
    take(number, worker, events);
    while ((worker.channel.isOpen() || worker.printed.isOpen()) && !patience.hasExpired()) {
        waitForPacket(1);
        take(number, worker, events);
    }
    outputs[number] = QString::fromLocal8Bit(worker.output).trimmed();
    events.push_back({number, QByteArray(), endOf(worker.process->get())});
    return true;
}

std::vector<WorkerEvent> WorkerGroup::wait(std::chrono::milliseconds timeout)
{
    const QDeadlineTimer deadline(timeout);
    std::vector<WorkerEvent> events;
    while (true) {
        for (auto each = m_private->workers.begin(); each != m_private->workers.end();) {
            m_private->take(each->first, each->second, events);
            each = m_private->reap(each->first, each->second, events) ? m_private->workers.erase(each)
                                                                      : std::next(each);
        }
        if (!events.empty() || deadline.hasExpired())
            return events;
        const bool isNearEnd = std::any_of(m_private->workers.begin(), m_private->workers.end(),
                                           [](const auto &entry) { return !entry.second.channel.isOpen(); });
        const qint64 look = isNearEnd ? kNearEnd : kLook;
        m_private->waitForPacket(static_cast<int>(std::min(deadline.remainingTime(), look)));
    }
}

void WorkerGroup::end(int worker)
{
    if (const auto found = m_private->workers.find(worker); found != m_private->workers.end())
        TerminateJobObject(found->second.job.get(), kEndedByUs);
}

QString WorkerGroup::output(int worker) const
{
    const auto ended = m_private->outputs.find(worker);
    return ended == m_private->outputs.end() ? QString() : ended->second;
}

WorkerUse WorkerGroup::use(int worker)
{
    const auto found = m_private->workers.find(worker);
    if (found == m_private->workers.end())
        return {};
    constexpr std::size_t kMost = 300;
    std::vector<ULONG_PTR> space(kMost);
    auto *const list = reinterpret_cast<JOBOBJECT_BASIC_PROCESS_ID_LIST *>(space.data());
    if (!QueryInformationJobObject(found->second.job.get(), JobObjectBasicProcessIdList, list,
                                   static_cast<DWORD>(space.size() * sizeof space[0]), nullptr) &&
        GetLastError() != ERROR_MORE_DATA)
        return {0, workingSet(found->second.process->get())};
    WorkerUse use;
    use.children = std::max(0, static_cast<int>(list->NumberOfProcessIdsInList) - 1);
    for (DWORD each = 0; each < list->NumberOfProcessIdsInList; ++each)
        use.memory +=
            workingSet(WindowsHandle(OpenProcess(PROCESS_QUERY_LIMITED_INFORMATION | PROCESS_VM_READ, FALSE,
                                                 static_cast<DWORD>(list->ProcessIdList[each])))
                           .get());
    return use;
}
