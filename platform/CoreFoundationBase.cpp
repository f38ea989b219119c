#include "platform/CoreFoundationBase.h"

void CFRelease(CFTypeRef object) {
    delete static_cast<const platform::CFObject*>(object);
}
