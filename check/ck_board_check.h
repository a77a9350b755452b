// Ck_BoardCheck: the mistakes of a constraint file that cost a board its bring-up and that the
// constraint rules do not report: one site given to two nets, one pad given two values of a
// setting, ports left without a pin or an I/O standard, clocks no PERIOD covers, timing
// statements naming groups nobody defines, groups nobody uses. It reads a constraint
// repository bound to the design (its constraints, what they resolved to, its overrides) and
// the design's top-level ports and clock pins; the repository's own findings (unreadable
// statements, names that match nothing) are listed with them. docs/check.md gives the rules.
#pragma once

#include <string>
#include <unordered_map>
#include <vector>

#include "check/ck_finding.h"

class Cs_ConstraintMgr;
class Cs_Constraint;
class Ndm_Pin;
class Ndm_PropertyHolder;
class Ndm_View;

// A statement of a constraint file: its constraints, one after the other in the repository.
struct Ck_Statement {
    const char* file;
    int line;
    const char* text;
    std::vector<const Cs_Constraint*> constraints;
};

class Ck_BoardCheck {
public:
    // mgr must stay as it is while the check and its findings are used.
    Ck_BoardCheck(const Cs_ConstraintMgr& mgr, Ck_KindSet kinds);

    // Looks for every kind asked for; the findings are then in list order: by kind (errors
    // first), then by the position of their first statement.
    void Run();

    const std::vector<Ck_Finding>& findings() const { return findings_; }
    const Ck_Summary& summary() const { return summary_; }
    bool HasErrors() const;
    // The statements of the files, in repository order (comments left out).
    const std::vector<Ck_Statement>& statements() const { return statements_; }
    // The files read, in the order given.
    const std::vector<std::string>& files() const { return files_; }

private:
    // A top-level port bit and what sits on it.
    struct Port {
        Ndm_Pin* pin;
        Ndm_PropertyHolder* net;  // its network (or its signal outside every network), or null
        std::vector<const Cs_Constraint*> constraints;  // those that resolved to it
    };

    void Statements();
    void RepositoryMessages();
    // ck_locations.cpp
    void PinClashes();
    void LocationOverrides();
    void Ports();
    // ck_timing.cpp
    void Clocks();
    void Groups();

    void Add(Ck_Finding finding);
    Ck_Ref RefOf(const Cs_Constraint* c, std::string object = {}) const;
    // Adds a reference to c unless the last one is to the same statement and object (the
    // constraints of one statement come one after the other).
    void AddRef(Ck_Finding& f, const Cs_Constraint* c, std::string object = {}) const;
    void Sort();

    const Cs_ConstraintMgr& mgr_;
    const Ndm_View* view_;
    Ck_KindSet kinds_;
    std::vector<const Cs_Constraint*> active_;  // every constraint but comments, in order
    std::unordered_map<const Cs_Constraint*, size_t> position_;
    std::vector<Ck_Statement> statements_;
    std::vector<std::string> files_;
    std::vector<Port> ports_;
    std::vector<Ck_Finding> findings_;
    Ck_Summary summary_;
};
