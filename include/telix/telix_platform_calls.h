/* The functions of the platform library, each stated once: telix/telix_platform.h makes its prototypes from
 * this list, and the plug-in its binding, in this order. The rules that hold for all functions stand in that
 * header.
 *
 * Define TELIX_CALL(name, parameters, arguments) before including this file; it is undefined again behind the
 * list. `parameters` is the parameter list in brackets, `arguments` the names alone, likewise in brackets, to
 * pass a call on. TELIX_CALL_UNBOUND has the same form and stands for TELIX_CALL unless it is defined: it
 * marks the one function that the plug-in declares and never looks up.
 *
 * There is no include guard on purpose: each inclusion expands the list anew. The formatter is off because it
 * takes a parameter list that begins with a pointer for a product. */
/* clang-format off */
#ifndef TELIX_CALL_UNBOUND
#define TELIX_CALL_UNBOUND TELIX_CALL
#endif

/* ==== APP: the set, as an application sees it ========================================================= */

/* Languages and country that the viewer has chosen, as ISO codes of three letters, for the configuration
 * object. Each is asked for until the library has given a text that is not empty, and then kept for the life
 * of the page's object. Refused or empty: the page reads null. */
TELIX_CALL(TELIX_JS_APP_Config_GetPreferredAudioLanguage, (char** language), (language))
TELIX_CALL(TELIX_JS_APP_Config_GetPreferredSubtitleLanguage, (char** language), (language))
TELIX_CALL(TELIX_JS_APP_Config_GetCountryId, (char** country), (country))

/* Memory that is free for applications. The unit is the set's: the page gets the number unchanged. Asked at
 * each call of the page. Refused: the page gets the last figure, at first 0. */
TELIX_CALL(TELIX_JS_APP_GetFreeMem, (uint32_t* amount), (amount))

/* Asks for a callback when memory gets short, and gives it up. Registered when the first application manager
 * is embedded, given up when the last one has gone. The results are not read. */
TELIX_CALL(TELIX_JS_APP_RegisterLowMemory, (TELIX_JS_APP_LOW_MEMORY_CB callback), (callback))
TELIX_CALL(TELIX_JS_APP_UnRegisterLowMemory, (TELIX_JS_APP_LOW_MEMORY_CB callback), (callback))

/* Which groups of remote control keys go to the pages: 0x1 red, 0x2 green, 0x4 yellow, 0x8 blue, 0x10
 * navigation, 0x20 VCR keys, 0x40 scroll, 0x80 info, 0x100 numeric, 0x200 alpha. There is one mask for the
 * set, whatever application asks; routing the keys is the set's work.
 *
 * The mask in force. Asked until it is not 0. Refused: the page reads 0. */
TELIX_CALL(TELIX_JS_APP_GetKeySetValue, (uint32_t* mask), (mask))

/* A new mask, of any bits. Write the mask that is in force afterwards through `granted`, which is NOT preset:
 * the page gets it as the result of its call. Refused: the page gets the mask that it set last. */
TELIX_CALL(TELIX_JS_APP_SetKeySetValue, (uint32_t mask, uint32_t* granted), (mask, granted))

/* The channel that the set presents. Asked at each read. Refused: the page gets the channel it had last. */
TELIX_CALL(TELIX_JS_APP_GetCurrentChannel, (TELIX_JS_CM_HANDLE* channel), (channel))

/* ==== AV: players of the A/V control object =========================================================== */

/* Makes a player for one A/V control object. The codes say what the MIME type of the element promises:
 * container 2 MPEG audio, 512 a system stream or adaptive streaming, 1280 not known; audio codec 1 MPEG
 * audio, 4 AAC, 0 not known. `memoryAudio` is 1 if the URL ends in ".aac" or ".wav" (a short sound that may
 * be loaded whole), else 0. Refused: the browser cannot create the object. */
TELIX_CALL(TELIX_JS_AV_CreatePlayer,
           (TELIX_JS_AV_HANDLE* player, int32_t containerCode, int32_t audioCodecCode, uint32_t memoryAudio),
           (player, containerCode, audioCodecCode, memoryAudio))

/* Ends a player; comes after TELIX_JS_AV_Stop for it. The result is not read. */
TELIX_CALL(TELIX_JS_AV_DestroyPlayer, (TELIX_JS_AV_HANDLE player), (player))

/* Asks for the messages of a player, and gives them up. Every player registers the same callback, right after
 * it is made. The way back names no player: it comes once for each object that ends, after
 * TELIX_JS_AV_DestroyPlayer, and also for an object that never got a player. Other players go on expecting
 * their messages, so it should end nothing but the registrations of players that have been destroyed. The
 * results are not read. */
TELIX_CALL(TELIX_JS_AV_RegisterOnPlayStateChange,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AV_PLAYSTATE_CB callback), (player, callback))
TELIX_CALL(TELIX_JS_AV_UnregisterOnPlayStateChange, (TELIX_JS_AV_PLAYSTATE_CB callback), (callback))

/* The same for errors in rights. */
TELIX_CALL(TELIX_JS_AV_RegisterOnDRMRightsError,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AV_DRM_RIGHTS_CB callback), (player, callback))
TELIX_CALL(TELIX_JS_AV_UnregisterOnDRMRightsError, (TELIX_JS_AV_DRM_RIGHTS_CB callback), (callback))

/* Plays `url`, `playCount` times over. `sourceCode` is 6 for ordinary media, 7 for a URL that can be fetched
 * once only, 23 for smooth streaming, 25 for HTTP live streaming; the other codes are those of
 * TELIX_JS_AV_CreatePlayer. The last two are always 0. The set has one media pipeline: playing on one player
 * takes it from any other. TELIX_AV_CB_MSG_PLAYSTART follows when presentation begins, or an error message.
 * Refused: the page's call of play gives false. */
TELIX_CALL(TELIX_JS_AV_Play,
           (TELIX_JS_AV_HANDLE player, const char* url, uint32_t playCount, int32_t sourceCode,
            int32_t containerCode, int32_t audioCodecCode, uint32_t reserved32, uint16_t reserved16),
           (player, url, playCount, sourceCode, containerCode, audioCodecCode, reserved32, reserved16))

/* Plays `url` when what plays now has ended; several may wait. Each begins with TELIX_AV_CB_MSG_PLAYSTART,
 * with no TELIX_AV_CB_MSG_PLAYEND before it. `url` may be NULL, which withdraws what has been queued. The
 * codes are those of TELIX_JS_AV_Play. Refused: the page's call of queue gives false. */
TELIX_CALL(TELIX_JS_AV_Queue,
           (TELIX_JS_AV_HANDLE player, const char* url, uint32_t playCount, int32_t sourceCode,
            int32_t containerCode, int32_t audioCodecCode, uint32_t reserved32, uint16_t reserved16),
           (player, url, playCount, sourceCode, containerCode, audioCodecCode, reserved32, reserved16))

/* Looked up and never called: short sounds are played through TELIX_JS_AV_Play. */
TELIX_CALL(TELIX_JS_AV_PlaySound,
           (uint32_t value1, uint32_t value2, uint32_t value3, uint32_t value4, uint32_t value5,
            uint32_t value6, uint32_t value7),
           (value1, value2, value3, value4, value5, value6, value7))

/* Stops, pauses and resumes. All three also come from the buffering thread. Pausing keeps the position and
 * what has been fetched. Refused: after Stop the page's object keeps its state; after Pause too, unless the
 * result is 0 or TELIX_RETCODE_PAUSE_TAKEN; after Resume the object counts as playing all the same. */
TELIX_CALL(TELIX_JS_AV_Stop, (TELIX_JS_AV_HANDLE player), (player))
TELIX_CALL(TELIX_JS_AV_Pause, (TELIX_JS_AV_HANDLE player), (player))
TELIX_CALL(TELIX_JS_AV_Resume, (TELIX_JS_AV_HANDLE player), (player))

/* Sets the volume, 0 to 100. Refused: the page's call gives false. */
TELIX_CALL(TELIX_JS_AV_SetVolume, (TELIX_JS_AV_HANDLE player, uint32_t volume), (player, volume))

/* Takes the picture to full screen (1) or back (0). Refused: the page's object keeps its state. */
TELIX_CALL(TELIX_JS_AV_SetFullScreen, (TELIX_JS_AV_HANDLE player, ___UINT8 fullScreen), (player, fullScreen))

/* Sets the speed: `positive` 1 forward, 0 backward; `integerPart` the whole speeds, without sign; `tenths`
 * the first digit behind the point. 1.5 backward is 0, 1, 5. What comes is the speed that was in force when
 * the page asked; the speed it asked for is in force from then on and comes with the next call. Refused: the
 * speed stays, and the page gets no event. */
TELIX_CALL(TELIX_JS_AV_SetPlaySpeed,
           (TELIX_JS_AV_HANDLE player, ___UINT8 positive, int16_t integerPart, uint16_t tenths),
           (player, positive, integerPart, tenths))

/* Places the picture. Called when the element has moved or changed its size. Refused: called again with the
 * next window event, even if nothing has changed. */
TELIX_CALL(TELIX_JS_AV_SetDisplayArea, (TELIX_JS_AV_HANDLE player, const TELIX_JS_DISPLAY_AREA* area),
           (player, area))

/* Gives a record on how far the player has come. The record is the library's: it keeps one for each player,
 * fills it at each call, and holds it valid until the next call for that player. The plug-in never frees it;
 * it may write into it. Asked at each read of position or duration by the page, and once a second by the
 * buffering thread while the player plays, possibly both at once: a record that lives as long as its player
 * is safe. Refused, or a null record: the page reads the values that it read last, and buffering leaves the
 * player as it is. */
TELIX_CALL(TELIX_JS_AV_GetPlayInfo, (TELIX_JS_AV_HANDLE player, TELIX_JS_AV_PLAY_INFO** info), (player, info))

/* Goes to a position, in milliseconds from the start of the media. Where it is MPEG audio or its URL begins
 * with "mms://", TELIX_JS_AV_Stop comes before and TELIX_JS_AV_Play after: keep the position for that.
 * Refused: the page's call gives false. */
TELIX_CALL(TELIX_JS_AV_Seek, (TELIX_JS_AV_HANDLE player, uint32_t milliseconds), (player, milliseconds))

/* The components of one kind that the media has, or that are presented now. Note the order of the outputs:
 * first the array, then the count. `components` must not be null on success, with the count 0 too: a null
 * array stops the browser. All components are asked for until they were given once, and then kept for the
 * life of the page's object; the active ones are asked for at each call of the page, with `type` any number
 * of the page's. Refused: the page gets null. */
TELIX_CALL(TELIX_JS_AV_GetComponents,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPTYPE type, TELIX_JS_AVCOMPHANDLE** components,
            uint32_t* count),
           (player, type, components, count))
TELIX_CALL(TELIX_JS_AV_GetCurrActiveComponents,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPTYPE type, TELIX_JS_AVCOMPHANDLE** components,
            uint32_t* count),
           (player, type, components, count))

/* Presents a component, or presents it no more. The component may be any that was ever given to a page. The
 * results are not read. */
TELIX_CALL(TELIX_JS_AV_SelectComponent,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type),
           (player, component, type))
TELIX_CALL(TELIX_JS_AV_UnselectComponent,
           (TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type),
           (player, component, type))

/* Properties of a component. The first argument is the component's handle, not the player's; `type` is the
 * kind under which it was given out. Every property is asked for until it was given once (a text: once it was
 * not empty) and then kept, so it must not change for a component; after a change of the stream give new
 * handles. Encoding, language: texts of the set's choice, the language as ISO code. Flags: 0 no, any other
 * value yes. Aspect ratio: width by height, as 1.7777778; the page sees two decimals. Refused: the page reads
 * an empty text, false or 0. */
TELIX_CALL(TELIX_JS_AV_AVComponent_GetEncoding,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, char** encoding),
           (component, type, encoding))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetEncrypted,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* encrypted),
           (component, type, encrypted))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetAspectRatio,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, float* aspectRatio),
           (component, type, aspectRatio))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetLanguage,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, char** language),
           (component, type, language))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetAudioDescription,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* audioDescription),
           (component, type, audioDescription))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetAudioChannels,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, uint32_t* audioChannels),
           (component, type, audioChannels))
TELIX_CALL(TELIX_JS_AV_AVComponent_GetHearingImpaired,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* hearingImpaired),
           (component, type, hearingImpaired))

/* ==== CAP: what the set can do ======================================================================== */

/* The XML description of the set's capabilities, a whole document. Asked for until the page's parser has made
 * a document of it. Refused: the page reads null. */
TELIX_CALL(TELIX_JS_CAP_GetXmlCapabilities, (char** xml), (xml))

/* Whether the set supports the profile of that name, which is never empty; 0 no, any other value yes.
 * Refused: the page gets false. */
TELIX_CALL(TELIX_JS_CAP_HasCapability, (const char* profile, ___UINT8* supported), (profile, supported))

/* How many more videos of standard or high definition the set could decode at this moment. Asked at each
 * read. Refused: the page reads the last figure, at first 0. */
TELIX_CALL(TELIX_JS_CAP_GetExtraSDVideoDecodes, (uint32_t* count), (count))
TELIX_CALL(TELIX_JS_CAP_GetExtraHDVideoDecodes, (uint32_t* count), (count))

/* ==== CM: channels ==================================================================================== */

/* Looked up and never called. */
TELIX_CALL(TELIX_JS_CM_GetChannelHandle, (uint32_t value), (value))

/* All channels of the set, in the order of its list. Note the order of the outputs: first the count, then the
 * array. With no channels give the count 0 and an array that is not null. Asked for once by each
 * video/broadcast object and kept: a later change of the list is not seen. Refused, or a null array: the page
 * reads null, and the next read asks again. */
TELIX_CALL(TELIX_JS_CM_GetChannelList, (uint32_t* count, TELIX_JS_CM_HANDLE** channels), (count, channels))

/* Properties of a channel. The type is 0 television, 1 radio, 2 other, and is asked for at each read;
 * refused, the page reads 3. The ids are asked for until they are not 0. The delivery system descriptor and
 * the name are asked for until they are not empty; refused or empty, the page reads null. A page gets the
 * handle itself, in decimal, as the channel's "ccid". */
TELIX_CALL(TELIX_JS_CM_GetChannelType, (TELIX_JS_CM_HANDLE channel, int32_t* type), (channel, type))
TELIX_CALL(TELIX_JS_CM_GetSid, (TELIX_JS_CM_HANDLE channel, uint32_t* sid), (channel, sid))
TELIX_CALL(TELIX_JS_CM_GetOnid, (TELIX_JS_CM_HANDLE channel, uint32_t* onid), (channel, onid))
TELIX_CALL(TELIX_JS_CM_GetTsid, (TELIX_JS_CM_HANDLE channel, uint32_t* tsid), (channel, tsid))
TELIX_CALL(TELIX_JS_CM_GetDsd, (TELIX_JS_CM_HANDLE channel, char** descriptor), (channel, descriptor))
TELIX_CALL(TELIX_JS_CM_GetName, (TELIX_JS_CM_HANDLE channel, char** name), (channel, name))

/* The channel with the given original network, transport stream and service id. A page that leaves the
 * transport stream out gives 8191 for it. The page gets the channel only if the
 * list holds its handle. Refused: the page gets null. */
TELIX_CALL(TELIX_JS_CM_GetChannelByTriplet,
           (uint32_t onid, uint32_t tsid, uint32_t sid, TELIX_JS_CM_HANDLE* channel),
           (onid, tsid, sid, channel))

/* ==== SI: programmes and parental ratings ============================================================= */

/* Declared, but neither looked up nor called: a library need not have it. */
TELIX_CALL_UNBOUND(TELIX_JS_SI_GetCurrentProgrammeHandle, (uint32_t value), (value))

/* The programmes of the channel that is presented, the present one first. Note the order of the outputs:
 * first the count, then the array. With the count 0 the page reads null and the next read asks again;
 * otherwise the collection is kept for the life of the page's object, while the properties below are asked
 * for anew at each read. Refused: as with the count 0. */
TELIX_CALL(TELIX_JS_SI_GetProgrammeHandles, (uint32_t* count, TELIX_JS_SI_HANDLE** programmes),
           (count, programmes))

/* A page has written a property of a programme. Times have the units of the functions that read them.
 * Refused: the page goes on reading the former value. */
TELIX_CALL(TELIX_JS_SI_SetName, (TELIX_JS_SI_HANDLE programme, const char* name), (programme, name))
TELIX_CALL(TELIX_JS_SI_SetChannelID, (TELIX_JS_SI_HANDLE programme, const char* channelId),
           (programme, channelId))
TELIX_CALL(TELIX_JS_SI_SetDescription, (TELIX_JS_SI_HANDLE programme, const char* description),
           (programme, description))
TELIX_CALL(TELIX_JS_SI_SetStartTime, (TELIX_JS_SI_HANDLE programme, uint32_t startTime),
           (programme, startTime))
TELIX_CALL(TELIX_JS_SI_SetDuration, (TELIX_JS_SI_HANDLE programme, uint32_t duration), (programme, duration))

/* Name and description of a programme, asked for at each read. The text is `length` bytes, 1 to 255, and need
 * not be terminated. With the length 0 nothing is read and no block is freed: give a null text with it.
 * Refused or empty: the page reads the text that it read last, at first null. */
TELIX_CALL(TELIX_JS_SI_GetName, (TELIX_JS_SI_HANDLE programme, char** name, ___UINT8* length),
           (programme, name, length))
TELIX_CALL(TELIX_JS_SI_GetDescription, (TELIX_JS_SI_HANDLE programme, char** description, ___UINT8* length),
           (programme, description, length))

/* Start, duration and channel of a programme, asked for at each read. Pages expect seconds, for the start
 * those since 1970 (UTC), and for the channel its "ccid", the channel handle in decimal; all pass unchanged.
 * Refused: the page reads the value that it read last, at first 0 or null. */
TELIX_CALL(TELIX_JS_SI_GetStartTime, (TELIX_JS_SI_HANDLE programme, uint32_t* startTime),
           (programme, startTime))
TELIX_CALL(TELIX_JS_SI_GetDuration, (TELIX_JS_SI_HANDLE programme, uint32_t* duration), (programme, duration))
TELIX_CALL(TELIX_JS_SI_GetChannelID, (TELIX_JS_SI_HANDLE programme, char** channelId), (programme, channelId))

/* The parental ratings of a programme, first the count, then the array, which must hold `count` handles.
 * Asked for once and kept. Refused: the page reads null, and the next read asks again. */
TELIX_CALL(TELIX_JS_SI_GetParentalRatingHandles,
           (TELIX_JS_SI_HANDLE programme, uint32_t* count, TELIX_JS_SI_PARENTALRATING_HANDLE** ratings),
           (programme, count, ratings))

/* Properties of a parental rating. The texts (name, scheme, region) are asked for until they are not empty;
 * refused or empty, the page reads null, for the region undefined. Value and labels are asked for at each
 * read into variables that are NOT preset: write them on success. Refused: the page reads the last value, at
 * first 0. The meaning of the bits of the labels is the set's. */
TELIX_CALL(TELIX_JS_SI_PARENTALRATING_GetName, (TELIX_JS_SI_PARENTALRATING_HANDLE rating, char** name),
           (rating, name))
TELIX_CALL(TELIX_JS_SI_PARENTALRATING_GetScheme, (TELIX_JS_SI_PARENTALRATING_HANDLE rating, char** scheme),
           (rating, scheme))
TELIX_CALL(TELIX_JS_SI_PARENTALRATING_GetValue, (TELIX_JS_SI_PARENTALRATING_HANDLE rating, int32_t* value),
           (rating, value))
TELIX_CALL(TELIX_JS_SI_PARENTALRATING_GetLabels, (TELIX_JS_SI_PARENTALRATING_HANDLE rating, int32_t* labels),
           (rating, labels))
TELIX_CALL(TELIX_JS_SI_PARENTALRATING_GetRegion, (TELIX_JS_SI_PARENTALRATING_HANDLE rating, char** region),
           (rating, region))

/* The threshold that the viewer has set for a scheme, into a variable that is NOT preset. Asked at each read.
 * Refused: the page reads null. */
TELIX_CALL(TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold,
           (TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE scheme, int32_t* threshold), (scheme, threshold))

/* All schemes of parental ratings that the set knows, first the count, then the array of records, whose
 * pointer is NOT preset. The plug-in copies records and texts before it makes any further call and frees none
 * of them. With the count 0 the page gets an empty collection. Asked for once by each parental control
 * manager and kept. Refused: the page reads null, and the next read asks again. */
TELIX_CALL(TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes,
           (uint32_t* count, PARENTALRATTINGSCHEME_STRUCT_T_TAG** schemes), (count, schemes))

/* ==== VB: the video/broadcast object ================================================================== */

/* Gives a handle for a new video/broadcast object. Each must be different from those in use: events find
 * their object by it, and of two objects with one handle only one gets them. Refused: the object lives on
 * with the handle 0, under which it shows default values; IsFullScreen, SetFullScreen, SetWidth, SetHeight,
 * GetCurrentChannel and the two CreateChannelObject functions are then called with the handle 0 and should
 * refuse. */
TELIX_CALL(TELIX_JS_VB_GetHandle, (TELIX_JS_VB_HANDLE* object), (object))

/* Gives the object's hold on the tuner and the picture up. It may come several times for one handle (the
 * page's own call, then the end of the object), other calls may follow it, and
 * TELIX_JS_VB_UnRegisterStreamEvent comes after it: a released handle must do no harm. The result is not
 * read. */
TELIX_CALL(TELIX_JS_VB_Release, (TELIX_JS_VB_HANDLE object), (object))

/* Stops the presentation. The result is only logged. */
TELIX_CALL(TELIX_JS_VB_Stop, (TELIX_JS_VB_HANDLE object), (object))

/* Shows in the object what the set presents already. The result is only logged and noted. */
TELIX_CALL(TELIX_JS_VB_BindToCurrChannel, (TELIX_JS_VB_HANDLE object), (object))

/* Requests to tune; they return at once, and TELIX_JS_VB_CHANNEL_CHANGE_CB or TELIX_JS_VB_CHANNEL_ERROR_CB
 * follows. The channel 0 means none. `trickPlay` is the second argument of the page's call of setChannel, true or
 * false (trick play), 0 where the page left it out. PrevChannel and NextChannel give out the channel that is
 * selected now, before it is tuned: the page's current channel object takes it over at once. Refused: no
 * error is shown to the page. */
TELIX_CALL(TELIX_JS_VB_SetChannel, (TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel, ___UINT8 trickPlay),
           (object, channel, trickPlay))
TELIX_CALL(TELIX_JS_VB_PrevChannel, (TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel),
           (object, channel))
TELIX_CALL(TELIX_JS_VB_NextChannel, (TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel),
           (object, channel))

/* The channel that the object presents. Asked at each read; as long as the handle stays the same, the page
 * gets the same object. Refused: the page reads null. */
TELIX_CALL(TELIX_JS_VB_GetCurrentChannel, (TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel),
           (object, channel))

/* Requests to tune to a service, as TELIX_JS_VB_SetChannel. The ids are the numbers of the page, unchecked;
 * 8191 stands for a transport stream that the page left out. The result is not read. */
TELIX_CALL(TELIX_JS_VB_SetChannelByTriplet,
           (TELIX_JS_VB_HANDLE object, int32_t onid, int32_t tsid, int32_t sid), (object, onid, tsid, sid))

/* Makes a channel that need not be in the channel list, from a triplet (8191 as above) or from a delivery
 * system descriptor of `length` bytes and a service id; the descriptor is not null, also with the length 0.
 * `idType` is the page's number, cut to 8 bits. The channel has to work with the CM functions and
 * TELIX_JS_VB_SetChannel. Refused: the page gets null. */
TELIX_CALL(TELIX_JS_VB_CreateChannelObjectByTriplet,
           (TELIX_JS_VB_HANDLE object, ___UINT8 idType, uint32_t onid, uint32_t tsid, uint32_t sid,
            TELIX_JS_CM_HANDLE* channel),
           (object, idType, onid, tsid, sid, channel))
TELIX_CALL(TELIX_JS_VB_CreateChannelObjectByDsd,
           (TELIX_JS_VB_HANDLE object, ___UINT8 idType, const ___UINT8* descriptor, uint32_t length,
            uint32_t sid, TELIX_JS_CM_HANDLE* channel),
           (object, idType, descriptor, length, sid, channel))

/* Takes the picture to full screen (1) or back (0), and tells which it is (0 no, any other value yes). Set is
 * called only for a change; Is at each read. Refused: the page's object keeps its state. */
TELIX_CALL(TELIX_JS_VB_SetFullScreen, (TELIX_JS_VB_HANDLE object, ___UINT8 fullScreen), (object, fullScreen))
TELIX_CALL(TELIX_JS_VB_IsFullScreen, (TELIX_JS_VB_HANDLE object, ___UINT8* fullScreen), (object, fullScreen))

/* Width and height of the picture in pixels, and the play state, as a page has written them. Width and height
 * arrive a turn of the main loop after the page's write, which may be any number. Refused: for width and
 * height the page goes on reading the former value; the result for the play state is not read. */
TELIX_CALL(TELIX_JS_VB_SetWidth, (TELIX_JS_VB_HANDLE object, int32_t width), (object, width))
TELIX_CALL(TELIX_JS_VB_SetHeight, (TELIX_JS_VB_HANDLE object, int32_t height), (object, height))
TELIX_CALL(TELIX_JS_VB_SetPlayBackState, (TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state),
           (object, state))

/* The same, read. Width and height are asked for until they are not 0, the play state at each read. Refused:
 * the page reads the last value, at first 0. */
TELIX_CALL(TELIX_JS_VB_GetWidth, (TELIX_JS_VB_HANDLE object, int32_t* width), (object, width))
TELIX_CALL(TELIX_JS_VB_GetHeight, (TELIX_JS_VB_HANDLE object, int32_t* height), (object, height))
TELIX_CALL(TELIX_JS_VB_GetPlayBackState, (TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T* state),
           (object, state))

/* Places the picture, as TELIX_JS_AV_SetDisplayArea. */
TELIX_CALL(TELIX_JS_VB_SetDisplayArea, (TELIX_JS_VB_HANDLE object, const TELIX_JS_DISPLAY_AREA* area),
           (object, area))

/* Asks for the events of all video/broadcast objects, and gives them up. Registered once, when the first
 * object has got its handle, and given up when the last object has gone; in between, each event is called
 * with the handle of the object that it concerns. The results are not read. */
TELIX_CALL(TELIX_JS_VB_RegisterOnChannelChangeSucceeded, (TELIX_JS_VB_CHANNEL_CHANGE_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded, (TELIX_JS_VB_CHANNEL_CHANGE_CB callback),
           (callback))
TELIX_CALL(TELIX_JS_VB_RegisterOnChannelChangeError, (TELIX_JS_VB_CHANNEL_ERROR_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnChannelChangeError, (TELIX_JS_VB_CHANNEL_ERROR_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_RegisterOnFullScreenChange, (TELIX_JS_VB_FULLSCREEN_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnFullScreenChange, (TELIX_JS_VB_FULLSCREEN_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_RegisterOnPlayStateChange, (TELIX_JS_VB_PLAYSTATE_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnPlayStateChange, (TELIX_JS_VB_PLAYSTATE_CB callback), (callback))

/* The same. `object` is merely the one that happened to come first: these registrations, too, are for the
 * events of all objects, and outlive it. */
TELIX_CALL(TELIX_JS_VB_RegisterOnProgrammesChanged,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_VB_PROGRAMMES_CB callback), (object, callback))
TELIX_CALL(TELIX_JS_VB_RegisterOnParentalRatingChange,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_VB_PARENTAL_RATING_CB callback), (object, callback))
TELIX_CALL(TELIX_JS_VB_RegisterOnParentalRatingError,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_VB_PARENTAL_RATING_CB callback), (object, callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnProgrammesChanged, (TELIX_JS_VB_PROGRAMMES_CB callback), (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnParentalRatingChange, (TELIX_JS_VB_PARENTAL_RATING_CB callback),
           (callback))
TELIX_CALL(TELIX_JS_VB_UnRegisterOnParentalRatingError, (TELIX_JS_VB_PARENTAL_RATING_CB callback), (callback))

/* Watches for a stream event of the broadcast, and watches no more. Texts: the event's id, the
 * component tag, the event's name. The tag is as the description of the event has it where that came from the
 * broadcast; where it was fetched by HTTP, its decimal number is given in hexadecimal, in small letters and
 * without prefix (31 comes as 1f). The same event may be watched twice. At the end a name may come that
 * differs from the one given at the start: go by id and tag. The results are not read. */
TELIX_CALL(TELIX_JS_VB_RegisterStreamEvent,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback, const char* eventId,
            const char* componentTag, const char* eventName),
           (object, callback, eventId, componentTag, eventName))
TELIX_CALL(TELIX_JS_VB_UnRegisterStreamEvent,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback, const char* eventId,
            const char* componentTag, const char* eventName),
           (object, callback, eventId, componentTag, eventName))

/* Components of the channel, as the functions of the same name in the AV family: first the array, which must
 * not be null on success, then the count. */
TELIX_CALL(TELIX_JS_VB_GetComponents,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPTYPE type, TELIX_JS_AVCOMPHANDLE** components,
            uint32_t* count),
           (object, type, components, count))
TELIX_CALL(TELIX_JS_VB_GetCurrActiveComponents,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPTYPE type, TELIX_JS_AVCOMPHANDLE** components,
            uint32_t* count),
           (object, type, components, count))
TELIX_CALL(TELIX_JS_VB_SelectComponent,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type),
           (object, component, type))
TELIX_CALL(TELIX_JS_VB_UnselectComponent,
           (TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type),
           (object, component, type))

/* Properties of a component of the broadcast, as in the AV family: the first argument is the component's
 * handle. */
TELIX_CALL(TELIX_JS_VB_AVComponent_GetEncoding,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, char** encoding),
           (component, type, encoding))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetEncrypted,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* encrypted),
           (component, type, encrypted))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetAspectRatio,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, float* aspectRatio),
           (component, type, aspectRatio))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetLanguage,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, char** language),
           (component, type, language))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetAudioDescription,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* audioDescription),
           (component, type, audioDescription))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetAudioChannels,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, uint32_t* audioChannels),
           (component, type, audioChannels))
TELIX_CALL(TELIX_JS_VB_AVComponent_GetHearingImpaired,
           (TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, ___UINT8* hearingImpaired),
           (component, type, hearingImpaired))

/* ==== DRM: messages to a DRM agent ==================================================================== */

/* Asks for the answers to messages, and gives them up. Every DRM agent registers the same callback when it is
 * made and gives it up when it ends, while others may live on: count them, and call no more after the last
 * one. The results are not read. */
TELIX_CALL(TELIX_JS_DRM_RegisterOnDRMMessageResult, (TELIX_JS_DRM_MESSAGE_RESULT_CB callback), (callback))
TELIX_CALL(TELIX_JS_DRM_UnregisterOnDRMMessageResult, (TELIX_JS_DRM_MESSAGE_RESULT_CB callback), (callback))

/* Sends a message of a MIME type to the DRM system of that id, and gives out an id for it; the answer follows
 * through the callback with the same id. Refused, or with a null id: the page's call gives the id of the
 * message before, or null if there was none, and no answer is expected. */
TELIX_CALL(TELIX_JS_DRM_SendDRMMessage,
           (const char* messageType, const char* message, const char* drmSystemId, char** messageId),
           (messageType, message, drmSystemId, messageId))

/* clang-format on */

#undef TELIX_CALL
#undef TELIX_CALL_UNBOUND
