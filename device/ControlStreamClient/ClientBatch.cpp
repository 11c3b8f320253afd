#include "ControlStreamClient/Client.h"

#include "ControlStreamClient/Connection.h"
#include "ControlStreamClient/Message.h"
#include "ControlStreamClient/Pipeline.h"
#include "ControlStreamClient/Requests.h"

#include <utility>

namespace ControlStream {

namespace {

VDeadline DeadlineAt(VPipeline::Clock::time_point end)
{
    if (end == VPipeline::Clock::time_point::max()) {
        return VDeadline(NoLimit);
    }
    return VDeadline(std::chrono::ceil<std::chrono::milliseconds>(end - VPipeline::Clock::now()));
}

std::string MakeText(const VCall& call, std::uint64_t number, std::size_t index)
{
    try {
        return MakeExecuteCommandRequest(std::to_string(number), call.Name, call.Parameters);
    } catch (const VError& error) {
        throw VError(error.Kind(),
                     "in call " + std::to_string(index + 1) + " of the batch, " + error.what());
    }
}

VOutcome<VCommandReply> ToReply(VOutcome<VMessage>&& outcome)
{
    if (const VError* error = outcome.Error()) {
        return *error;
    }
    return std::get<VCommandReply>(std::move(std::move(outcome).Get().Content));
}

} // namespace

std::vector<VOutcome<VCommandReply>> VClient::ExecuteBatch(const std::vector<VCall>& calls)
{
    RequireConnection();
    std::vector<VOutcome<VCommandReply>> outcomes(calls.size(), VCommandReply());
    VPipeline pipeline;
    for (std::size_t i = 0; i < calls.size(); ++i) {
        VPendingRequest request;
        request.Number = ++correlations;
        request.Text = MakeText(calls[i], request.Number, i);
        request.Kind = EMessageKind::CommandReply;
        request.Name = calls[i].Name;
        request.TimeLimit = options.TimeLimit;
        request.Finish = [&outcome = outcomes[i]](VOutcome<VMessage> reply) {
            outcome = ToReply(std::move(reply));
        };
        pipeline.Add(std::move(request), VPipeline::Clock::now());
    }
    RunBatch(pipeline);
    return outcomes;
}

void VClient::RunBatch(VPipeline& pipeline)
{
    VSendQueue queue;
    try {
        while (!pipeline.IsIdle()) {
            pipeline.Send(queue, VPipeline::Clock::now());
            connection->Turn(queue, DeadlineAt(pipeline.NextExpiry()), false);
            TakeBatchReplies(pipeline);
            pipeline.Expire(VPipeline::Clock::now(), true);
        }
    } catch (const VError& error) {
        TakeLastReplies(pipeline);
        pipeline.FailAll(error);
    }
    if (!queue.DropUnsent()) {
        connection->Close(); // the rest of the frame can never follow in step
    }
}

void VClient::TakeBatchReplies(VPipeline& pipeline)
{
    const VPipeline::Clock::time_point now = VPipeline::Clock::now();
    std::string text;
    while (connection->TakeArrived(text)) {
        const std::size_t size = text.size();
        VMessage message = ParseMessage(std::move(text));
        if (message.Kind == EMessageKind::Event) {
            Keep(std::get<VEvent>(std::move(message.Content)), size);
        } else {
            pipeline.Accept(std::move(message), now);
        }
    }
}

/// What had arrived whole before the stream broke is as good as ever.
void VClient::TakeLastReplies(VPipeline& pipeline)
{
    try {
        TakeBatchReplies(pipeline);
    } catch (const VError&) {
        return; // the first failure is the one to be told
    }
}

} // namespace ControlStream
