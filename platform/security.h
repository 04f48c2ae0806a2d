// SPDX-License-Identifier: MIT
//
// Who may use the keys and named mutexes that this library makes: everybody, so that an application without rights can talk to the
// service that hosts the effects. On Windows each kind has a security attribute record, built when the library is loaded; on Linux
// the files of the machine folder are made with permissions to the same effect. Any thread.
#pragma once

namespace vxcomn {

class SecurityRecord {
  public:
    // What the system takes: a SECURITY_ATTRIBUTES on Windows; null where there is none, or building it failed.
    void *attributes() const noexcept { return attributes_; }
    explicit SecurityRecord(void *attributes) noexcept : attributes_(attributes) {}

  private:
    void *attributes_;
};

const SecurityRecord &registrySecurity() noexcept;
const SecurityRecord &mutexSecurity() noexcept;

}  // namespace vxcomn
