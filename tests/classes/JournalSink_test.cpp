// What VXLog::JournalSink sends: to a socket of the test in the place of the journal's, and to systemd-journald.

#include "VXLog/JournalSink.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <pthread.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <map>
#include <optional>
#include <set>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "VXLog/RecordSink.h"
#include "VXLog/VXLogger.h"
#include "support/AllocationFailure.h"

namespace {

const char* const socketPath = "/run/systemd/journal/socket";

void writeFile(const char* path, const std::string& text)
{
    std::ofstream(path) << text;
}

// Gives this process a /run and a /var/log of its own; from then on it sees no journal but its own. Returns why the
// system refuses it, or "".
std::string separate()
{
    const auto ids = [](const char* path, unsigned int id) {
        writeFile(path, "0 " + std::to_string(id) + " 1");
    };
    const unsigned int user = geteuid();
    const unsigned int group = getegid();
    if (unshare(CLONE_NEWUSER | CLONE_NEWNS) == 0) {
        writeFile("/proc/self/setgroups", "deny");
        ids("/proc/self/uid_map", user);
        ids("/proc/self/gid_map", group);
    } else if (unshare(CLONE_NEWNS)
               != 0) {  // with the threads of a sanitizer only this is possible, and only as root
        return std::string("no mount namespace: ") + std::strerror(errno);
    }
    if (mount("none", "/", "none", MS_REC | MS_PRIVATE, nullptr) != 0
        || mount("tmpfs", "/run", "tmpfs", 0, nullptr) != 0
        || mount("tmpfs", "/var/log", "tmpfs", 0, nullptr) != 0)
        return std::string("no mounts: ") + std::strerror(errno);
    std::filesystem::create_directories("/run/systemd/journal");
    return "";
}

const std::string& whyNotSeparate()
{
    static const std::string why = separate();
    return why;
}

using Entry = std::map<std::string, std::string>;

// The entries in the journal's native form: lines NAME=VALUE, or NAME, the size of the value in 64 bits, little-endian,
// the value; an empty line ends an entry.
std::vector<Entry> entriesIn(const std::string& text)
{
    std::vector<Entry> entries(1);
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t end = text.find('\n', at);
        if (end == std::string::npos)
            throw std::runtime_error("a line without its end");
        const std::string line = text.substr(at, end - at);
        at = end + 1;
        if (line.empty()) {
            entries.emplace_back();
            continue;
        }
        const std::size_t sign = line.find('=');
        std::string value = sign != std::string::npos ? line.substr(sign + 1) : "";
        if (sign == std::string::npos) {
            std::uint64_t size = 0;
            for (std::size_t i = 0; i < 8; ++i)
                size |= std::uint64_t {static_cast<unsigned char>(text.at(at + i))} << (8 * i);
            value = text.substr(at + 8, size);
            at += 8 + size;
            if (text.at(at) != '\n')
                throw std::runtime_error("a value without its end");
            ++at;
        }
        if (!entries.back().emplace(line.substr(0, sign), value).second)
            throw std::runtime_error("a field twice: " + line);
    }
    if (entries.back().empty())
        entries.pop_back();
    return entries;
}

// The socket of a journal.
class Journal {
public:
    Journal()
    {
        unlink(socketPath);
        sockaddr_un address {};
        address.sun_family = AF_UNIX;
        std::strcpy(address.sun_path, socketPath);
        if (bind(socket_, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0)
            throw std::runtime_error(std::strerror(errno));
    }
    ~Journal() { close(socket_); }
    Journal(const Journal&) = delete;
    Journal& operator=(const Journal&) = delete;

    // The entry of the next datagram, which may be a descriptor of a file with the entry; nothing if none comes.
    std::optional<Entry> next() const
    {
        pollfd waiting {socket_, POLLIN, 0};
        if (poll(&waiting, 1, 0) != 1)
            return std::nullopt;
        std::string text(std::size_t {1} << 18, '\0');
        alignas(cmsghdr) char control[CMSG_SPACE(sizeof(int))] = {};
        iovec part {text.data(), text.size()};
        msghdr message {};
        message.msg_iov = &part;
        message.msg_iovlen = 1;
        message.msg_control = control;
        message.msg_controllen = sizeof control;
        const ssize_t size = recvmsg(socket_, &message, MSG_CMSG_CLOEXEC);
        if (size < 0 || (message.msg_flags & (MSG_TRUNC | MSG_CTRUNC)) != 0)
            throw std::runtime_error("no whole datagram");
        text.resize(static_cast<std::size_t>(size));
        if (const cmsghdr* header = CMSG_FIRSTHDR(&message)) {
            EXPECT_EQ(text, "");
            int file = -1;
            std::memcpy(&file, CMSG_DATA(header), sizeof file);
            text = contentOf(file);
        }
        const auto entries = entriesIn(text);
        if (entries.size() != 1)
            throw std::runtime_error("not one entry");
        return entries.front();
    }

private:
    static std::string contentOf(int file)
    {
        struct stat status { };
        fstat(file, &status);
        std::string text(static_cast<std::size_t>(status.st_size), '\0');
        std::size_t done = 0;
        for (ssize_t read = 1; read > 0 && done < text.size(); done += static_cast<std::size_t>(read))
            read = pread(file, text.data() + done, text.size() - done, static_cast<off_t>(done));
        close(file);
        return text;
    }

    int socket_ = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
};

class JournalSink : public testing::Test {
protected:
    void SetUp() override
    {
        if (!whyNotSeparate().empty())
            GTEST_SKIP() << whyNotSeparate();
        before_ = VXLog::setRecordSink(VXLog::JournalSink("agent"));
    }
    void TearDown() override
    {
        unlink(socketPath);
        if (before_)
            VXLog::setRecordSink(before_);
    }

    static void log(const std::string& message, int level = 6000)
    {
        VXLog::VXLogger::logLevelMessage("work", "Worker", 12, "Some.Category", level, nullptr, 0, 0,
                                         message);
    }

    // Not inline: g++'s AddressSanitizer reports a cancelled thread whose outermost function has objects.
    [[gnu::noinline]] static void logText() { log("text"); }

    static void trace(const std::string& message)
    {
        VXLog::VXLogger::traceLevelMessage("work", "Worker", 12, "Some.Category", 6000, nullptr, 0, 0,
                                           message);
    }

    // What `write` writes to standard error, without the time.
    template <class Write>
    static std::string standardError(Write write)
    {
        testing::internal::CaptureStderr();
        write();
        const std::string text = testing::internal::GetCapturedStderr();
        return text.substr(std::min(text.find(' '), text.size()));
    }

private:
    VXLog::RecordSink before_;
};

TEST_F(JournalSink, SendsEachRecordWithItsFieldsAndNoOthers)
{
    const Journal journal;
    log("no such fan");
    EXPECT_EQ(journal.next(),
              (Entry {{"MESSAGE", "no such fan"},
                      {"PRIORITY", "3"},
                      {"CODE_FILE", "Worker"},
                      {"CODE_LINE", "12"},
                      {"CODE_FUNC", "work"},
                      {"SYSLOG_IDENTIFIER", "agent"},
                      {"VXLOG_CATEGORY", "Some.Category"},
                      {"VXLOG_LEVEL", "6000"}}));
    EXPECT_EQ(journal.next(), std::nullopt);
}

TEST_F(JournalSink, GivesLevel6000AndAbovePriority3AndTraceRecordsPriority7)
{
    const struct {
        int level;
        const char* priority;
    } rows[] = {{-1, "6"}, {0, "6"}, {3000, "6"}, {5999, "6"}, {6000, "3"}, {6001, "3"}, {2147483647, "3"}};
    const Journal journal;
    for (const auto& row : rows) {
        SCOPED_TRACE(row.level);
        log("text", row.level);
        const auto entry = journal.next();
        ASSERT_TRUE(entry);
        EXPECT_EQ(entry->at("PRIORITY"), row.priority);
        EXPECT_EQ(entry->at("VXLOG_LEVEL"), std::to_string(row.level));
    }
    trace("text");
    const auto entry = journal.next();
    ASSERT_TRUE(entry);
    EXPECT_EQ(entry->at("PRIORITY"), "7");
    EXPECT_EQ(entry->at("VXLOG_LEVEL"), "6000");
}

TEST_F(JournalSink, NamesTheProgramUnlessItIsGivenAnIdentifier)
{
    const Journal journal;
    VXLog::setRecordSink(VXLog::JournalSink());
    log("text");
    const auto entry = journal.next();
    ASSERT_TRUE(entry);
    EXPECT_EQ(entry->at("SYSLOG_IDENTIFIER"), "JournalSink_test");
}

TEST_F(JournalSink, KeepsEveryByteOfEveryField)
{
    std::string bytes = "first line\nPRIORITY=0\n\nMESSAGE\n";
    for (int byte = 0; byte < 256; ++byte)
        bytes += static_cast<char>(byte);
    const Journal journal;
    VXLog::setRecordSink(VXLog::JournalSink(bytes));
    for (const auto& message :
         {bytes, std::string("\0", 1), std::string("\n"), std::string(), std::string("=")}) {
        VXLog::VXLogger::logLevelMessage("wo\nrk", "Wor\nker", -5, bytes, 3000, nullptr, 0, 0, message);
        EXPECT_EQ(journal.next(),
                  (Entry {{"MESSAGE", message},
                          {"PRIORITY", "6"},
                          {"CODE_FILE", "Wor\nker"},
                          {"CODE_LINE", "-5"},
                          {"CODE_FUNC", "wo\nrk"},
                          {"SYSLOG_IDENTIFIER", bytes},
                          {"VXLOG_CATEGORY", bytes},
                          {"VXLOG_LEVEL", "3000"}}));
    }
}

TEST_F(JournalSink, SendsWhatExceedsADatagramWhole)
{
    const Journal journal;
    for (const std::size_t size : {std::size_t {100'000}, std::size_t {9'000'000}}) {
        std::string message(size, 'x');
        message[size / 2] = '\n';
        log(message);
        const auto entry = journal.next();
        ASSERT_TRUE(entry);
        EXPECT_EQ(entry->size(), 8u);
        EXPECT_TRUE(entry->at("MESSAGE") == message) << entry->at("MESSAGE").size() << " bytes";
    }
}

TEST_F(JournalSink, WritesToStandardErrorWhereThereIsNoJournal)
{
    EXPECT_EQ(standardError([] { log("a\nb"); }), " 6000 Some.Category Worker:12 work: a\\nb\n");
    EXPECT_EQ(standardError([] { trace("text"); }), "");  // as without the sink
}

TEST_F(JournalSink, WritesToStandardErrorWhereNobodyReadsTheSocket)
{
    {
        const Journal closed;  // its socket stays in the file system
    }
    EXPECT_EQ(standardError([] { log("text"); }), " 6000 Some.Category Worker:12 work: text\n");
}

TEST_F(JournalSink, WritesToStandardErrorWhatTheJournalCannotTake)
{
    const Journal journal;
    log("opens the socket of libsystemd");
    EXPECT_TRUE(journal.next());
    const std::string message(9'000'000, 'x');
    const std::string written = standardError([&message] {
        rlimit most {};
        getrlimit(RLIMIT_NOFILE, &most);
        const rlimit none {0, most.rlim_max};
        setrlimit(RLIMIT_NOFILE, &none);  // libsystemd opens a file for a long message
        log(message);
        setrlimit(RLIMIT_NOFILE, &most);
    });
    EXPECT_TRUE(written == " 6000 Some.Category Worker:12 work: " + message + "\n") << written.substr(0, 100);
    EXPECT_EQ(journal.next(), std::nullopt);
}

TEST_F(JournalSink, ReturnsToTheJournalWhenItRunsAgain)
{
    EXPECT_EQ(standardError([] { log("first"); }), " 6000 Some.Category Worker:12 work: first\n");
    const Journal journal;
    EXPECT_EQ(standardError([] { log("second"); }), "");
    const auto entry = journal.next();
    ASSERT_TRUE(entry);
    EXPECT_EQ(entry->at("MESSAGE"), "second");
}

TEST_F(JournalSink, ThrowsBadAllocOnlyAndThenSendsNothing)
{
    const Journal journal;
    const std::string message(1000, 'x');
    const VXLog::JournalSink sink("agent");
    const std::string category = "Some.Category";
    const VXLog::Record record {
        VXLog::Record::Kind::log, "work", "Worker", 12, category, 6000, nullptr, 0, 0, message};
    for (long allowed = 0;; ++allowed) {
        const bool isSent = allocation::completesWith(allowed, [&] { sink(record); });
        EXPECT_EQ(journal.next().has_value(), isSent) << "with memory for " << allowed << " allocations";
        if (isSent) {
            EXPECT_GT(allowed, 0);
            break;
        }
    }
}

TEST_F(JournalSink, SendsTheRecordsOfSeveralThreadsWhole)
{
    constexpr std::size_t records = 500;
    const std::string letters = "abcd";  // one for each thread
    const Journal journal;
    // ThreadSanitizer does not see that libsystemd publishes its socket with an atomic. So this thread opens it.
    log("opens the socket of libsystemd");
    EXPECT_TRUE(journal.next());
    std::vector<std::thread> running;
    std::multiset<std::string> expected;
    for (const char letter : letters) {
        for (std::size_t i = 1; i <= records; ++i)
            expected.insert(std::string(i, letter) + "\n");
        running.emplace_back([letter] {
            for (std::size_t i = 1; i <= records; ++i)
                log(std::string(i, letter) + "\n");
        });
    }
    std::multiset<std::string> messages;
    const auto limit = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    while (messages.size() < expected.size() && std::chrono::steady_clock::now() < limit) {
        if (const auto entry = journal.next()) {
            EXPECT_EQ(entry->size(), 8u);
            messages.insert(entry->at("MESSAGE"));
        }
    }
    for (auto& thread : running)
        thread.join();
    EXPECT_EQ(messages, expected);
    EXPECT_EQ(journal.next(), std::nullopt);
}

TEST_F(JournalSink, SendsTheRecordBeforeACancellation)
{
    const Journal journal;
    const auto run = [](void*) -> void* {
        pthread_cancel(pthread_self());
        logText();
        pthread_testcancel();
        return nullptr;
    };
    pthread_t thread {};
    ASSERT_EQ(pthread_create(&thread, nullptr, run, nullptr), 0);
    void* result = nullptr;
    ASSERT_EQ(pthread_join(thread, &result), 0);
    EXPECT_EQ(result, PTHREAD_CANCELED);
    const auto entry = journal.next();
    ASSERT_TRUE(entry);
    EXPECT_EQ(entry->at("MESSAGE"), "text");
}

TEST_F(JournalSink, WorksInAChildOfFork)
{
    const Journal journal;
    log("parent");
    const pid_t child = fork();
    ASSERT_NE(child, -1);
    if (child == 0) {
        log("child");
        _exit(0);
    }
    int status = -1;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_EQ(status, 0);
    for (const char* message : {"parent", "child"}) {
        const auto entry = journal.next();
        ASSERT_TRUE(entry);
        EXPECT_EQ(entry->at("MESSAGE"), message);
    }
}

// Starts systemd-journald with a journal in this process's own /run.
class Daemon {
public:
    Daemon()
    {
        if (access(program, X_OK) != 0)
            return;
        // It leaves the audit of the kernel as it is, and the messages of the kernel where they are.
        std::filesystem::create_directories("/run/systemd/journald.conf.d");
        writeFile("/run/systemd/journald.conf.d/test.conf",
                  "[Journal]\nStorage=volatile\nAudit=\nReadKMsg=no\nRateLimitIntervalSec=0\n");
        process_ = fork();
        if (process_ == 0) {
            prctl(PR_SET_PDEATHSIG, SIGKILL);
            execl(program, program, nullptr);
            _exit(127);
        }
        for (int i = 0; process_ > 0 && i < 300 && !isReady_; ++i) {
            if (waitpid(process_, nullptr, WNOHANG) != 0)
                process_ = -1;
            std::this_thread::sleep_for(std::chrono::milliseconds(100));
            isReady_ = !entriesIn(journalctl("SYSLOG_IDENTIFIER=systemd-journald")).empty();
        }
    }
    ~Daemon()
    {
        if (process_ > 0) {
            kill(process_, SIGTERM);
            waitpid(process_, nullptr, 0);
        }
    }
    Daemon(const Daemon&) = delete;
    Daemon& operator=(const Daemon&) = delete;

    // Why it does not run, or "".
    std::string whyNot() const
    {
        if (access(program, X_OK) != 0)
            return "the Debian package systemd is missing";
        return isReady_ ? "" : "systemd-journald does not start here";
    }

    // The entries with this identifier, when there are `count` of them; what there is after half a minute.
    static std::vector<Entry> entriesOf(const std::string& identifier, std::size_t count)
    {
        std::vector<Entry> entries;
        for (int i = 0; i < 300; ++i) {
            entries = entriesIn(journalctl("SYSLOG_IDENTIFIER=" + identifier));
            if (entries.size() >= count)
                break;
            std::this_thread::sleep_for(std::chrono::milliseconds(100));
        }
        return entries;
    }

private:
    static std::string journalctl(const std::string& matches)
    {
        const std::string command =
            "journalctl --directory /run/log/journal --quiet --no-pager --output export " + matches
            + " 2>/dev/null";
        std::string text;
        FILE* const output = popen(command.c_str(), "r");
        if (output == nullptr)
            throw std::runtime_error("journalctl cannot be started");
        char part[4096];
        while (const std::size_t size = std::fread(part, 1, sizeof part, output))
            text.append(part, size);
        pclose(output);
        return text;
    }

    static constexpr const char* program = "/lib/systemd/systemd-journald";
    pid_t process_ = -1;
    bool isReady_ = false;
};

TEST_F(JournalSink, ReachesJournaldWithEveryField)
{
    const Daemon daemon;
    if (!daemon.whyNot().empty())
        GTEST_SKIP() << daemon.whyNot();
    const std::string messages[] = {"no such fan", std::string("first\nsecond\0third\xff", 19),
                                    std::string(1'000'000, 'x')};
    for (const auto& message : messages)
        log(message, 3000);
    trace("a trace");
    std::vector<Entry> entries = daemon.entriesOf("agent", 4);
    ASSERT_EQ(entries.size(), 4u);
    const auto expect = [](Entry& entry, const std::string& message, const char* priority,
                           const char* level) {
        const Entry wanted {{"MESSAGE", message},
                            {"PRIORITY", priority},
                            {"CODE_FILE", "Worker"},
                            {"CODE_LINE", "12"},
                            {"CODE_FUNC", "work"},
                            {"SYSLOG_IDENTIFIER", "agent"},
                            {"VXLOG_CATEGORY", "Some.Category"},
                            {"VXLOG_LEVEL", level}};
        for (const auto& [name, value] : wanted)
            EXPECT_TRUE(entry[name] == value) << name << ": " << entry[name].substr(0, 100);
    };
    for (std::size_t i = 0; i < 3; ++i)
        expect(entries[i], messages[i], "6", "3000");
    expect(entries[3], "a trace", "7", "6000");
}

}  // namespace
