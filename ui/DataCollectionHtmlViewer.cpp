#include "DataCollectionHtmlViewer.h"

CrvC_DataCollectionHtmlViewer::CrvC_DataCollectionHtmlViewer(QWidget *parent) : QTextBrowser(parent)
{
    setFrameStyle(QFrame::Panel | QFrame::Sunken);
    QPalette colours = palette();
    colours.setBrush(QPalette::All, QPalette::Base, QBrush(Qt::white));
    colours.setBrush(QPalette::All, QPalette::Text, QBrush(Qt::black));
    setPalette(colours);
}

CrvC_DataCollectionHtmlViewer::~CrvC_DataCollectionHtmlViewer() = default;
