#include "tests/support/Transcript.h"

#include <concepts>
#include <cstdio>
#include <utility>
#include <variant>

#include "proto/VelmoMessage.h"

namespace tarn {

namespace {

std::string textOf(const DictionaryValue& value);

struct TextOfValue {
    std::string operator()(const std::string& text) const { return text; }
    std::string operator()(const Data& data) const { return std::to_string(data.size()) + " bytes"; }
    std::string operator()(bool flag) const { return flag ? "true" : "false"; }
    std::string operator()(float number) const { return (*this)(static_cast<double>(number)); }
    std::string operator()(double number) const {
        char text[32];
        std::snprintf(text, sizeof text, "%.9g", number);
        return text;
    }
    template <std::integral Number>
    std::string operator()(Number number) const {
        return std::to_string(number);
    }
    std::string operator()(const DictionaryList& list) const {
        std::string text;
        for (const DictionaryValue& element : list)
            text += (text.empty() ? "[" : ",") + textOf(element);
        return text + ']';
    }
    std::string operator()(const Dictionary& dictionary) const { return '{' + oneLine(dictionary) + '}'; }
};

std::string textOf(const DictionaryValue& value) { return std::visit(TextOfValue{}, value.value); }

/// One command, as the transcript shows it; that it was not answered is shown, too.
class TranscriptCall final : public Reply::Call {
public:
    using Decode = std::function<std::shared_ptr<ProtoCodable>(const Data&)>;

    TranscriptCall(std::shared_ptr<Transcript> transcript, std::string command, Decode decode)
        : transcript_(std::move(transcript)), command_(std::move(command)), decode_(std::move(decode)) {}

    ~TranscriptCall() override {
        if (!isAnswered_)
            transcript_->add(command_ + ": no answer");
    }

    void answer(std::optional<Data> data, const std::optional<Error>& error) override {
        isAnswered_ = true;
        transcript_->add(command_ + ": " + outcome(data, error));
    }

private:
    std::string outcome(const std::optional<Data>& data, const std::optional<Error>& error) const {
        if (error)
            return "error " + std::to_string(error->code) + reasonOf(*error);
        if (!data)
            return "nothing";
        auto payload = decode_(*data);
        return payload ? oneLine(payload->dictionaryRepresentation()) : "undecodable";
    }

    static std::string reasonOf(const Error& error) {
        auto reason = error.userInfo.find(localizedFailureReasonKey);
        return reason == error.userInfo.end() ? "" : " because: " + reason->second;
    }

    const std::shared_ptr<Transcript> transcript_;
    const std::string command_;
    const Decode decode_;
    bool isAnswered_ = false;
};

} // namespace

std::string oneLine(const Dictionary& dictionary) {
    if (dictionary.size() == 1)
        if (const auto* inner = std::get_if<Dictionary>(&dictionary.begin()->second.value)) {
            bool isLast =
                inner->size() != 1 || !std::holds_alternative<Dictionary>(inner->begin()->second.value);
            return dictionary.begin()->first + (isLast ? ' ' : '.') + oneLine(*inner);
        }
    std::string line;
    for (const auto& [key, value] : dictionary)
        line += (line.empty() ? "" : " ") + key + '=' + textOf(value);
    return line;
}

void Transcript::sendData(const Data& data) {
    auto envelope = VLProtoVelmoMessage::fromData(data);
    bool isAudio = envelope && envelope->audioFilePlayerMessage();
    std::string line =
        "push " + (isAudio ? oneLine(envelope->audioFilePlayerMessage()->dictionaryRepresentation()) : "?");
    add(line);
    if (auto act = actFor(line))
        act();
}

void Transcript::whenPushed(std::string text, std::function<void()> act) {
    std::lock_guard lock(mutex_);
    awaited_ = std::move(text);
    act_ = std::move(act);
}

std::function<void()> Transcript::actFor(const std::string& line) {
    std::lock_guard lock(mutex_);
    bool isAwaited = act_ && line.find(awaited_) != std::string::npos;
    return isAwaited ? std::exchange(act_, nullptr) : nullptr;
}

Reply Transcript::makeReply(const std::string& command, Decode decode) {
    return Reply(std::make_shared<TranscriptCall>(shared_from_this(), command, std::move(decode)));
}

void Transcript::add(const std::string& line) {
    std::lock_guard lock(mutex_);
    lines_ += line + '\n';
}

std::string Transcript::take() {
    std::lock_guard lock(mutex_);
    return std::exchange(lines_, {});
}

} // namespace tarn
