// The downloader against a scripted transfer and an in-memory disk: any status, header, size and
// chunk sequence, failures of every call and a cancel at any pump. A download that does not
// complete leaves the destination byte-identical and says why unless the user cancelled it; one
// that completes holds exactly the announced body; no partial file is ever left behind.
#include <fuzzer/FuzzedDataProvider.h>

#include <cstdlib>
#include <string>

#include "download/file_downloader.h"
#include "fakes/fake_file_system.h"
#include "fakes/fake_http_transfer.h"
#include "fakes/fake_message_pump.h"

using namespace vantorel;

namespace {
std::optional<platform::FileError> MaybeFileError(FuzzedDataProvider& in) {
    if (in.ConsumeProbability<float>() > 0.1f) return std::nullopt;
    return platform::FileError{5, "Access is denied."};
}
std::optional<platform::TransferError> MaybeTransferError(FuzzedDataProvider& in) {
    if (in.ConsumeProbability<float>() > 0.1f) return std::nullopt;
    return platform::TransferError{12029, "The attempt to connect to the server failed."};
}
}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    FuzzedDataProvider in(data, size);
    testing::FakeHttpTransfer inet;
    testing::FakeFileSystem disk;
    testing::FakePump pump;
    FileDownloader fd(inet, disk, pump);

    const char* const destinations[] = {"C:\\Vantorel\\sw2.def", "C:\\Vantorel\\New\\VTSetup.exe",
                                        "C:\\Deep\\Er\\sw2.def", "sw2.def", "D:\\sw2.def"};
    const std::string dest = in.PickValueInArray(destinations);
    if (in.ConsumeBool()) disk.files[dest] = in.ConsumeRandomLengthString(64);
    if (in.ConsumeBool()) disk.files[FileDownloader::PartialPath(dest)] = "stale";
    const auto before =
        disk.files.find(dest) == disk.files.end() ? std::nullopt : std::optional<std::string>(disk.files[dest]);

    // The answer: a status line, maybe a size, any other fields, a body made from a short pattern.
    const char* const statuses[] = {"HTTP/1.1 200 OK",
                                    "HTTP/1.1 206 Partial Content",
                                    "HTTP/1.1 204 No Content",
                                    "HTTP/1.1 401 Unauthorized",
                                    "HTTP/1.1 404 Not Found",
                                    "HTTP/1.0 500 Oops",
                                    "",
                                    "HTTP/1.1 \r\n"};
    std::string header = in.ConsumeBool() ? in.PickValueInArray(statuses) : in.ConsumeRandomLengthString(24);
    const std::string pattern = in.ConsumeRandomLengthString(16);
    const std::size_t bodySize = pattern.empty() ? 0 : in.ConsumeIntegralInRange<std::size_t>(0, 20000);
    for (std::size_t i = 0; i < bodySize; ++i) inet.body.push_back(pattern[i % pattern.size()]);
    std::optional<std::int64_t> announced;  // the size when it is sent as a plain number
    switch (in.ConsumeIntegralInRange(0, 3)) {
        case 0: announced = static_cast<std::int64_t>(bodySize); break;
        case 1: announced = in.ConsumeIntegralInRange<std::int64_t>(-5, 40000); break;
        case 2: header += "\r\nContent-Length: " + in.ConsumeRandomLengthString(24); break;
        default: break;
    }
    if (announced) header += "\r\nContent-Length: " + std::to_string(*announced);
    inet.header = header + "\r\n" + in.ConsumeRandomLengthString(40) + "\r\n\r\n";

    // How it arrives, and what fails.
    for (int n = in.ConsumeIntegralInRange(0, 8); n > 0; --n)
        inet.chunkScript.push_back(in.ConsumeIntegralInRange<std::size_t>(0, 1100));
    if (in.ConsumeBool()) inet.deliverOnly = in.ConsumeIntegralInRange<std::size_t>(0, bodySize);
    inet.executeFails = MaybeTransferError(in);
    inet.headerFails = MaybeTransferError(in);
    inet.lengthFails = MaybeTransferError(in);
    inet.chunkFails = MaybeTransferError(in);
    inet.chunkFailsAt = in.ConsumeIntegralInRange<std::size_t>(0, bodySize);
    disk.createFolderFails = MaybeFileError(in);
    disk.createFails = MaybeFileError(in);
    disk.writeFails = MaybeFileError(in);
    disk.writeFailsAt = in.ConsumeIntegralInRange<std::size_t>(0, bodySize);
    disk.closeFails = MaybeFileError(in);
    disk.replaceFails = MaybeFileError(in);
    disk.freeClusters = in.ConsumeBool() ? 1000000 : in.ConsumeIntegralInRange<std::uint32_t>(0, 8);
    const int cancelAt = in.ConsumeIntegralInRange(0, 30);
    bool cancelled = false;
    pump.onPump = [&] {
        if (pump.pumps != cancelAt) return;
        cancelled = true;
        fd.Cancel();
    };

    int completes = 0, errors = 0;
    fd.DowloadComplete = [&] { ++completes; };
    fd.DownloadErrors = [&](const std::string&) { ++errors; };
    const bool result = fd.DownloadFile("http://127.0.0.1/vt/sw2.def", dest);

    const auto after =
        disk.files.find(dest) == disk.files.end() ? std::nullopt : std::optional<std::string>(disk.files[dest]);
    if (disk.files.count(FileDownloader::PartialPath(dest)) != 0) std::abort();
    if (completes != (result ? 1 : 0)) std::abort();
    if (result && errors != 0) std::abort();
    if (!result && !cancelled && errors == 0) std::abort();  // a failure is never silent
    if (!result && after != before) std::abort();
    if (result && after != before && (!after || *after != inet.body.substr(0, after->size()))) std::abort();
    if (result && announced && *announced > 0 && after != inet.body.substr(0, *announced)) std::abort();
    if (result && announced && *announced == 0 && after != std::string()) std::abort();  // an empty file
    return 0;
}
