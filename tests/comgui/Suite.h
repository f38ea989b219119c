// A suite with the real bundle in it, and connections through it.
#pragma once

#include <filesystem>
#include <memory>
#include <string>

#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "SuiteRoot.h"

/// While it lives, the bundle of the build tree is where the loader looks for it.
class Suite {
  public:
    Suite() {
        m_root.installPlistReader(PLIST_READER);
        m_root.writePreferences("Qen/com.qen.packageversion.plist",
                                {{"Nerova Hue Workbench/library_path", m_root.path("suite")}});
        std::filesystem::create_directories(m_root.path("suite/lib"));
        std::filesystem::create_directory_symlink(COMGUI_BUNDLE,
                                                  m_root.path("suite/lib/ComGUI.Bundle"));
    }

    static std::unique_ptr<CKZConnector> connect(const std::wstring& server,
                                                 const std::wstring& user = L"press",
                                                 const std::wstring& password = L"room") {
        constexpr int application = 0x5071103;
        return std::make_unique<CKZConnector>(server, user, password, application, false, false);
    }

  private:
    const support::SuiteRoot m_root;
};
