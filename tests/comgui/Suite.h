// A suite with the real bundle in it, and connections through it.
#pragma once

#include <memory>
#include <string>

#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "SuiteRoot.h"

/// While it lives, the bundle of the build tree is where the loader looks for it.
class Suite {
  public:
    Suite() {
        m_root.installPlistReader(PLIST_READER);
        m_root.installCommBundle(COMGUI_BUNDLE);
    }

    static std::unique_ptr<CKZConnector> connect(const std::wstring& server,
                                                 const std::wstring& user = L"press",
                                                 const std::wstring& password = L"room") {
        return std::make_unique<CKZConnector>(server, user, password, 0x5071103, false, false);
    }

  private:
    const support::SuiteRoot m_root;
};
