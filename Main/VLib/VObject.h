#pragma once

/// Base of the objects that the user interface hands out; they are shared by reference count
/// (std::shared_ptr).
class VObject {
public:
    virtual ~VObject() = default;

    /// The name of the interface that the object stands for.
    virtual const char *className() const = 0;
    /// Orders objects by identifier: 0 for equal ones, -1 when this one's is smaller, 1 when it is larger.
    /// Nothing should need this, so each call is reported as an assertion.
    virtual int compare(const VObject &other) const;

protected:
    explicit VObject(int identifier)
        : m_identifier(identifier)
    {}
    VObject(const VObject &) = delete;
    VObject &operator=(const VObject &) = delete;

private:
    int m_identifier;
};
