// SPDX-License-Identifier: MIT
#include "preset/update_thread.h"

#include <chrono>
#include <cstring>
#include <exception>
#include <system_error>

#include "platform/named_mutex.h"
#include "platform/security.h"

namespace vxcomn {
namespace {

constexpr uint32_t kThreadWait = 10000;  // milliseconds, for a thread to begin or to end
constexpr auto kQuiet = std::chrono::milliseconds(1);
constexpr int kMostQuietTests = 1000;  // a stream of writes that never pauses is walked for all the same
constexpr auto kHelperClass = VX_TEXT("VXAPOHelperWnd {9B10F5A9-15F2-488E-971D-C2421C0D2EBE}");

enum WaitIndex : size_t { kQuitIndex, kForceIndex, kChangeIndex };

// Runs a thread's function; what it throws ends that thread alone. `ended` is set behind it.
template <class Body>
void startThread(std::thread &thread, Event &ended, Body body) {
    thread = std::thread([&ended, body] {
        try {
            body();
        } catch (const std::exception &) {
            // Memory is short: the thread ends, and whoever waits for it learns that.
        }
        ended.set();
    });
}

}  // namespace

void UpdateThreadDeleter::operator()(CUpdateFromRegistryThread *thread) const noexcept {
    delete thread;
}

CUpdateFromRegistryThread::CUpdateFromRegistryThread(CAPOPresetFile &owner, bool isClient, bool hardwareOnly)
    : owner_(owner), isClient_(isClient), hardwareOnly_(hardwareOnly) {
    const DBG_TRACE &log = owner;
    setTraceTag(*this, log.Tag);
    Enabled = log.Enabled;
    FileEnabled = log.FileEnabled;
    LogFile = log.LogFile;
    std::memcpy(LogPath, log.LogPath, sizeof LogPath);
}

CUpdateFromRegistryThread::~CUpdateFromRegistryThread() {
    stop();
}

CUpdateFromRegistryThread::Owned CUpdateFromRegistryThread::start(CAPOPresetFile &owner, bool isClient, bool hardwareOnly) {
    owner.log(VX_TEXT("Creating parameter polling thread (suspended)...\n"));
    Owned thread(new CUpdateFromRegistryThread(owner, isClient, hardwareOnly));
    if (!thread->startPolling()) return nullptr;
    thread->startHelper();
    return thread;
}

bool CUpdateFromRegistryThread::startPolling() {
    try {
        startThread(polling_, pollingEnded_, [this] { ThreadFunc(); });
    } catch (const std::system_error &error) {
        log(VX_TEXT("Failed to create parameter polling thread with error code %i.\n"), error.code().value());
        return false;
    }
    log(VX_TEXT("Parameter polling thread has been created. Starting it up...\n"));
    if (waitForAny({&started_, &pollingEnded_}, kThreadWait).outcome == WaitOutcome::signalled) return true;
    log(VX_TEXT("Failed! Terminating thread.\n"));
    return false;
}

void CUpdateFromRegistryThread::startHelper() {
    try {
        startThread(helper_, helperEnded_, [this] { HelperWndThreadFunc(); });
    } catch (const std::system_error &error) {
        log(VX_TEXT("Failed to create helper window thread with error code %i.\n"), error.code().value());
        return;
    }
    log(VX_TEXT("Helper window thread has been created. Starting it up...\n"));
    if (waitForAny({&helperReady_, &helperEnded_}, kThreadWait).outcome == WaitOutcome::signalled) {
        log(VX_TEXT("Done.\n"));
    } else {
        log(VX_TEXT("Failed! Terminating helper window thread.\n"));
    }
}

void CUpdateFromRegistryThread::stop() {
    if (helper_.joinable()) {
        log(VX_TEXT("Exiting helper window thread...\n"));
        stopsHelper_ = true;
        power_.close();
        const bool ended = waitForOne(helperEnded_, kThreadWait) == WaitOutcome::signalled;
        log(ended ? VX_TEXT("Done.\n") : VX_TEXT("Failed! Terminating helper window thread.\n"));
        helper_.join();
    }
    if (polling_.joinable()) {
        log(VX_TEXT("Exiting parameter polling thread...\n"));
        quit_.set();
        const bool ended = waitForOne(pollingEnded_, kThreadWait) == WaitOutcome::signalled;
        log(ended ? VX_TEXT("Done.\n") : VX_TEXT("Failed! Terminating thread.\n"));
        polling_.join();
    }
}

void CUpdateFromRegistryThread::ThreadFunc() {
    const TraceScope scope(TraceTarget, VX_TEXT("CUpdateFromRegistryThread::ThreadFunc"));
    const WideString name = syncMutexName(owner_.APOTypeRegKeyName.get());
    NamedMutex sync;
    if (!isClient_) {
        if (const Status status = NamedMutex::create(name, sync); status != status::ok) {
            log(VX_TEXT("Failed to create sync mutex with name '%s' and error code %i"), name, status);
        }
    }
    listen(name);
}

void CUpdateFromRegistryThread::listen(const WideString &syncMutex) {
    ChangeSignal changes;
    RegistryKey root;
    if (const Status status =
            RegistryKey::create(RegistryRoot::localMachine, kStoreRoot, RegistryAccess::read, root, nullptr, &registrySecurity());
        status != status::ok) {
        log(VX_TEXT("Failed to create/open 'Software\\Ondrevale\\APO' registry key with error code: %i"), status);
        return;
    }
    Status armed = ChangeSignal::open(root, ChangeFilter::values, changes);
    if (armed == status::ok) armed = changes.arm();
    if (armed != status::ok) {
        log(VX_TEXT("Failed on first attempt to set up registry notification callback for key '%s'. Error code: %i"), kStoreRoot,
            armed);
        return;
    }
    log(VX_TEXT("Listening to changes at 'HKLM\\Software\\Ondrevale\\APO' ...\n"));
    // Behind the arming, so that whoever started the thread misses nothing.
    started_.set();

    for (bool listens = true; listens;) {
        const WaitAnswer answer = waitForAny({&quit_, &force_, &changes}, kForever);
        const bool leavesItToApo = isClient_ && hardwareOnly_ && apoRuns(syncMutex);
        if (answer.outcome != WaitOutcome::signalled) {
            std::this_thread::sleep_for(kQuiet);
            continue;
        }
        if (answer.index == kQuitIndex) {
            log(VX_TEXT("Received 'Quit' event, exiting the thread ...\n"));
            return;
        }
        listens = coalesce(changes);
        if (leavesItToApo) continue;
        walk(root, answer.index == kChangeIndex);
    }
}

void CUpdateFromRegistryThread::walk(const RegistryKey &root, bool wokenByRegistry) {
    try {
        owner_.UpdateFromRegistry(root, wokenByRegistry, false);
        owner_.UpdateParametersFromRegistry(wokenByRegistry, false);
    } catch (const std::exception &) {
        // Memory is short, or a host's hook threw. What was not told is told by the next walk.
        owner_.ResetLastParamTime();
    }
}

// Waits until nothing has changed for a while; armed behind it. False if that failed.
bool CUpdateFromRegistryThread::coalesce(ChangeSignal &changes) {
    for (int i = 0; i < kMostQuietTests; ++i) {
        if (const Status status = changes.arm(); status != status::ok) {
            log(VX_TEXT("Failed to set up registry notification callback for key '%s'. Error code: %i"), kStoreRoot, status);
            return false;
        }
        std::this_thread::sleep_for(kQuiet);
        const WaitAnswer answer = waitForAny({&quit_, &changes}, 0);
        if (answer.outcome != WaitOutcome::signalled || answer.index == 0) return true;
    }
    return changes.arm() == status::ok;
}

bool CUpdateFromRegistryThread::apoRuns(const WideString &syncMutex) const {
    NamedMutex mutex;
    const Status status = NamedMutex::open(syncMutex, mutex);
    if (status == status::ok) return true;
    log(VX_TEXT("Mutex with name '%s' hasn't been created by APO or unaccessible (return code = %i), assume APO is not running."),
        syncMutex, status);
    return false;
}

void CUpdateFromRegistryThread::HelperWndThreadFunc() {
    const TraceScope scope(TraceTarget, VX_TEXT("CUpdateFromRegistryThread::HelperWndThreadFunc"));
    const PowerEvents::Opened opened = power_.open(kHelperClass);
    if (opened.registered != status::ok) {
        log(VX_TEXT("Failed to register '%s' window class with error %i\n"), kHelperClass, opened.registered);
    }
    if (opened.found != status::ok) {
        log(VX_TEXT("Failed to retrieve '%s' window class info with error %i\n"), kHelperClass, opened.found);
    }
    helperReady_.set();
    if (!stopsHelper_) power_.run();
}

void CUpdateFromRegistryThread::powerChanged(PowerEvent event) {
    const TraceScope scope(TraceTarget, VX_TEXT("HelperWndProc"));
    if (event == PowerEvent::suspend) {
        log(VX_TEXT("Received PBT_APMSUSPEND event\n"));
    } else {
        log(VX_TEXT("Received PBT_APMRESUMEAUTOMATIC event\n"));
        owner_.ResetLastParamTime();
        force_.set();
    }
    owner_.CleanProcBuffers();
}

}  // namespace vxcomn

bool CAPOPresetFile::StartUpdateThread(bool isClient, bool hardwareOnly) {
    UpdateThread_.reset();
    UpdateThread_ = vxcomn::CUpdateFromRegistryThread::start(*this, isClient, hardwareOnly);
    return UpdateThread_ != nullptr;
}

void CAPOPresetFile::StopUpdateThread() {
    UpdateThread_.reset();
}
