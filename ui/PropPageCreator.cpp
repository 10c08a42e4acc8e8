#include "PropPageCreator.h"

#include "DataCollectionPropPageImpl.h"
#include "host/gui/ApplicationBase.h"
#include "host/gui/DataCollector.h"
#include "host/gui/PropItem.h"
#include "host/gui/PropSheet.h"

const char *const CrvC_PropPageCreator::ItemName = "gc-rv-deviceuagecollection-pref-item";
const char *const CrvC_PropPageCreator::HelpTopic = "gc-corvid-preferences";

CrvC_PropPageCreator::CrvC_PropPageCreator(QObject *parent) : QObject(parent)
{
}

CrvC_PropPageCreator::~CrvC_PropPageCreator() = default;

void CrvC_PropPageCreator::addPreferenceItem(Gui::Clip::DataCollector &collector)
{
    Gui::Clip::PropSheet *sheet = collector.getPropSheet();
    if (collector.getDesiredDataType() != Gui::Clip::DataCollector::PreferenceSheet || !sheet)
        return;
    auto *item =
        new PropItem(tr("Corvid"), tr("Corvid"),
                     tr("Control the collection of device and software usage information"), ItemName);
    // The sheet owns the creator, as it owns the item.
    item->setPropPageCreator(new CrvC_PropPageCreator(sheet), SLOT(OnCreatePrefPage(QWidget *, PropItem *)));
    item->setHelpFileNameAndTopic(Gui::Clip::ApplicationBase::getHelpFileName(),
                                  QString::fromLatin1(HelpTopic));
    sheet->addItem(item, false, 1);
}

void CrvC_PropPageCreator::OnCreatePrefPage(QWidget *parent, PropItem *item)
{
    if (!item || item->page() || !item->getPropSheet())
        return;
    if (item->name() == CrvC_DataCollectionPropPageImpl::tr("Corvid"))
        new CrvC_DataCollectionPropPageImpl(parent, "DataCollectionPage");
}
