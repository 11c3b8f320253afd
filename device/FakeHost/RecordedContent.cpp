#include "FakeHost/RecordedContent.h"

#include "FakeHost/RecordedDialogue.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"
#include "notification/MultiCallbackPostal.h"
#include "utils/Mutex.h"

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <thread>
#include <utility>

namespace FakeHost {

namespace {

constexpr std::int32_t CodeOk = 1;
constexpr std::int32_t CodeUnknownCommand = 2;

/// The dispatcher of a host that has only what was recorded.
///
/// Threads: every operation [any].
class VRecordedControlSystem : public IControlSystem
{
public:
    explicit VRecordedControlSystem(VRecordedDialogue recordedDialogue)
        : dialogue(std::move(recordedDialogue))
    {
    }

    void AddCommandProvider(std::shared_ptr<ControlSystem::ICommandProvider>) override {}
    void RemoveCommandProvider(std::shared_ptr<ControlSystem::ICommandProvider>) override {}
    void AddEventProvider(std::shared_ptr<ControlSystem::IEventProvider>) override {}
    void RemoveEventProvider(std::shared_ptr<ControlSystem::IEventProvider>) override {}

    std::vector<std::wstring> GetCommandList(int) override { return dialogue.Commands; }
    std::vector<std::wstring> GetEventList(int) override { return dialogue.Events; }

    ControlSystem::ICommandInformation GetCommandInformation(const std::wstring& name) override
    {
        const auto found = dialogue.CommandInformation.find(name);
        return found == dialogue.CommandInformation.end() ? ControlSystem::ICommandInformation()
                                                          : found->second;
    }

    ControlSystem::IEventInformation GetEventInformation(const std::wstring& name) override
    {
        const auto found = dialogue.EventInformation.find(name);
        return found == dialogue.EventInformation.end() ? ControlSystem::IEventInformation()
                                                        : found->second;
    }

    void ExecuteCommand(const std::wstring& name, const ControlSystem::IParameters& input,
                        boost::function<void(const ControlSystem::IParameters&)> success,
                        boost::function<void(ControlSystem::IResult)> failure) override
    {
        const VRecordedOutcome outcome = NextOutcome(name, input);
        if (outcome.Code == CodeOk) {
            success(outcome.Reply);
        } else {
            ControlSystem::IResult result;
            result.Code = outcome.Code;
            failure(result);
        }
    }

    EventNotification& GetEventNotification() override { return notification; }

    ControlSystem::IResult FireEvent(const std::wstring& name,
                                     const ControlSystem::IParameters& parameters) override
    {
        notification(name, parameters);
        ControlSystem::IResult result;
        result.Code = CodeOk;
        return result;
    }

private:
    VRecordedOutcome NextOutcome(const std::wstring& name, const ControlSystem::IParameters& input)
    {
        auto found = dialogue.Outcomes.find(OutcomeKey(name, input));
        if (found == dialogue.Outcomes.end()) {
            found = dialogue.Outcomes.find(OutcomeKey(name));
        }
        if (found == dialogue.Outcomes.end()) {
            return {CodeUnknownCommand, {}};
        }
        const KVR::VMutexLock lock(mutex);
        std::size_t& next = used[found->first];
        const VRecordedOutcome& outcome = found->second[next];
        next += next + 1 < found->second.size() ? 1 : 0; // the last one stays
        return outcome;
    }

    const VRecordedDialogue dialogue;
    KVR::VMutex mutex;
    std::map<std::wstring, std::size_t> used KVR_GUARDED_BY(mutex);
    NotificationSystem::VMultiCallbackPostal<void(const std::wstring&,
                                                  const ControlSystem::IParameters&)>
        notification;
};

/// Publishes events at their times.
///
/// Owns: the thread that does. Threads: Start [any].
class VEventTimeline
{
public:
    VEventTimeline(std::vector<VRecordedEvent> recordedEvents,
                   std::shared_ptr<IControlSystem> eventTarget)
        : events(std::move(recordedEvents)),
          target(std::move(eventTarget)),
          thread([this] { Run(); })
    {
    }

    ~VEventTimeline()
    {
        {
            const std::lock_guard<std::mutex> lock(mutex);
            ending = true;
        }
        changed.notify_all();
        thread.join();
    }

    VEventTimeline(const VEventTimeline&) = delete;
    VEventTimeline& operator=(const VEventTimeline&) = delete;

    /// Begins, the first time that it is called.
    void Start()
    {
        {
            const std::lock_guard<std::mutex> lock(mutex);
            started = true;
        }
        changed.notify_all();
    }

private:
    using Clock = std::chrono::steady_clock;

    void Run()
    {
        std::unique_lock<std::mutex> lock(mutex);
        changed.wait(lock, [this] { return started || ending; });
        const Clock::time_point start = Clock::now();
        for (const VRecordedEvent& event : events) {
            const auto due =
                start + std::chrono::duration_cast<Clock::duration>(
                            std::chrono::duration<double>(std::min(event.Seconds, longestSeconds)));
            if (changed.wait_until(lock, due, [this] { return ending; })) {
                return;
            }
            lock.unlock();
            target->FireEvent(event.Name, event.Parameters);
            lock.lock();
        }
    }

    static constexpr double longestSeconds = 1e8; // years, and still within the clock

    const std::vector<VRecordedEvent> events;
    const std::shared_ptr<IControlSystem> target;
    std::mutex mutex; // guards both flags
    std::condition_variable changed;
    bool started = false;
    bool ending = false;
    std::thread thread;
};

class VRecordedContent : public IFakeContent
{
public:
    explicit VRecordedContent(const VRecordedDialogue& dialogue)
        : dispatcher(std::make_shared<VRecordedControlSystem>(dialogue)),
          timeline(dialogue.Timeline, dispatcher)
    {
    }

    std::shared_ptr<IControlSystem> ControlSystem() override { return dispatcher; }
    void OnDevice() override { timeline.Start(); }
    void SayFarewell() override {}

private:
    const std::shared_ptr<IControlSystem> dispatcher;
    VEventTimeline timeline;
};

} // namespace

std::unique_ptr<IFakeContent> MakeRecordedContent(const std::vector<VRecordedMoment>& moments)
{
    return std::make_unique<VRecordedContent>(ReadDialogue(moments));
}

} // namespace FakeHost
