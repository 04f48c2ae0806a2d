// SPDX-License-Identifier: MIT
//
// What the rows of the property chain are made of: the trace of a handler, and linking the next row. Only chain*.cpp.
#pragma once

#include "preset/apo_preset_file.h"
#include "preset/value_text.h"

// Subscribes a row: its _Changing, then one direct call of its _Changed, then its _Changed. A row that stands already is unlinked
// first, so that each is called once however often the row above has been passed.
template <auto changing, auto changed, class Link>
void CAPOPresetFile::link(Link &property) {
    const std::lock_guard guard(StateLock_);
    unlink<changing, changed>(property);
    property.addChanging(vxcomn::handlerOf<changing>(this));
    (this->*changed)();
    property.addChanged(vxcomn::handlerOf<changed>(this));
}

template <auto changing, auto changed, class Link>
void CAPOPresetFile::unlink(Link &property) {
    property.removeChanging(vxcomn::handlerOf<changing>(this));
    property.removeChanged(vxcomn::handlerOf<changed>(this));
}

namespace vxcomn {

// Traces a handler, named `<Name>_Changing` or `<Name>_Changed`, with the property's name and value.
class HandlerTrace {
  public:
    template <class T>
    HandlerTrace(const CTraceFuncCallTarget &owner, const VXWCHAR *handler, const ReactiveProperty<T> &property)
        : scope_(owner.TraceTarget, handler, argument(owner, handler, property)) {}

  private:
    template <class T>
    static WideString argument(const CTraceFuncCallTarget &owner, WideView handler, const ReactiveProperty<T> &property) {
        if (owner.TraceTarget == nullptr || owner.TraceTarget->Enabled == 0) return {};
        WideString text(handler.substr(0, handler.rfind(VXWCHAR{'_'})));
        text += VX_TEXT(" = ");
        appendValue(text, property.get());
        return text;
    }

    TraceScope scope_;
};

}  // namespace vxcomn
