#include "Main/AudioEngineController/Effects/VST/VSTHost.h"

#include "Main/AudioEngineController/Effects/VST/VSTCatalogue.h"

VSTHost::VSTHost()
    : AudioPluginHost(&vstCatalogueFormat())
{}

void VSTHost::setAudioSettings(int sampleRate, int blockSize)
{
    m_sampleRate = sampleRate;
    m_blockSize = blockSize;
}
