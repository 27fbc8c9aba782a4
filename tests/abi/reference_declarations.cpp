// The engine's and the plug-ins' declarations as documented, written out independently of the
// project's headers and compiled for the engine's ABI. The names this object imports are the
// decorated names the DLLs must export: check_abi compares them with the committed list, and the
// list with the DataDirectory DLL's tables.
//
// One deviation: bufferCursor, which may be held as a distance from bufferStart, is an int.
#define ENGINE_API __declspec(dllimport)
#define STRING_CHANNEL_API __declspec(dllimport)
#define DATA_DIRECTORY_API __declspec(dllimport)

struct GUID {
  unsigned long Data1;
  unsigned short Data2;
  unsigned short Data3;
  unsigned char Data4[8];
};
struct D3DXVECTOR3 {
  float x, y, z;
};
struct D3DXMATRIX {
  float m[4][4];
};
struct tagRECT {
  long left, top, right, bottom;
};
class ChildInfo;
class VornFileSaver;
class VornFileLoader;
class Vorn_ChannelGroup;
class Vorn_List;

struct ChannelType {
  ENGINE_API ChannelType();
  char typeName[80];
  GUID typeGuid;
  GUID baseTypeGuid;
  unsigned char engineData[8];
  int typeCode;
  unsigned char engineFlags[8];
};

struct ChildCreation {
  ChannelType childType;
  int linkCode;
  unsigned char flagA;
  unsigned char flagB;
  char linkName[102];
  GUID auxGuid;
  unsigned int auxValue;
  int linkMode;
};

class ENGINE_API Vorn_Channel {
 public:
  virtual ~Vorn_Channel();
  virtual void CallChannel();
  virtual void OneTimeInitialize();
  virtual void DoEvent(int, unsigned long);
  virtual ChannelType GetChannelType();
  virtual bool SaveChannel(VornFileSaver&);
  virtual bool LoadChannel(VornFileLoader&, Vorn_ChannelGroup*);
  virtual void SetChannelInterfaceType(int);
  virtual Vorn_Channel* GetChannelFromChannel(Vorn_Channel*, ChildInfo*);
  virtual unsigned long GetTimeStamp();
  virtual void SetTimeStamp();
  virtual void DoDependencyInit(Vorn_List*);
  virtual void CheckIndexNrRemoval(int);

  void SetChannelName(const char*);
  void SetChildCreationCount(int);
  void SetChildCreateType(ChildCreation, int);
  Vorn_Channel* GetChild(int);
  Vorn_Channel* GetChildFromLinkPosition(int, int);
  int GetChildLinkPositionCount(int);
  const char* GetChannelName();
};

class STRING_CHANNEL_API Lum_StringChannel : public Vorn_Channel {
 public:
  Lum_StringChannel();
  Lum_StringChannel(const Lum_StringChannel&);
  Lum_StringChannel& operator=(const Lum_StringChannel&);
  virtual ~Lum_StringChannel();
  virtual bool SaveChannel(VornFileSaver&);
  virtual bool LoadChannel(VornFileLoader&, Vorn_ChannelGroup*);
  virtual unsigned long GetTimeStamp();
  virtual const char* GetString();
  virtual void SetString(const char*);
  virtual void SetSingeLine(bool);
  virtual bool GetSingeLine();
  virtual void SetMaxCars(int);
  virtual void SetIfUseWChar(bool);
  virtual bool GetIfUseWChar();
  virtual const unsigned short* GetWString();
  virtual void SetWString(const unsigned short*);
  virtual void AS2WS(unsigned short*, const char*);
  virtual void WS2AS(char*, const unsigned short*);
  virtual tagRECT GetLastRect();
  virtual void SetLastRect(tagRECT);
};

class DATA_DIRECTORY_API Lum_DataPackage : public Lum_StringChannel {
 public:
  Lum_DataPackage();
  Lum_DataPackage(const Lum_DataPackage&);
  Lum_DataPackage& operator=(const Lum_DataPackage&);
  virtual ~Lum_DataPackage();

  int WriteToBuffer(char*, int, bool, bool);
  int ReadFromBuffer(char*, int, bool, bool);
  void WriteHeader();
  int ReadWriteDirectory(bool);
  void Encrypt(char*, int);
  void Decrypt(char*, int);

 private:
  friend void ReferenceEverything(Lum_DataPackage*, char*, float&, D3DXVECTOR3&, D3DXMATRIX&,
                                  tagRECT, unsigned short*);

  void SetBuffer(char*, unsigned int);
  int BufferAppend(int);
  const char* GetTabs();
  const char* GetNewline();
  void MoveCursorAfter(const char*);
  char* GetStringBefore(const char*);
  bool IsWhiteSpace(char);
  bool MoveCursorBeforeTag(char*);
  int GetItemType(char*);
  bool XML_OpeningTag(char*);
  bool XML_OpeningIDTag(char*, int);
  void XML_ClosingTag(char*);
  void XML_StringTag(char*, char*);
  void XML_ValueTag(char*, float&);
  void XML_VectorTag(char*, D3DXVECTOR3&);
  void XML_MatrixTag(char*, D3DXMATRIX&);

  static const char* bufferStart;
  static const char* bufferEnd;
  static int bufferCursor;
  static int requiredSize;
  static int treeDepth;
  static bool write;
  static bool fileNoTxtChan;
  static char tmp[2048];
  static char tmp2[2048];
  static char strg[2048];
  static char strg2[2048];

  char tagName[2048];
};

extern "C" DATA_DIRECTORY_API ChannelType* GetType();
extern "C" DATA_DIRECTORY_API Vorn_Channel* InitDLL();

// Never run: compiled only for the names its calls import. Qualified calls name each member
// itself rather than a slot of the table.
void ReferenceEverything(Lum_DataPackage* d, char* text, float& value, D3DXVECTOR3& vector,
                         D3DXMATRIX& matrix, tagRECT rect, unsigned short* wide) {
  Vorn_Channel* v = d;
  Lum_StringChannel* s = d;
  ChannelType type;
  ChildCreation record{type, 0, 0, 0, {}, {}, 0, 0};
  v->Vorn_Channel::CallChannel();
  v->Vorn_Channel::OneTimeInitialize();
  v->Vorn_Channel::DoEvent(0, 0);
  type = v->Vorn_Channel::GetChannelType();
  v->Vorn_Channel::SaveChannel(*reinterpret_cast<VornFileSaver*>(text));
  v->Vorn_Channel::LoadChannel(*reinterpret_cast<VornFileLoader*>(text), nullptr);
  v->Vorn_Channel::SetChannelInterfaceType(0);
  v->Vorn_Channel::GetChannelFromChannel(v, nullptr);
  v->Vorn_Channel::GetTimeStamp();
  v->Vorn_Channel::SetTimeStamp();
  v->Vorn_Channel::DoDependencyInit(nullptr);
  v->Vorn_Channel::CheckIndexNrRemoval(0);
  v->SetChannelName(text);
  v->SetChildCreationCount(0);
  v->SetChildCreateType(record, 0);
  v->GetChild(0);
  v->GetChildFromLinkPosition(0, 0);
  v->GetChildLinkPositionCount(0);
  v->GetChannelName();

  s->Lum_StringChannel::SaveChannel(*reinterpret_cast<VornFileSaver*>(text));
  s->Lum_StringChannel::LoadChannel(*reinterpret_cast<VornFileLoader*>(text), nullptr);
  s->Lum_StringChannel::GetTimeStamp();
  s->Lum_StringChannel::GetString();
  s->Lum_StringChannel::SetString(text);
  s->Lum_StringChannel::SetSingeLine(true);
  s->Lum_StringChannel::GetSingeLine();
  s->Lum_StringChannel::SetMaxCars(0);
  s->Lum_StringChannel::SetIfUseWChar(true);
  s->Lum_StringChannel::GetIfUseWChar();
  s->Lum_StringChannel::GetWString();
  s->Lum_StringChannel::SetWString(wide);
  s->Lum_StringChannel::AS2WS(wide, text);
  s->Lum_StringChannel::WS2AS(text, wide);
  rect = s->Lum_StringChannel::GetLastRect();
  s->Lum_StringChannel::SetLastRect(rect);
  s->Lum_StringChannel::operator=(*s);
  Lum_StringChannel* copiedText = new Lum_StringChannel(*s);
  copiedText->Lum_StringChannel::~Lum_StringChannel();
  Lum_StringChannel* newText = new Lum_StringChannel;
  delete newText;

  d->WriteToBuffer(text, 0, true, false);
  d->ReadFromBuffer(text, 0, true, false);
  d->WriteHeader();
  d->ReadWriteDirectory(false);
  d->Encrypt(text, 0);
  d->Decrypt(text, 0);
  d->SetBuffer(text, 0);
  d->BufferAppend(0);
  d->GetTabs();
  d->GetNewline();
  d->MoveCursorAfter(text);
  d->GetStringBefore(text);
  d->IsWhiteSpace(' ');
  d->MoveCursorBeforeTag(text);
  d->GetItemType(text);
  d->XML_OpeningTag(text);
  d->XML_OpeningIDTag(text, 0);
  d->XML_ClosingTag(text);
  d->XML_StringTag(text, text);
  d->XML_ValueTag(text, value);
  d->XML_VectorTag(text, vector);
  d->XML_MatrixTag(text, matrix);
  d->operator=(*d);
  Lum_DataPackage* copy = new Lum_DataPackage(*d);
  copy->Lum_DataPackage::~Lum_DataPackage();
  delete new Lum_DataPackage;

  static volatile const void* sink;
  sink = &Lum_DataPackage::bufferStart, sink = &Lum_DataPackage::bufferEnd;
  sink = &Lum_DataPackage::bufferCursor, sink = &Lum_DataPackage::requiredSize;
  sink = &Lum_DataPackage::treeDepth, sink = &Lum_DataPackage::write;
  sink = &Lum_DataPackage::fileNoTxtChan, sink = Lum_DataPackage::tmp;
  sink = Lum_DataPackage::tmp2, sink = Lum_DataPackage::strg, sink = Lum_DataPackage::strg2;
  sink = reinterpret_cast<const void*>(&GetType);
  sink = reinterpret_cast<const void*>(&InitDLL);
}
