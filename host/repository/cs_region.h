// A part of a design handed to the repository for write-back and take-in: one view.
#pragma once

class Ndm_View;

class Cs_DesignRegion {
public:
    virtual ~Cs_DesignRegion() = default;
    // The view the region covers, or null.
    virtual const Ndm_View* GetView() const = 0;
};

class Cs_DesignRegion_View : public Cs_DesignRegion {
public:
    explicit Cs_DesignRegion_View(const Ndm_View* view) : view_(view) {}
    const Ndm_View* GetView() const override { return view_; }

private:
    const Ndm_View* view_;
};
