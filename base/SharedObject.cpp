// SPDX-License-Identifier: Apache-2.0
#include "base/SharedObject.h"

#include <dlfcn.h>

namespace base {

SharedObject::SharedObject(const char* name) : m_handle(dlopen(name, RTLD_NOW | RTLD_LOCAL)) {}

void* SharedObject::symbol(const char* name) const {
    return m_handle == nullptr ? nullptr : dlsym(m_handle, name);
}

} // namespace base
