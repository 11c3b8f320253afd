#include "window/WindowConsole.h"

#include "Console.h"
#include "window/Question.h"

#include <QDialog>
#include <QVariant>
#include <nlohmann/json.hpp>

#include <optional>
#include <string>

namespace QuorixHost {
namespace {

/// What one `answer` asks for.
struct VAnswer
{
    std::string Word;
    std::optional<bool> Remember;
};

VAnswer TakeAnswer(VConsoleLine& line)
{
    VAnswer answer;
    answer.Word = line.TakeWord("allow, deny or cancel");
    if (answer.Word != "allow" && answer.Word != "deny" && answer.Word != "cancel") {
        throw VConsoleError("expected allow, deny or cancel, not '" + answer.Word + "'");
    }
    if (line.HasMore()) {
        const std::string remember = line.TakeWord("remember or forget");
        if (remember != "remember" && remember != "forget") {
            throw VConsoleError("expected remember or forget, not '" + remember + "'");
        }
        answer.Remember = remember == "remember";
    }
    line.ExpectEnd();
    return answer;
}

void Press(QDialog& question, const char* item)
{
    if (!PressItem(question, item)) {
        throw VConsoleError(std::string("the dialog shows no ") + item);
    }
}

std::string GiveAnswer(VConsoleLine& line)
{
    const VAnswer answer = TakeAnswer(line);
    QDialog* const question = FindQuestion();
    if (question == nullptr) {
        throw VConsoleError("no dialog is open");
    }
    if (answer.Remember && question->property("remember").toBool() != *answer.Remember) {
        Press(*question, "checkRemember");
    }
    if (answer.Word == "cancel") {
        QMetaObject::invokeMethod(question, "Cancel", Qt::DirectConnection);
    } else {
        Press(*question, answer.Word == "allow" ? "buttonAllow" : "buttonDeny");
    }
    return std::string();
}

nlohmann::json DescribeQuestion()
{
    const QDialog* const question = FindQuestion();
    if (question == nullptr) {
        return nullptr;
    }
    return {{"clientName", question->property("clientName").toString().toStdString()},
            {"remember", question->property("remember").toBool()}};
}

} // namespace

void AddWindowCommands(VConsole& console)
{
    console.AddCommand("answer", &GiveAnswer);
    console.AddStatePart([](nlohmann::json& state) { state["dialog"] = DescribeQuestion(); });
}

} // namespace QuorixHost
