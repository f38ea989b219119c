// SPDX-License-Identifier: Apache-2.0
// Shared objects that are opened on demand.
#pragma once

namespace base {

/// Opens a shared object for the rest of the process, with all its symbols resolved and none of
/// them visible to others. Null if it is not there or can't be loaded.
class SharedObject {
  public:
    explicit SharedObject(const char* name);

    bool isOpen() const { return m_handle != nullptr; }

    /// Stores the address of the named function in `function`. False, and null is stored, if the
    /// object is not open or lacks the name.
    template<class Function>
    bool find(const char* name, Function*& function) const {
        function = reinterpret_cast<Function*>(symbol(name));
        return function != nullptr;
    }

  private:
    void* symbol(const char* name) const;

    void* m_handle;
};

} // namespace base
