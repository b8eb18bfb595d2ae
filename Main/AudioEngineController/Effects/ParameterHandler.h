#pragma once

/// Somebody who takes parameters of the application.
class ParameterHandler {
public:
    virtual ~ParameterHandler() = default;
};

/// The application's whole-number parameters that plug-in hosts care about.
enum class IntParameter {
    SampleRate, ///< Hz
    BlockSize,  ///< samples
};

/// Takes whole-number parameters.
class IntParameterHandler : public ParameterHandler {
public:
    virtual void setIntParameter(IntParameter parameter, int value) = 0;
};
