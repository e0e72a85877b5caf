package tarnwick;

import hl.Bytes;
import hl.NativeArray;

/**
	Epic Online Services for a HashLink game: a thin typed layer over
	`tarnwick.Natives`, one call per primitive of `tarnwick.hdll`.

	Everything is asynchronous. A call starts a request and returns at once;
	its callback runs later, inside `Eos.update()`, on the game's thread. Call
	`init` once, then `update` once per frame, and `exit` at the end.

	Strings cross as UTF-8. Callbacks are optional: without one the request is
	still made and nothing is called back. Failures are never thrown: a
	callback receives a `Result`, a null value or a record with null fields,
	as each call says.
**/
class Eos {
	// The configuration handed to the library points at these strings; keeping
	// the object reachable keeps them alive for the life of the platform.
	static var liveConfig:InitConfig;

	/**
		Starts the SDK and the platform and begins signing the player in.
		Returns false when the SDK or the platform could not be started (the
		library's log says why); `onLogin` is then never called.

		`onLogin` receives, once, inside a later `update()`: the result
		(`Success` when signed in to both Epic account and game services), the
		Epic account id (null when the Auth login failed), the display name
		(empty when unknown) and the Auth access token (null when none).
	**/
	public static function init(config:Config,
			?onLogin:(result:Result, epicId:Null<String>, displayName:String, accessToken:Null<String>) -> Void):Bool {
		var c = new InitConfig();
		c.productName = toUtf8(config.productName);
		c.productVersion = toUtf8(config.productVersion);
		c.eosProductId = toUtf8(config.productId);
		c.spare = null;
		c.sandboxId = toUtf8(config.sandboxId);
		c.deploymentId = toUtf8(config.deploymentId);
		c.clientId = toUtf8(config.clientId);
		c.clientSecret = toUtf8(config.clientSecret);
		c.loginId = toUtf8(config.loginId);
		c.loginToken = toUtf8(config.loginToken);
		c.loginType = config.loginType;
		c.externalType = config.externalType;
		c.enableOverlay = config.enableOverlay;
		liveConfig = c;
		var cb:(Int, Bytes, Bytes, Bytes) -> Void = null;
		if (onLogin != null)
			cb = function(code:Int, epicId:Bytes, name:Bytes, token:Bytes) {
				var displayName = fromUtf8(name);
				onLogin(code, fromUtf8(epicId), displayName == null ? "" : displayName, fromUtf8(token));
			};
		return Natives.init(c, cb);
	}

	/** Lets the SDK work; every callback of this API runs inside this call. Call it once per frame. **/
	public static inline function update():Void {
		Natives.update();
	}

	/** Releases the platform. Call nothing else of this API afterwards. **/
	public static function exit():Void {
		Natives.exit();
		liveConfig = null;
	}

	/**
		Calls `handler` for every lobby invitation the player receives, with
		the invitation id (for `acceptInvite` / `rejectInvite`) and the sender's
		display name. A new handler replaces the previous one.
	**/
	public static function onInviteReceived(handler:(inviteId:String, senderName:Null<String>) -> Void):Void {
		Natives.notify_invite_received(handler == null ? null : pairHandler(handler));
	}

	/**
		Calls `handler` when the player accepts an invitation or a join request
		in the overlay, with the lobby id and the connection key its host
		published. A new handler replaces the previous one.
	**/
	public static function onInviteAccepted(handler:(lobbyId:String, connectionKey:Null<String>) -> Void):Void {
		Natives.notify_invite_accepted(handler == null ? null : pairHandler(handler));
	}

	/**
		Creates an invite-only lobby of at most 10 members that publishes
		`connectionKey` (cut to 255 bytes; null publishes an empty key).
		`onCreated` receives the lobby id, or null when the lobby could not be
		created.
	**/
	public static function createLobby(connectionKey:String, ?onCreated:(lobbyId:Null<String>) -> Void):Void {
		var cb:Bytes -> Void = null;
		if (onCreated != null)
			cb = function(lobbyId:Bytes) onCreated(fromUtf8(lobbyId));
		Natives.create_lobby(toUtf8(connectionKey == null ? "" : connectionKey), cb);
	}

	/** Leaves a lobby; `onLeft` receives the outcome. **/
	public static function leaveLobby(lobbyId:String, ?onLeft:(result:Result) -> Void):Void {
		Natives.leave_lobby(toUtf8(lobbyId), onLeft == null ? null : resultHandler(onLeft));
	}

	/** Destroys a lobby the player owns; `onDestroyed` receives the outcome. **/
	public static function destroyLobby(lobbyId:String, ?onDestroyed:(result:Result) -> Void):Void {
		Natives.destroy_lobby(toUtf8(lobbyId), onDestroyed == null ? null : resultHandler(onDestroyed));
	}

	/** Invites a player, named by product user id (`Friend.productId`), to a lobby. **/
	public static function sendInvite(productUserId:String, lobbyId:String):Void {
		Natives.send_invite(toUtf8(productUserId), toUtf8(lobbyId));
	}

	/** Turns down a received invitation. **/
	public static function rejectInvite(inviteId:String):Void {
		Natives.reject_invite(toUtf8(inviteId));
	}

	/**
		Accepts a received invitation by joining its lobby. `onJoined` receives
		the lobby id and the host's connection key once joined; it is not
		called when the invitation or the lobby cannot be read.
	**/
	public static function acceptInvite(inviteId:String, ?onJoined:(lobbyId:String, connectionKey:Null<String>) -> Void):Void {
		Natives.accept_invite(toUtf8(inviteId), onJoined == null ? null : pairHandler(onJoined));
	}

	/**
		Lists the player's friends. `onFriends` receives the list, or null when
		the friend list could not be queried. Entries the library could not
		read at all (an invalid friend id) are left out, so the list holds no
		null; a friend's field is null when its own query failed.
	**/
	public static function queryFriends(onFriends:(friends:Null<Array<Friend>>) -> Void):Void {
		var cb:NativeArray<Dynamic> -> Void = null;
		if (onFriends != null)
			cb = function(list:NativeArray<Dynamic>) {
				if (list == null) {
					onFriends(null);
					return;
				}
				var friends = [];
				for (i in 0...list.length) {
					var o:Dynamic = list[i];
					if (o != null)
						friends.push(new Friend(textOf(o.epicId), textOf(o.name), flagOf(o.online), textOf(o.productId)));
				}
				onFriends(friends);
			};
		Natives.query_friends(cb);
	}

	/** Opens the friends view of the EOS overlay. **/
	public static inline function showFriends():Void {
		Natives.show_friends();
	}

	/** Unlocks an achievement. Nothing is reported back. **/
	public static function unlockAchievement(achievementId:String):Void {
		Natives.set_achievement(toUtf8(achievementId));
	}

	/**
		Lists the player's achievements. Entries the SDK could not copy are
		left out, so the list holds no null.
	**/
	public static function queryAchievements(onAchievements:(achievements:Array<Achievement>) -> Void):Void {
		var cb:NativeArray<Dynamic> -> Void = null;
		if (onAchievements != null)
			cb = function(list:NativeArray<Dynamic>) {
				var achievements = [];
				if (list != null)
					for (i in 0...list.length) {
						var o:Dynamic = list[i];
						if (o != null)
							achievements.push(new Achievement(textOf(o.id), flagOf(o.unlock)));
					}
				onAchievements(achievements);
			};
		Natives.query_achievements(cb);
	}

	/**
		Asks which of the given catalogue item ids the player owns. `onOwned`
		receives the owned ids (empty when none), or null when the query
		failed. Null ids in `itemIds` are left out.
	**/
	public static function queryOwnership(itemIds:Array<String>, onOwned:(owned:Null<Array<String>>) -> Void):Void {
		var ids = itemIds == null ? [] : [for (id in itemIds) if (id != null) id];
		var native = new NativeArray<Bytes>(ids.length);
		for (i in 0...ids.length)
			native[i] = toUtf8(ids[i]);
		var cb:NativeArray<Bytes> -> Void = null;
		if (onOwned != null)
			cb = function(owned:NativeArray<Bytes>) {
				if (owned == null) {
					onOwned(null);
					return;
				}
				var result = [];
				for (i in 0...owned.length) {
					var id = fromUtf8(owned[i]);
					if (id != null)
						result.push(id);
				}
				onOwned(result);
			};
		Natives.query_ownership(native, cb);
	}

	/** Opens the store checkout for an offer. Nothing is reported back. **/
	public static function checkout(offerId:String):Void {
		Natives.store_checkout(toUtf8(offerId));
	}

	/** A NUL-terminated UTF-8 copy of `s`, or null for null. **/
	static function toUtf8(s:Null<String>):Bytes {
		return s == null ? null : @:privateAccess s.toUtf8();
	}

	/** The string held by NUL-terminated UTF-8 bytes, or null for null. **/
	static function fromUtf8(b:Bytes):Null<String> {
		return b == null ? null : @:privateAccess String.fromUTF8(b);
	}

	// Record fields arrive untyped: an absent field reads as null.
	static function textOf(v:Dynamic):Null<String> {
		if (v == null)
			return null;
		var b:Bytes = v;
		return fromUtf8(b);
	}

	static function flagOf(v:Dynamic):Null<Bool> {
		return v == null ? null : (v : Bool);
	}

	static function pairHandler(handler:(String, Null<String>) -> Void):(Bytes, Bytes) -> Void {
		return function(a:Bytes, b:Bytes) handler(fromUtf8(a), fromUtf8(b));
	}

	static function resultHandler(handler:Result -> Void):Int -> Void {
		return function(code:Int) handler(code);
	}
}
