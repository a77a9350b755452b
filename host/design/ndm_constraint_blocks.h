// Constraint blocks: the blocks below a view's top block that hold what no design object
// carries. A block's string property TYPE names its kind: "TIMESPEC" and "TIMEGRP" blocks keep
// timing entries (named string entries of the list property named after the type, in the
// order recorded), "CONFIG" blocks keep global settings as properties. A block made for a UCF
// is marked with the flag UCF, and only marked blocks take a UCF's constraints; an NCF uses any
// block of the type. The annotators and the constraint repository find and make them here, so
// that both put the same constraints on the same blocks.
#pragma once

#include "host/design/ndm.h"

class Ndm_ConstraintBlocks {
public:
    // For the constraints of a UCF (ucf) or of an NCF.
    explicit Ndm_ConstraintBlocks(bool ucf) : ucf_(ucf) {}

    // Whether block takes constraints of type from this kind of file.
    bool IsUsable(const Ndm_Block* block, const char* type) const;
    // Pre-order search from block (itself first) for a usable block of type, or null.
    Ndm_Block* Find(Ndm_Block* block, const char* type) const;
    // The block of type for the view whose top block is top: the one handed out before while
    // it is still in place and usable, else top itself when usable, else the first usable
    // block below top in pre-order, else a new last child "<top>_<TYPE>_UCF" (or "_NCF") with
    // TYPE (and UCF). The block carries the flag TERMINAL. Null when top is null or the block
    // cannot be made.
    Ndm_Block* Get(Ndm_Block* top, const char* type);
    // Forgets the blocks handed out (a new run, or another design).
    void Forget();

private:
    bool ucf_;
    // Blocks handed out, by type (TIMESPEC, TIMEGRP, CONFIG), so that later constraints do not
    // search the hierarchy again: within a run only their maker adds constraint blocks, so a
    // block found once stays the first usable one while it is in place and usable.
    Ndm_Block* handed_out_[3] = {nullptr, nullptr, nullptr};
};

// Appends the timing entry name = value to a TIMESPEC or TIMEGRP block; false (and nothing
// done) for any other holder.
bool Ndm_AddTimingEntry(Ndm_PropertyHolder* block, const char* name, const char* value);

// Sets the string property name = value on block, removing first every property whose name
// equals name ignoring case (a setting given again in another letter case replaces the first).
void Ndm_ReplaceSetting(Ndm_PropertyHolder* block, const char* name, const char* value);
