#pragma once

#include "Main/AudioEngineController/Effects/AudioPluginHost.h"

/// The host of VST 2 plug-ins.
class VSTHost : public AudioPluginHost {
public:
    VSTHost();

    void setAudioSettings(int sampleRate, int blockSize) override;
    /// In Hz.
    int sampleRate() const { return m_sampleRate; }
    /// In samples.
    int blockSize() const { return m_blockSize; }

private:
    int m_sampleRate = 44100;
    int m_blockSize = 256;
};
