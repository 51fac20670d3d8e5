#pragma once

// The decimal point a text import hands to the scan engine. It starts as the
// process locale's decimal point and can be toggled between '.' and ','
// when a file turns out to use the other one. The process locale itself is
// never changed: imports on other threads keep their own decimal point.
class DecimalPointGuard {
public:
    DecimalPointGuard();                         // starts from the process locale
    explicit DecimalPointGuard(char decimalPoint);
    ~DecimalPointGuard() { Restore(); }
    DecimalPointGuard(const DecimalPointGuard&) = delete;
    DecimalPointGuard& operator=(const DecimalPointGuard&) = delete;

    // Back to the starting point if it was changed; otherwise '.' <-> ','.
    // Fails (nothing changes) when the starting point is neither.
    bool Switch();
    // Undoes a pending switch.
    void Restore();

    char DecimalPoint() const { return _current; }
    bool IsSwitched() const { return _switched; }

private:
    char _original;
    char _current;
    bool _switched = false;
};
