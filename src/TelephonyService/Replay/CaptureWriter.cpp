// CaptureWriter: the capture file writer behind the service's --record option (docs/capture-format.md).
#include "TelephonyService/Replay/CaptureWriter.h"

#include "Platform/RecordBuilder.h"

#include <QFile>
#include <QFileInfo>

#include <chrono>

namespace vantorel {

std::unique_ptr<CaptureWriter> CaptureWriter::create(const std::string& path, const std::string& technology,
                                                     std::string* error, bool replace) {
    auto file = std::make_unique<QFile>(QString::fromStdString(path));
    // NewOnly creates exclusively: a file that appears meanwhile is not truncated either.
    const QIODevice::OpenMode mode =
        QIODevice::WriteOnly | QIODevice::Unbuffered | (replace ? QIODevice::Truncate : QIODevice::NewOnly);
    if (!file->open(mode)) {
        const bool exists = !replace && QFileInfo(QString::fromStdString(path)).exists();
        if (error) *error = path + ": " + (exists ? std::string("the file exists already") : file->errorString().toStdString());
        return nullptr;
    }
    std::unique_ptr<CaptureWriter> writer(new CaptureWriter(path, std::move(file)));
    if (!writer->writeAll(headerBytes(technology)) || !writer->flush()) {
        if (error) *error = writer->error();
        return nullptr;
    }
    return writer;
}

CaptureWriter::CaptureWriter(std::string path, std::unique_ptr<QFile> file)
    : path_(std::move(path)), file_(std::move(file)) {}

CaptureWriter::~CaptureWriter() {
    if (file_) {
        file_->flush();
        file_->close();
    }
}

bool CaptureWriter::write(int64_t timeMicros, int32_t messageId, ByteView data) {
    return writeAll(messageBytes(timeMicros, messageId, data));
}

bool CaptureWriter::flush() {
    if (!file_->flush()) {
        error_ = path_ + ": " + file_->errorString().toStdString();
        return false;
    }
    return true;
}

bool CaptureWriter::writeAll(const Bytes& bytes) {
    const qint64 n = file_->write(reinterpret_cast<const char*>(bytes.data()), static_cast<qint64>(bytes.size()));
    if (n != static_cast<qint64>(bytes.size())) {
        error_ = path_ + ": " + file_->errorString().toStdString();
        return false;
    }
    return true;
}

Bytes CaptureWriter::headerBytes(const std::string& technology) {
    Bytes out(kMagic, kMagic + kMagicLength);
    RecordBuilder::put(out, 8, kFormatVersion, 4);
    RecordBuilder::put(out, 12, technology.size(), 4);
    out.insert(out.end(), technology.begin(), technology.end());
    return out;
}

Bytes CaptureWriter::messageBytes(int64_t timeMicros, int32_t messageId, ByteView data) {
    Bytes out;
    out.reserve(kMessageHeaderLength + data.size());
    RecordBuilder::put(out, 0, static_cast<uint64_t>(timeMicros), 8);
    RecordBuilder::put(out, 8, static_cast<uint32_t>(messageId), 4);
    RecordBuilder::put(out, 12, data.size(), 4);
    out.insert(out.end(), data.begin(), data.end());
    return out;
}

int64_t CaptureWriter::nowMicros() {
    using namespace std::chrono;
    return duration_cast<microseconds>(system_clock::now().time_since_epoch()).count();
}

}  // namespace vantorel
