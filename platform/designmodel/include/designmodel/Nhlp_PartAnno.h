//===-- designmodel/Nhlp_PartAnno.h - the part a view is annotated with ---------===//
//
// \file
// A netlist names its target part in the "PART" text property of a view, spelled as the
// part's databook name. The annotation reads it once, when it is made.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

#include <memory>

class Nmod_View;
class PM_PIC;

class VN_VISIBLE Nhlp_PartAnno {
public:
    /// The name of the view property that holds the part.
    static constexpr const char* kPartProperty = "PART";

    /// Reads the part of `view` (which may be null).
    explicit Nhlp_PartAnno(Nmod_View* view);
    ~Nhlp_PartAnno();
    Nhlp_PartAnno(const Nhlp_PartAnno&) = delete;
    Nhlp_PartAnno& operator=(const Nhlp_PartAnno&) = delete;

    /// The part, owned by the annotation; null when the view names none (no view, no
    /// "PART" property, or an empty one).
    PM_PIC* GetPmPic();

private:
    std::unique_ptr<PM_PIC> m_pic;
};
