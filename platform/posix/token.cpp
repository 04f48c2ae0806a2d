// SPDX-License-Identifier: MIT
#include "platform/posix/token.h"

#include <algorithm>
#include <cerrno>
#include <map>
#include <vector>

#include <dirent.h>
#include <fcntl.h>
#include <pthread.h>
#include <sys/file.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/clock.h"
#include "platform/event.h"
#include "platform/posix/machine_root.h"
#include "platform/posix/open_to_all.h"
#include "platform/posix/system_status.h"
#include "platform/posix/token_name.h"
#include "platform/posix/wait_object.h"
#include "platform/thread_id.h"

namespace vxcomn {
namespace {

constexpr off_t kExistence = 0, kOwnership = 1;  // bytes of the file that are locked
constexpr const char *kGuardName = "/.guard";
constexpr int64_t kMillisecond = 1000000;

struct flock byteLock(short type, off_t byte) noexcept {
    struct flock lock = {};
    lock.l_type = type;
    lock.l_whence = SEEK_SET;
    lock.l_start = byte;
    lock.l_len = 1;
    return lock;
}

// These locks belong to the open file, so two of one process exclude each other, and the last copy of the descriptor ends them.
bool lockByte(int file, short type, off_t byte) noexcept {
    struct flock lock = byteLock(type, byte);
    return fcntl(file, F_OFD_SETLK, &lock) == 0;
}

// Whether another open file has any lock on the byte.
bool isHeld(int file, off_t byte) noexcept {
    struct flock lock = byteLock(F_WRLCK, byte);
    return fcntl(file, F_OFD_GETLK, &lock) == 0 && lock.l_type != F_UNLCK;
}

// The tokens of this process by path. Without a destructor, so that whatever runs at the end still finds them.
struct Table {
    std::mutex mutex;
    std::map<std::string, std::weak_ptr<Token>> tokens;
    size_t tidyAt = 32;
    bool prepared = false;

    // Names come and go with processes and objects: those that nobody holds any more leave when the table has doubled.
    void insert(const std::string &path, const std::shared_ptr<Token> &token) {
        if (tokens.size() >= tidyAt) {
            std::erase_if(tokens, [](const auto &entry) { return entry.second.expired(); });
            tidyAt = std::max<size_t>(32, 2 * tokens.size());
        }
        tokens[path] = token;
    }
};
Table &table() {
    static Table *const made = new Table;
    return *made;
}

void forgetInChild() {
    for (auto &[path, weak] : table().tokens) {
        if (const auto token = weak.lock()) token->forget();
    }
    table().tokens.clear();
    table().mutex.unlock();
}

// Held while token files are made, opened and removed; goes with the process that holds it.
class Guard {
  public:
    explicit Guard(const std::string &path) noexcept : file_(openForAll(path)) {
        while (file_ && flock(file_.get(), LOCK_EX) != 0) {
            if (errno != EINTR) file_.reset();
        }
    }
    explicit operator bool() const { return static_cast<bool>(file_); }

  private:
    Descriptor file_;
};

// Takes away what processes that were killed have left. The guard must be held.
void sweep(const std::string &folder) {
    const std::unique_ptr<DIR, int (*)(DIR *)> list(opendir(folder.c_str()), closedir);
    if (!list) return;
    while (const dirent *entry = readdir(list.get())) {
        if (entry->d_name[0] == '.') continue;
        const std::string path = folder + "/" + entry->d_name;
        const Descriptor file(::open(path.c_str(), O_RDWR | O_CLOEXEC | O_NOFOLLOW));
        if (file && !isHeld(file.get(), kExistence)) unlink(path.c_str());
    }
}

Status tokenFolder(std::string &folder) {
    if (const Status status = machineRoot(folder); status != status::ok) return status;
    folder += "/tokens";
    return makeFolderForAll(folder) ? status::ok : statusOfErrno(errno);
}

// What a thread owns; the end of the thread abandons it.
struct OwnedByThread {
    std::vector<std::weak_ptr<Token>> tokens;
    ~OwnedByThread() {
        for (const auto &weak : tokens) {
            if (const auto token = weak.lock()) token->abandon();
        }
    }
    void drop(const Token *token) {
        std::erase_if(tokens, [token](const auto &weak) {
            const auto held = weak.lock();
            return !held || held.get() == token;
        });
    }
};
thread_local OwnedByThread ownedByThread;

}  // namespace

Status Token::open(WideView name, Open how, std::shared_ptr<Token> &token, bool &created) {
    std::string fileName, folder;
    if (const Status status = tokenFileName(name, fileName); status != status::ok) return status;
    if (const Status status = tokenFolder(folder); status != status::ok) return status;
    const std::string path = folder + "/" + fileName;

    const std::lock_guard lock(table().mutex);
    std::shared_ptr<Token> held;
    if (const auto found = table().tokens.find(path); found != table().tokens.end()) held = found->second.lock();
    created = false;
    if (!held) {
        const Guard guard(folder + kGuardName);
        if (!guard) return statusOfErrno(errno);
        if (!table().prepared) {
            sweep(folder);
            const auto fork = [] { table().mutex.lock(); };
            table().prepared = pthread_atfork(
                                   fork, [] { table().mutex.unlock(); }, forgetInChild) == 0;
        }
        held = std::make_shared<Token>(path, folder + kGuardName);
        if (const Status status = held->openFile(how, created); status != status::ok) return status;
        table().insert(path, held);
    }
    token = std::move(held);
    return status::ok;
}

bool Token::exists(WideView name) {
    std::string fileName, folder;
    if (tokenFileName(name, fileName) != status::ok || tokenFolder(folder) != status::ok) return false;
    const Descriptor file(::open((folder + "/" + fileName).c_str(), O_RDWR | O_CLOEXEC | O_NOFOLLOW));
    return file && isHeld(file.get(), kExistence);
}

// The guard must be held.
Status Token::openFile(Open how, bool &created) {
    file_ = how == Open::existing ? Descriptor(::open(path_.c_str(), O_RDWR | O_CLOEXEC | O_NOFOLLOW)) : openForAll(path_);
    if (!file_) return statusOfErrno(errno);
    created = !isHeld(file_.get(), kExistence);
    if (created && how == Open::existing) {
        file_.reset();
        unlink(path_.c_str());
        return status::fileNotFound;
    }
    // Room on the disk now, since there is nobody to tell when a mapped page finds none.
    if (created && (ftruncate(file_.get(), 0) != 0 || posix_fallocate(file_.get(), 0, sizeof(Page)) != 0)) return status::diskFull;
    struct stat info;
    if (fstat(file_.get(), &info) != 0 || info.st_size < static_cast<off_t>(sizeof(Page))) return status::genFailure;
    if (!lockByte(file_.get(), F_RDLCK, kExistence)) return statusOfErrno(errno);
    void *mapped = mmap(nullptr, sizeof(Page), PROT_READ | PROT_WRITE, MAP_SHARED, file_.get(), 0);
    if (mapped == MAP_FAILED) return statusOfErrno(errno);
    page_ = static_cast<Page *>(mapped);
    if (created && how == Open::makeOwned && tryAcquire() != MutexWait::acquired) return status::genFailure;
    return status::ok;
}

Token::~Token() {
    if (file_) {
        const Guard guard(guardPath_);
        // Closing the file gives up all locks; one that is still owned is left as abandoned.
        const bool last = lockByte(file_.get(), F_UNLCK, kExistence) && !isHeld(file_.get(), kExistence);
        if (guard && last) unlink(path_.c_str());
        file_.reset();
    }
    if (page_ == nullptr) return;
    page_->generation.fetch_add(1);
    wakeAll(&page_->generation, true);
    munmap(page_, sizeof(Page));
}

// The local mutex must be held, or nobody else know this object yet.
MutexWait Token::tryAcquire() noexcept {
    if (depth_ > 0 && owner_ == currentThreadId()) {
        ++depth_;
        return MutexWait::acquired;
    }
    if (depth_ > 0) return MutexWait::timedOut;
    std::vector<std::weak_ptr<Token>> &owned = ownedByThread.tokens;
    try {
        if (owned.size() == owned.capacity()) {
            // Those that were closed while they were owned.
            std::erase_if(owned, [](const auto &weak) { return weak.expired(); });
            owned.reserve(owned.size() * 2 + 4);
        }
    } catch (const std::bad_alloc &) {
        return MutexWait::failed;
    }
    if (!lockByte(file_.get(), F_WRLCK, kOwnership)) {
        return errno == EAGAIN || errno == EACCES ? MutexWait::timedOut : MutexWait::failed;
    }
    owner_ = currentThreadId();
    depth_ = 1;
    owned.push_back(weak_from_this());
    return page_->owned.exchange(1) != 0 ? MutexWait::abandoned : MutexWait::acquired;
}

MutexWait Token::acquire(uint32_t milliseconds) noexcept {
    const int64_t start = performanceCounter();
    const int64_t deadline = milliseconds == kForever ? INT64_MAX : start + milliseconds * kMillisecond;
    for (;;) {
        const uint32_t seen = page_->generation.load();
        {
            const std::lock_guard lock(mutex_);
            if (const MutexWait outcome = tryAcquire(); outcome != MutexWait::timedOut) return outcome;
        }
        const int64_t now = performanceCounter();
        if (now >= deadline) return MutexWait::timedOut;
        page_->waiting.store(1);
        sleepOn({&page_->generation, seen, true}, std::min(deadline, now + kCareMilliseconds * kMillisecond));
    }
}

void Token::letGo() noexcept {
    depth_ = 0;
    lockByte(file_.get(), F_UNLCK, kOwnership);
    page_->generation.fetch_add(1);
    if (page_->waiting.exchange(0) != 0) wakeAll(&page_->generation, true);
}

Status Token::release() noexcept {
    const std::lock_guard lock(mutex_);
    if (depth_ == 0 || owner_ != currentThreadId()) return status::notOwner;
    if (--depth_ > 0) return status::ok;
    ownedByThread.drop(this);
    page_->owned.store(0);
    letGo();
    return status::ok;
}

void Token::abandon() noexcept {
    const std::lock_guard lock(mutex_);
    if (depth_ > 0 && owner_ == currentThreadId()) letGo();
}

}  // namespace vxcomn
