#include "mediaprocess/Examiner.h"

#include "decoder/Examination.h"
#include "mediaprocess/FileReader.h"
#include "mediaprotocol/Parking.h"

namespace tarn {

void Examiner::run() {
    ReceivedMessage message;
    while (service_.receive(message, 1) == Channel::Result::done) {
        const auto request = message.as<Examine>();
        if (!request)
            return;
        FileDescriptor file = message.takeFile();
        const bool mayHang = request->form != FileForm::open;
        examine(mayHang ? takeParked(file.get()) : ParkedFile{std::move(file)}, mayHang);
        if (mayHang && service_.send(ChildIsIdle{}) != Channel::Result::done) // closed by now
            return;
    }
}

void Examiner::examine(ParkedFile file, bool mayHang) {
    FileReader reader(std::move(file));
    const ExaminedFile examined = examineFile(reader);
    Examined answer;
    answer.locks = locks_;
    answer.idle = mayHang ? 0 : 1;
    if (examined.info) {
        answer.info = InfoRecord::of(*examined.info);
        answer.tags = TagsRecord::of(*examined.info);
    } else {
        answer.error = ErrorRecord::of(examined.error);
    }
    static_cast<void>(service_.send(answer));
}

} // namespace tarn
