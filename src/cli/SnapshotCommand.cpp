// SnapshotCommand: `vantorel-cli snapshot`: reads a VantorelSnapshot-*.vantorel file with libplist, lists it and writes out its DLF.
#include "cli/SnapshotCommand.h"

#include "cli/CommandOptions.h"

#include "Monitor/TreeFormatter.h"
#include "Platform/TerminalText.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <QCommandLineParser>
#include <QFile>
#include <QFileInfo>

#include <cstdio>
#include <optional>
#include <string>

namespace vantorel {

namespace {

const char* const kPrefix = "vantorel-cli snapshot";

// A snapshot's three keys and the type each must have, as the save screen writes them.
struct RequiredKey {
    const char* key;
    Value::Type type;
    const char* typeName;
};
const RequiredKey kRequiredKeys[] = {
    {"Timestamp", Value::Type::String, "string"},
    {"Data", Value::Type::Array, "array"},
    {"Description", Value::Type::String, "string"},
};

std::optional<QByteArray> readWholeFile(const QString& path, std::string& error) {
    const QFileInfo info(path);
    if (!info.exists()) {
        error = "no such file";
        return std::nullopt;
    }
    if (info.isDir()) {
        error = "is a directory";
        return std::nullopt;
    }
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) {
        error = file.errorString().toStdString();
        return std::nullopt;
    }
    return file.readAll();
}

// Why root is not a snapshot, empty when it is one.
std::string snapshotProblem(const Dictionary& root) {
    std::string missing;
    for (const RequiredKey& required : kRequiredKeys) {
        const Value* value = root.find(required.key);
        if (!value) {
            missing += std::string(missing.empty() ? "" : ", ") + "\"" + required.key + "\"";
            continue;
        }
        if (value->type() != required.type)
            return std::string("its \"") + required.key + "\" is " + value->typeName() + ", not " + required.typeName;
    }
    if (!missing.empty()) return "it has no " + missing + " (a snapshot holds \"Timestamp\", \"Data\" and \"Description\")";
    return std::string();
}

// Every line of text, indented.
std::string indented(const std::string& text, size_t by) {
    std::string out;
    size_t start = 0;
    while (start < text.size()) {
        const size_t end = text.find('\n', start);
        const size_t stop = end == std::string::npos ? text.size() : end + 1;
        out += std::string(by, ' ') + text.substr(start, stop - start);
        start = stop;
    }
    if (!out.empty() && out.back() != '\n') out += '\n';
    return out;
}

void printEntry(size_t index, const Value& element, TreeFormatter::Format format) {
    DictionaryRef entry = element.asDictionary();
    if (!entry) {
        std::printf("  %zu  (not a dictionary: %s)\n", index, element.typeName());
        return;
    }
    const std::string* description = entry->get("Description").asString();
    std::printf("  %zu  %s\n", index, description ? TerminalText::visible(*description).c_str() : "(no description)");
    if (const std::string* date = entry->get("Date").asString())
        std::printf("      Date: %s\n", TerminalText::visible(*date).c_str());
    // The display the entry kept, as the panes showed it (or in the format asked for).
    if (const Value* display = entry->find("Display"); display && display->asDictionary()) {
        std::printf("      Display:\n");
        std::fputs(indented(TreeFormatter::format(format, *display), 8).c_str(), stdout);
    }
    if (const Value* dlf = entry->find("DLF")) {
        if (const Bytes* bytes = dlf->asData())
            std::printf("      DLF: %zu bytes\n", bytes->size());
        else
            std::printf("      DLF: (not data: %s)\n", dlf->typeName());
    }
}

// Writes the DLF of the first entry that holds one to out. Returns the exit code.
int extractDlf(const QString& file, const Array& data, const QString& out) {
    for (size_t index = 0; index < data.size(); ++index) {
        DictionaryRef entry = data.at(index).asDictionary();
        const Value* dlf = entry ? entry->find("DLF") : nullptr;
        if (!dlf) continue;
        const Bytes* bytes = dlf->asData();
        if (!bytes) {
            std::fprintf(stderr, "%s: %s: entry %zu's \"DLF\" is %s, not data\n", kPrefix, qPrintable(file), index,
                         dlf->typeName());
            return 1;
        }
        QFile output(out);
        if (!output.open(QIODevice::WriteOnly | QIODevice::Truncate)) {
            std::fprintf(stderr, "%s: cannot write %s: %s\n", kPrefix, qPrintable(out), qPrintable(output.errorString()));
            return 1;
        }
        const auto size = static_cast<qint64>(bytes->size());
        if (output.write(reinterpret_cast<const char*>(bytes->data()), size) != size || !output.flush()) {
            std::fprintf(stderr, "%s: cannot write %s: %s\n", kPrefix, qPrintable(out), qPrintable(output.errorString()));
            return 1;
        }
        std::fprintf(stderr, "Wrote the DLF of entry %zu (%zu bytes) to %s\n", index, bytes->size(), qPrintable(out));
        return 0;
    }
    std::fprintf(stderr, "%s: %s: no entry holds a \"DLF\" (the snapshot of a decoder without a DLF)\n", kPrefix,
                 qPrintable(file));
    return 1;
}

}  // namespace

int SnapshotCommand::run(const QStringList& args) {
    QCommandLineParser parser;
    parser.setApplicationDescription(
        "List a snapshot saved by the save screen (VantorelSnapshot-<seconds>.vantorel): its time stamp,\n"
        "its description and its entries (the display history, each entry's date and display, then\n"
        "the DLF binary log).");
    const QCommandLineOption helpOption = parser.addHelpOption();
    parser.addOption({"dlf", "Also write the bytes of the entry holding the DLF to OUT.", "OUT"});
    parser.addOption({"format", "Each entry's display: tree (as the panes show it), json, plist or display.",
                      "FORMAT", "tree"});
    parser.addPositionalArgument("FILE", "A snapshot file (property list).", "FILE");
    if (const auto exitCode = CommandOptions::parse(parser, helpOption, kPrefix, args)) return *exitCode;
    const QStringList files = parser.positionalArguments();
    if (files.size() != 1) {
        std::fprintf(stderr, "%s: %s (see --help)\n", kPrefix,
                     files.isEmpty() ? "no FILE given" : "one FILE at a time");
        return 2;
    }
    const QString& file = files.front();
    const auto format = TreeFormatter::parse(parser.value("format").toStdString());
    if (!format) {
        std::fprintf(stderr, "%s: unknown --format '%s' (tree, json, plist or display)\n", kPrefix,
                     qPrintable(parser.value("format")));
        return 2;
    }

    std::string error;
    const std::optional<QByteArray> contents = readWholeFile(file, error);
    if (!contents) {
        std::fprintf(stderr, "%s: cannot read %s: %s\n", kPrefix, qPrintable(file), error.c_str());
        return 1;
    }
    const PropertyListResult result = PropertyListSerialization::readDictionary(
        ByteView(reinterpret_cast<const uint8_t*>(contents->constData()), static_cast<size_t>(contents->size())));
    if (!result) {
        std::fprintf(stderr, "%s: %s is not a snapshot: %s\n", kPrefix, qPrintable(file), result.error.c_str());
        return 1;
    }
    const Dictionary& root = *result.value->asDictionary();
    const std::string problem = snapshotProblem(root);
    if (!problem.empty()) {
        std::fprintf(stderr, "%s: %s is not a snapshot: %s\n", kPrefix, qPrintable(file), problem.c_str());
        return 1;
    }

    const Array& data = *root.get("Data").asArray();
    // The snapshot's texts are the file's: printed with their control characters visible.
    std::printf("Timestamp: %s\n", TerminalText::visible(*root.get("Timestamp").asString()).c_str());
    std::printf("Description: %s\n", TerminalText::visible(*root.get("Description").asString()).c_str());
    std::printf("Data: %zu %s\n", data.size(), data.size() == 1 ? "entry" : "entries");
    for (size_t index = 0; index < data.size(); ++index) printEntry(index, data.at(index), *format);
    std::fflush(stdout);

    if (parser.isSet("dlf")) return extractDlf(file, data, parser.value("dlf"));
    return 0;
}

}  // namespace vantorel
