// SPDX-License-Identifier: MIT
#include "bench/store/dconf_peer.h"

#include <cstdlib>

#include <dconf.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

namespace vxcomn::bench {
namespace {

constexpr const char *kKey = "/vxcomn/bench/value";

DConfClient *client() {
    static DConfClient *const made = dconf_client_new();
    return made;
}

uint64_t readDconf() {
    GVariant *const value = dconf_client_read(client(), kKey);
    if (value == nullptr) return 0;
    const uint64_t number = g_variant_is_of_type(value, G_VARIANT_TYPE_UINT64) ? g_variant_get_uint64(value) : 0;
    g_variant_unref(value);
    return number;
}

}  // namespace

MessageBus::MessageBus(const std::filesystem::path &folder) {
    for (const char *name : {"config", "run"}) std::filesystem::create_directories(folder / name);
    std::filesystem::permissions(folder / "run", std::filesystem::perms::owner_all);
    setenv("XDG_CONFIG_HOME", (folder / "config").c_str(), 1);
    setenv("XDG_RUNTIME_DIR", (folder / "run").c_str(), 1);
    int ends[2];
    require(pipe(ends) == 0, "no pipe");
    process_ = fork();
    if (process_ == 0) {
        dup2(ends[1], STDOUT_FILENO);
        close(ends[0]);
        execlp("dbus-daemon", "dbus-daemon", "--session", "--nofork", "--print-address=1", nullptr);
        _exit(127);
    }
    close(ends[1]);
    std::string address;
    for (char unit = 0; read(ends[0], &unit, 1) == 1 && unit != '\n';) address += unit;
    close(ends[0]);
    if (address.empty()) {
        waitpid(process_, nullptr, 0);
        process_ = -1;
        return;
    }
    setenv("DBUS_SESSION_BUS_ADDRESS", address.c_str(), 1);
}

MessageBus::~MessageBus() {
    if (process_ <= 0) return;
    kill(process_, SIGTERM);
    waitpid(process_, nullptr, 0);
}

bool dconfWorks() {
    GError *error = nullptr;
    if (dconf_client_write_sync(client(), kKey, g_variant_new_uint64(1), nullptr, nullptr, &error) != 0) return readDconf() == 1;
    if (error != nullptr) g_error_free(error);
    return false;
}

void writeDconf(uint64_t value) {
    require(dconf_client_write_fast(client(), kKey, g_variant_new_uint64(value), nullptr) != 0, "dconf could not write");
}

void watchDconf(SharedPage &page) {
    g_signal_connect(client(), "changed", G_CALLBACK(+[](DConfClient *, const char *, const char *const *, const char *, void *at) {
                         SharedPage &shared = *static_cast<SharedPage *>(at);
                         if (readDconf() != shared.value.load()) return;
                         shared.when.store(nowNanoseconds());
                         shared.arrived.store(shared.round.load());
                     }),
                     &page);
    dconf_client_watch_sync(client(), "/vxcomn/bench/");
    page.blocked.store(1);
    for (;;) g_main_context_iteration(nullptr, TRUE);
}

}  // namespace vxcomn::bench
