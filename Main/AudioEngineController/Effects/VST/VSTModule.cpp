#include "Main/AudioEngineController/Effects/VST/VSTModule.h"

#include "Core/BaseLib/Log/DebugLog.h"
#include "Core/BaseLib/Log/FormatText.h"
#include "Core/BaseLib/Process/FaultGuard.h"
#include "Main/AudioEngineController/Effects/VST/Interface/IVSTEffectOwner.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTCallbackNesting.h"
#include "Main/AudioEngineController/Effects/VST/Interface/VSTHostContext.h"

#include <algorithm>

namespace {

constexpr char kEntryPoint[] = "VSTPluginMain";
constexpr char kOldEntryPoint[] = "main";

using Status = VSTLoadResult::Status;
using EntryPoint = AEffect *(*)(VSTHostCallbackFunction);

VSTLoadResult failed(Status status, const QString &reason) { return {status, reason, VSTEffect()}; }

VSTLoadResult noEntryPoint()
{
    return failed(Status::NoEntryPoint, QStringLiteral("it exports no VST 2 entry point"));
}

VSTLoadResult entryFailed(Status status, const QString &how)
{
    return failed(status, QStringLiteral("its entry point ") + how);
}

VSTLoadResult invalidEffect()
{
    return entryFailed(Status::InvalidEffect,
                       QStringLiteral("returned something that is not a VST 2 effect"));
}

} // namespace

ModuleInspection VSTModule::inspect(const QString &path)
{
    ModuleInspection file = PluginLibrary::inspect(path, {kEntryPoint, kOldEntryPoint});
    if (file.verdict == ModuleInspection::Verdict::NoExport)
        file.reason = noEntryPoint().reason;
    return file;
}

VSTLoadResult VSTModule::load(const QString &path)
{
    if (!m_library.isLoaded() && !m_library.load(path))
        return failed(Status::NotLoaded, m_library.errorText());
    m_entryPoint = m_library.symbol(kEntryPoint);
    if (!m_entryPoint)
        m_entryPoint = m_library.symbol(kOldEntryPoint);
    return m_entryPoint ? VSTLoadResult() : noEntryPoint();
}

VSTLoadResult VSTModule::enter(VSTHostCallbackFunction callback, IVSTEffectOwner &owner)
{
    VSTHostContext &context = VSTHostContext::instance();
    context.setOwnerBeingLoaded(&owner);
    const auto loading = qScopeGuard([&] { context.setOwnerBeingLoaded(nullptr); });
    const auto nesting = VSTCallbackNesting::keep();
    try {
        const auto entryPoint = reinterpret_cast<EntryPoint>(m_entryPoint);
        return takeOver(callGuarded([&] { return entryPoint(callback); }), owner);
    } catch (const SEException &fault) {
        m_faulted = true;
        DebugLog(L"%ls: the entry point failed: %s, %ls", m_library.path(), fault.what(), fault.words());
        return failed(Status::EntryFailed,
                      QStringLiteral("it crashed when it was started (%1)").arg(fault.words()));
    } catch (...) {
        return entryFailed(Status::EntryFailed, guardedThrownText());
    }
}

VSTLoadResult VSTModule::takeOver(AEffect *effect, IVSTEffectOwner &owner)
{
    if (!effect)
        return entryFailed(Status::NoEffect, QStringLiteral("returned null"));
    VSTEffect taken(effect, m_library.path());
    if (!taken.isEffect())
        return invalidEffect();
    const auto known = std::find_if(m_handedOut.begin(), m_handedOut.end(),
                                    [&](const HandedOut &other) { return other.effect.isSame(taken); });
    if (known != m_handedOut.end())
        taken = known->effect;
    else
        m_handedOut.push_back({taken, owner.shellId()});
    if (!taken.setOwner(&owner))
        return invalidEffect();
    return {Status::Done, QString(), taken};
}

void VSTModule::closeNewestEffect()
{
    VSTEffect effect = m_handedOut.back().effect;
    m_handedOut.pop_back();
    effect.dispatch(effClose);
    m_faulted |= effect.hasFaulted();
}

bool VSTModule::unload()
{
    if (!m_library.isLoaded())
        return true;
    while (hasOpenEffect())
        closeNewestEffect();
    const bool isFreed = !hasFaulted() && m_library.freeUnlessRunning();
    m_library.leaveMapped(); // one that faulted may hold locks and own threads
    m_handedOut.clear();
    m_faulted = false; // the next module is another
    return isFreed;
}

bool VSTModule::hasFaulted() const
{
    return m_faulted || std::any_of(m_handedOut.begin(), m_handedOut.end(),
                                    [](const HandedOut &entry) { return entry.effect.hasFaulted(); });
}

void logFailedLoad(const QString &path, const VSTLoadResult &result)
{
    if (result.status == Status::InvalidEffect)
        DebugLog(L"VSTPlugin::Load - Invalid VST Plugin");
    DebugLog(L"VSTPlugin::Load - Failed to Load DLL: %s", path);
}
