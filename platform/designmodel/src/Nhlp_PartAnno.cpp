//===-- Nhlp_PartAnno.cpp -------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "designmodel/Nhlp_PartAnno.h"

#include "designmodel/Nmod_Model.h"
#include "devdata/PM_PIC.h"

Nhlp_PartAnno::Nhlp_PartAnno(Nmod_View* view) {
    const char* part = view != nullptr ? view->GetPropertyString(kPartProperty) : nullptr;
    if (part != nullptr && *part != '\0') {
        // The property already spells the databook name, so the part is that one text.
        m_pic = std::make_unique<PM_PIC>(part, nullptr, nullptr);
    }
}

Nhlp_PartAnno::~Nhlp_PartAnno() = default;

PM_PIC* Nhlp_PartAnno::GetPmPic() {
    return m_pic.get();
}
