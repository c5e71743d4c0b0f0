// MVKLogGenerator2: the template-driven decoder of the Morvek channel: framing, routing, display binding and start command.
#pragma once

#include "LogGenerator/ClassIndex.h"
#include "LogGenerator/MVKLogGenerator.h"

#include <memory>
#include <string>

namespace vantorel {

class MVKLogGenerator2 : public MVKLogGenerator {
public:
    // `initWithPListName:cIndexObj:`: takes ownership of the class index; the
    // template is the resource pListName.plist, loaded when the display is first built.
    MVKLogGenerator2(std::string pListName, std::unique_ptr<ClassIndex> cIndexObj);
    ~MVKLogGenerator2() override;

    void updateState(Dictionary& state, ByteView withData) override;
    DictionaryRef generateLogUsingState(Dictionary& state) override;
    DictionaryRef getStartCommand() override;
    bool isUsable() const override { return cIndex != nullptr; }

    // Frames one record and hands it to the sections subscribed to its code.
    void updateWithData(ByteView data);
    // The display dictionary; built (and null returned) on the first call.
    DictionaryRef getDisplayFromState(Dictionary& state);
    // A mutable copy of a template value with every section bound to its container.
    Value processTemplate(const Value& templateObject);
    // Diagnostic walk: logs "Received an object of unknown type" for non-containers
    // that are not strings.
    void printDict(const Value& object) const;

    ClassIndex* classIndex() const { return cIndex.get(); }
    const std::string& templateName() const { return pListName; }

protected:
    // An object that was never initialised as a generator (no display template);
    // it decodes nothing and isUsable() is false.
    MVKLogGenerator2();

private:
    std::string pListName;
    std::shared_ptr<ClassIndex> cIndex;
};

}  // namespace vantorel
